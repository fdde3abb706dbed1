// SPDX-License-Identifier: Apache-2.0
#include "host/serve/pages.h"

namespace vexa::host {
namespace {

constexpr PageFile kSignIn{"/", "text/html", R"html(<!doctype html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width">
<title>Cameras</title>
<script src="sign-in.js" defer></script>
<h1>Cameras</h1>
<p id="state" role="status">This page is opened by the address that vexactl serve prints, with its token.</p>
</html>
)html"};

constexpr std::string_view kSignInScript = R"js('use strict';
const token = new URLSearchParams(location.hash.slice(1)).get('token');
if (token) {
  history.replaceState(null, '', location.pathname);
  const headers = {'X-Vexa-Token': token, 'Content-Type': 'application/json'};
  fetch('session', {method: 'POST', headers, body: '{}'}).then(answer => {
    if (answer.ok) location.reload();
    else document.getElementById('state').textContent = 'The token of this address is not the one that vexactl printed.';
  }).catch(error => { document.getElementById('state').textContent = `The server does not answer: ${error.message}`; });
}
)js";

constexpr std::string_view kWall = R"html(<!doctype html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width">
<title>Cameras</title>
<link rel="stylesheet" href="wall.css">
<script src="wall.js" defer></script>
<header><h1>Cameras</h1><p id="state" role="status">Connecting</p></header>
<main id="wall" aria-label="Cameras"></main>
<dialog id="large" aria-labelledby="large-name">
  <form method="dialog"><h2 id="large-name"></h2><button autofocus>Close</button></form>
  <img id="large-picture" alt=""><p id="large-facts"></p>
</dialog>
</html>
)html";

constexpr std::string_view kStyle = R"css(:root { color-scheme: light dark; font: 15px/1.4 system-ui, sans-serif; }
body { margin: .5rem; }
header { display: flex; gap: 1rem; align-items: baseline; }
h1, h2 { font-size: 1.2rem; margin: 0; }
main { display: grid; gap: .5rem; grid-template-columns: repeat(auto-fill, minmax(15rem, 1fr)); }
.tile { border: 1px solid #8888; border-radius: .3rem; padding: 0; background: none; color: inherit; font: inherit;
        text-align: left; cursor: pointer; overflow: hidden; }
.tile:focus-visible { outline: 3px solid Highlight; }
.tile img { display: block; width: 100%; aspect-ratio: 16 / 9; object-fit: contain; background: #000; }
.tile.stale img, dialog.stale img { filter: grayscale(1) opacity(.4); }
.tile p { margin: .2rem .4rem; overflow-wrap: anywhere; }
.name { font-weight: 600; }
dialog { width: min(95vw, 70rem); }
dialog form { display: flex; justify-content: space-between; }
dialog img { width: 100%; max-height: 75vh; object-fit: contain; }
)css";

constexpr std::string_view kScript = R"js('use strict';
// Binary messages: camera and age of its picture in milliseconds, four bytes each, then the picture in JPEG.
const tiles = [];
const seen = new Set();
let socket = null;
let large = -1;
let patience = 500;
const byId = id => document.getElementById(id);
const observer = new IntersectionObserver(entries => {
  for (const entry of entries) {
    const index = Number(entry.target.dataset.index);
    if (entry.isIntersecting) seen.add(index); else seen.delete(index);
  }
  watch();
}, {rootMargin: '100px'});

function watch() {
  if (socket?.readyState === WebSocket.OPEN) {
    const hidden = document.visibilityState === 'hidden';
    socket.send(JSON.stringify({watch: hidden ? [] : [...new Set(large < 0 ? seen : [...seen, large])]}));
  }
}

function element(parent, name, className) {
  const made = document.createElement(name);
  made.className = className;
  parent.append(made);
  return made;
}

function tileOf(index) {
  if (tiles[index]) return tiles[index];
  const box = element(byId('wall'), 'button', 'tile stale');
  box.dataset.index = index;
  const tile = {box, image: element(box, 'img', ''), name: element(box, 'p', 'name'), facts: element(box, 'p', ''), url: ''};
  tile.image.alt = '';
  box.addEventListener('click', () => { large = index; byId('large').showModal(); show(index); watch(); });
  tiles[index] = tile;
  observer.observe(box);
  return tile;
}

const age = milliseconds => milliseconds === null ? 'no picture yet' : `${(milliseconds / 1000).toFixed(1)} s old`;

function takeStates(cameras) {
  cameras.forEach((camera, index) => {
    const tile = tileOf(index);
    tile.camera = camera;
    tile.received = performance.now();
    tile.name.textContent = camera.name;
    show(index);
  });
  const live = cameras.filter(camera => camera.state === 'live').length;
  byId('state').textContent = `${live} of ${cameras.length} cameras are live`;
}

function show(index) {
  const tile = tiles[index];
  const camera = tile?.camera;
  if (!camera) return;
  const waited = performance.now() - tile.received;
  const old = camera.ageMilliseconds === null ? null : camera.ageMilliseconds + waited;
  const stale = camera.stale || socket?.readyState !== WebSocket.OPEN || waited > 3000;
  const picture = camera.hasPicture ? '' : ', no JPEG stream';
  const facts = `${camera.state}, ${camera.picturesPerSecond}/s, ${age(old)}, ${camera.interruptions} interruptions${picture}`;
  tile.box.classList.toggle('stale', stale);
  tile.facts.textContent = camera.state === 'live' ? facts : `${facts}: ${camera.why}`;
  tile.box.setAttribute('aria-label', `${camera.name}: ${tile.facts.textContent}`);
  if (index !== large) return;
  byId('large').classList.toggle('stale', stale);
  byId('large-name').textContent = camera.name;
  byId('large-facts').textContent = tile.facts.textContent;
  byId('large-picture').alt = camera.name;
  if (tile.url) byId('large-picture').src = tile.url;
}

