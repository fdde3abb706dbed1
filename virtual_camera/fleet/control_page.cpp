// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/fleet/control_page.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kPage = R"html(<!doctype html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width">
<title>Virtual cameras</title>
<link rel="stylesheet" href="control.css">
<script src="control.js" defer></script>
<h1>Virtual cameras</h1>
<p id="state" role="status">Reading the cameras</p>
<form id="faults">
  <label>Packets lost <input name="loss" type="number" min="0" max="1" step="0.001" value="0"></label>
  <label>reordered <input name="reorder" type="number" min="0" max="1" step="0.001" value="0"></label>
  <label>delayed <input name="delay" type="number" min="0" max="1" step="0.001" value="0"></label>
  <label>Request fault <select name="fault">
    <option value="">none</option><option>no-answer</option><option>slow-answer</option><option>reset</option>
    <option>status</option><option>cut-answer</option><option>stall-answer</option><option>wrong-credentials</option>
  </select></label>
  <label>of requests with <input name="match" value="PLAY"></label>
  <label>value <input name="value"></label>
</form>
<table>
  <thead><tr><th>Camera<th>Model<th>Address<th>Network<th>Viewers<th>Faults<th>What happens</tr></thead>
  <tbody id="cameras"></tbody>
</table>
</html>
)html";

constexpr std::string_view kStyle = R"css(:root { color-scheme: light dark; font: 15px/1.4 system-ui, sans-serif; }
body { margin: 1rem; }
table { border-collapse: collapse; }
th, td { text-align: left; padding: .3rem .6rem; border-bottom: 1px solid #8886; vertical-align: top; }
form { display: flex; flex-wrap: wrap; gap: .3rem 1rem; margin-bottom: 1rem; }
input[type=number] { width: 5rem; }
button { margin: 0 .2rem .2rem 0; }
)css";

constexpr std::string_view kScript = R"js('use strict';
const actions = [
  ['Intruder', 'walk'], ['Cover lens', 'lens/cover'], ['Free lens', 'lens/free'], ['Contact closed', 'contact/1/close'],
  ['Contact open', 'contact/1/open'], ['Loud', 'noise/on'], ['Quiet', 'noise/off'], ['Unplug', 'network/unplug'],
  ['Plug', 'network/plug'], ['Reboot', 'reboot'], ['Set faults', setFaults], ['Clear faults', 'faults/clear']];
const rows = new Map();
const report = text => { document.getElementById('state').textContent = text; };

async function ask(path) {
  const answer = await fetch(path, {method: 'POST'});
  if (!answer.ok) throw new Error(`${path}: ${answer.status} ${answer.statusText}`);
}

async function setFaults(camera) {
  const form = new FormData(document.getElementById('faults'));
  const packets = new URLSearchParams();
  for (const name of ['loss', 'reorder', 'delay']) if (Number(form.get(name)) > 0) packets.set(name, form.get(name));
  await ask(`${camera}faults/packets?${packets}`);
  if (!form.get('fault')) return;
  const value = ['match', 'value'].map(name => `${name}=${encodeURIComponent(form.get(name))}`).join('&');
  await ask(`${camera}faults/request/${form.get('fault')}?${value}`);
}

async function act(name, action) {
  const camera = `camera/${encodeURIComponent(name)}/`;
  try {
    await (typeof action === 'function' ? action(camera) : ask(camera + action));
    await refresh();
  } catch (error) {
    report(error.message);
  }
}

function rowOf(name) {
  if (rows.has(name)) return rows.get(name);
  const row = document.getElementById('cameras').insertRow();
  const cells = Array.from({length: 7}, () => row.insertCell());
  for (const [label, action] of actions) {
    const button = document.createElement('button');
    button.textContent = label;
    button.setAttribute('aria-label', `${label}: ${name}`);
    button.addEventListener('click', () => act(name, action));
    cells[6].append(button);
  }
  rows.set(name, cells);
  return cells;
}

async function refresh() {
  const answer = await fetch('cameras');
  const cameras = (await answer.json()).cameras;
  for (const camera of cameras) {
    const faults = Object.entries(camera.packetFaults).map(([fault, value]) => `${fault} ${value}`);
    if (camera.requestFaults > 0) faults.push(`${camera.requestFaults} of requests`);
    const texts = [camera.name, camera.model, `${camera.address}:${camera.httpPort}`, camera.network,
                   `${camera.viewers} of ${camera.maxViewers}`, faults.join(', ')];
    const cells = rowOf(camera.name);
    texts.forEach((text, i) => { cells[i].textContent = text; });
  }
  report(`${cameras.length} cameras`);
}

rowOf('all')[0].textContent = 'all';
setInterval(() => refresh().catch(error => report(`The fleet does not answer: ${error.message}`)), 1000);
refresh().catch(error => report(error.message));
)js";

constexpr ControlFile kFiles[] = {
    {"/", "text/html", kPage}, {"/control.css", "text/css", kStyle}, {"/control.js", "text/javascript", kScript}};

}  // namespace

const ControlFile* find_control_file(std::string_view path, std::string_view accept) {
  for (const ControlFile& file : kFiles) {
    const bool for_browsers = file.path == "/" && accept.find("text/html") == std::string_view::npos;
    if (file.path == path && !for_browsers) return &file;
  }
  return nullptr;
}

}  // namespace vexa::camera