function takePicture(message) {
  const view = new DataView(message);
  const tile = tileOf(view.getUint32(0));
  const url = URL.createObjectURL(new Blob([new Uint8Array(message, 8)], {type: 'image/jpeg'}));
  const former = tile.url;
  tile.url = url;
  tile.image.src = url;
  if (Number(tile.box.dataset.index) === large) byId('large-picture').src = url;
  if (former) setTimeout(() => URL.revokeObjectURL(former), 1000);
}

function connect() {
  const address = new URL('ws', location.href);
  address.protocol = location.protocol === 'https:' ? 'wss:' : 'ws:';
  socket = new WebSocket(address);
  socket.binaryType = 'arraybuffer';
  socket.onopen = () => { patience = 500; watch(); };
  socket.onmessage = event => {
    if (typeof event.data === 'string') takeStates(JSON.parse(event.data).cameras); else takePicture(event.data);
  };
  socket.onclose = () => {
    byId('state').textContent = 'The server does not answer; trying again';
    tiles.forEach((_, index) => show(index));
    setTimeout(connect, patience);
    patience = Math.min(patience * 2, 10000);
  };
}

byId('large').addEventListener('close', () => { const index = large; large = -1; tiles[index]?.box.focus(); watch(); });
document.addEventListener('visibilitychange', watch);
setInterval(() => tiles.forEach((_, index) => show(index)), 500);
connect();
)js";

// An object for each path, for programs that generate clients.
constexpr std::string_view kOpenApi = R"json({
  "openapi": "3.0.3",
  "info": {"title": "vexactl serve", "version": "1", "description": "Cameras, their pictures and statistics"},
  "security": [{"token": []}],
  "paths": {
    "/api/cameras": {"get": {"summary": "All cameras", "responses": {"200": {"description": "Every camera's state",
      "content": {"application/json": {"schema": {"type": "object", "required": ["cameras"], "properties": {
        "cameras": {"type": "array", "items": {"$ref": "#/components/schemas/Camera"}}}}}}}}}},
    "/api/cameras/{name}": {"get": {"summary": "One camera",
      "parameters": [{"name": "name", "in": "path", "required": true, "schema": {"type": "string"}}],
      "responses": {"200": {"description": "Its state", "content": {"application/json": {
        "schema": {"$ref": "#/components/schemas/Camera"}}}}, "404": {"description": "There is no such camera"}}}},
    "/cameras/{name}/picture.jpg": {"get": {"summary": "Its latest picture",
      "parameters": [{"name": "name", "in": "path", "required": true, "schema": {"type": "string"}}],
      "responses": {"200": {"description": "JPEG", "content": {"image/jpeg": {}}},
        "404": {"description": "No such camera"}, "503": {"description": "No picture, or none that is live"}}}},
    "/cameras/{name}/stream.mjpg": {"get": {"summary": "Its pictures as they come, at most five a second",
      "parameters": [{"name": "name", "in": "path", "required": true, "schema": {"type": "string"}}],
      "responses": {"200": {"description": "JPEG pictures", "content": {"multipart/x-mixed-replace": {}}},
        "404": {"description": "No such camera"}, "503": {"description": "Too many viewers"}}}},
    "/metrics": {"get": {"summary": "Metrics for Prometheus", "responses": {"200": {"description": "Text format 0.0.4, or OpenMetrics by Accept"}}}},
    "/healthz": {"get": {"summary": "Whether the server answers", "responses": {"200": {"description": "It does"}}}},
    "/readyz": {"get": {"summary": "Whether every camera has been tried", "responses": {
      "200": {"description": "Each has"}, "503": {"description": "Not yet"}}}},
    "/openapi.json": {"get": {"summary": "This description", "responses": {"200": {"description": "OpenAPI"}}}}
  },
  "components": {
    "securitySchemes": {"token": {"type": "http", "scheme": "bearer"}},
    "schemas": {"Camera": {"type": "object",
      "required": ["name", "state", "why", "ageMilliseconds", "stale", "hasPicture", "picturesPerSecond", "pictures", "bytes",
                   "interruptions", "attempt"],
      "properties": {
        "name": {"type": "string"},
        "state": {"type": "string", "enum": ["idle", "connecting", "live", "stalled", "waiting", "refused", "stopped"]},
        "why": {"type": "string"},
        "ageMilliseconds": {"type": "integer", "nullable": true},
        "stale": {"type": "boolean"},
        "hasPicture": {"type": "boolean"},
        "picturesPerSecond": {"type": "number"},
        "pictures": {"type": "integer"},
        "bytes": {"type": "integer"},
        "interruptions": {"type": "integer"},
        "attempt": {"type": "integer"}}}}
  }
}
)json";

constexpr PageFile kFiles[] = {{"/", "text/html", kWall},
                               {"/wall.css", "text/css", kStyle},
                               {"/wall.js", "text/javascript", kScript},
                               {"/sign-in.js", "text/javascript", kSignInScript},
                               {"/openapi.json", "application/json", kOpenApi}};

}  // namespace

const PageFile* find_page_file(std::string_view path) {
  for (const PageFile& file : kFiles) {
    if (file.path == path) return &file;
  }
  return nullptr;
}

const PageFile& sign_in_page() { return kSignIn; }

}  // namespace vexa::host
