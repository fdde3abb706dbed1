// SPDX-License-Identifier: Apache-2.0
#include "host/serve/pages.h"

namespace vexa::host {
namespace {

constexpr PageFile kSignIn{"/", "text/html", R"html(<!doctype html>
<html lang="en">
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<link rel="icon" href="data:,">
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
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>Cameras</title>
<link rel="icon" href="data:,">
<link rel="stylesheet" href="wall.css">
<script src="player.js" defer></script>
<script src="wall.js" defer></script>
<header><h1>Cameras</h1><p id="state" role="status">Connecting</p></header>
<main id="wall" aria-label="Cameras"></main>
<dialog id="large" aria-labelledby="large-name">
  <form method="dialog"><h2 id="large-name"></h2><button id="close" autofocus>Close</button></form>
  <div id="screen"><img id="large-picture" alt=""><video id="large-video" muted autoplay playsinline hidden></video></div>
  <p id="large-facts"></p><p id="video-state" role="status"></p>
</dialog>
</html>
)html";

constexpr std::string_view kStyle = R"css(:root { color-scheme: light dark; font: 15px/1.4 system-ui, sans-serif;
  --ground: #f3f4f6; --card: #fff; --line: #c8ccd2; --quiet: #4b5563; --good: #14713c; --bad: #a61b1b; --focus: #1d4ed8; }
@media (prefers-color-scheme: dark) {
  :root { --ground: #0f1216; --card: #1a1f26; --line: #39414c; --quiet: #b4bcc8; --good: #5fd38d; --bad: #ff9c94; --focus: #8ab4ff; }
}
* { box-sizing: border-box; }
body { margin: 0; padding: .75rem; background: var(--ground); }
header { display: flex; flex-wrap: wrap; gap: 0 1rem; align-items: baseline; margin-bottom: .6rem; }
h1, h2 { font-size: 1.25rem; margin: 0; overflow-wrap: anywhere; }
header p, #large p { margin: 0; color: var(--quiet); }
main { display: grid; gap: .6rem; align-items: start; grid-template-columns: repeat(auto-fill, minmax(min(18rem, 100%), 1fr)); }
.tile { display: flex; flex-direction: column; border: 1px solid var(--line); border-radius: .4rem; padding: 0 0 .4rem;
        background: var(--card); color: inherit; font: inherit; text-align: left; cursor: pointer; overflow: hidden; }
.tile:hover { border-color: var(--focus); }
:focus-visible { outline: 3px solid var(--focus); outline-offset: 2px; }
.frame { flex: none; position: relative; width: 100%; aspect-ratio: 16 / 9; background: #000; }
.frame img { width: 100%; height: 100%; object-fit: contain; }
.frame img:not([src]) { visibility: hidden; }
.tile.stale img, .stale #large-picture { filter: grayscale(1); opacity: .35; }
.badge { position: absolute; left: .4rem; top: .4rem; padding: 0 .5rem; border-radius: 1rem; background: #000c; color: #fff;
         font-size: .8rem; }
.badge::before { content: "\25CF"; margin-right: .3rem; color: #ff9c94; }
.live .badge::before { color: #5fd38d; }
.tile > span:not(.frame) { display: block; padding: .1rem .6rem 0; overflow-wrap: anywhere; }
.tile > .facts { font-size: .87rem; color: var(--quiet); font-variant-numeric: tabular-nums; }
.tile > .why { font-size: .87rem; color: var(--bad); }
.name { font-weight: 600; }
dialog { width: min(96vw, 80rem); max-height: 96vh; padding: .75rem; border: 1px solid var(--line); border-radius: .5rem;
         background: var(--card); color: inherit; }
dialog::backdrop { background: #000a; }
dialog form { display: flex; justify-content: space-between; gap: 1rem; margin-bottom: .5rem; }
dialog button { font: inherit; padding: .2rem .8rem; }
#screen { background: #000; }
#screen > * { display: block; width: 100%; max-height: 78vh; object-fit: contain; }
#screen > [hidden] { display: none; }
)css";

constexpr std::string_view kPlayer = R"js('use strict';
// Plays fragments of MP4 that never end. Rebuilt by its owner after an error: nothing of a player is used again.
class Player {
  #source = new MediaSource();
  #buffer = null;
  #queue = [];  // {codec, bytes}: codec with an initialisation segment
  #bytes = 0;
  #video;
  #failed;
  #ended = false;
  #seeked = 0;
  static mostQueued = 16 << 20;

  constructor(video, failed) {
    this.#video = video;
    this.#failed = failed;
    this.url = URL.createObjectURL(this.#source);
    video.src = this.url;
    video.onerror = () => this.#fail(video.error?.message || 'the browser cannot decode it');
    this.#source.addEventListener('sourceopen', () => {
      this.#next();
    }, {once: true});
  }

  take(bytes, codec) {
    if (this.#ended) return;
    if (codec && !MediaSource.isTypeSupported(`video/mp4; codecs="${codec}"`)) return this.#fail(`this browser does not play ${codec}`);
    this.#queue.push({bytes, codec});
    this.#bytes += bytes.byteLength;
    if (this.#bytes > Player.mostQueued) return this.#fail('the browser is too slow');
    this.#next();
  }

  close() {
    if (this.#ended) return;
    this.#ended = true;
    this.#queue = [];
    this.#video.onerror = null;
    this.#video.removeAttribute('src');
    this.#video.load();
    URL.revokeObjectURL(this.url);
  }

  #fail(text) {
    if (this.#ended) return;
    this.close();
    this.#failed(text);
  }

  #next() {
    if (this.#ended || this.#source.readyState !== 'open' || this.#buffer?.updating) return;
    try {
      if (this.#trim()) return;
      const piece = this.#queue.shift();
      if (!piece) return;
      this.#bytes -= piece.bytes.byteLength;
      if (piece.codec) this.#open(`video/mp4; codecs="${piece.codec}"`);
      this.#buffer?.appendBuffer(piece.bytes);
    } catch (error) {
      this.#fail(error.message);
    }
  }

  #open(type) {
    if (this.#buffer) return this.#buffer.changeType(type);
    this.#source.duration = Infinity;
    this.#buffer = this.#source.addSourceBuffer(type);
    this.#buffer.addEventListener('updateend', () => { this.#follow(); this.#next(); });
    this.#buffer.addEventListener('error', () => this.#fail('the browser cannot read the stream'));
  }

  // What is older than ten seconds is given back, in steps of twenty.
  #trim() {
    const ranges = this.#buffer?.buffered;
    if (!ranges?.length) return false;
    const start = ranges.start(0);
    const end = Math.min(ranges.end(ranges.length - 1), this.#video.currentTime) - 10;
    if (end - start < 20) return false;
    this.#buffer.remove(start, end);
    return true;
  }

  // Keeps near the latest picture: a little faster first, then with a step, at most every five seconds.
  #follow() {
    const ranges = this.#video.buffered;
    if (!ranges.length) return;
    const end = ranges.end(ranges.length - 1);
    const behind = end - this.#video.currentTime;
    const now = performance.now();
    const outside = this.#video.currentTime < ranges.start(0);
    if (outside || (behind > 3 && now - this.#seeked > 5000)) {
      this.#seeked = now;
      this.#video.currentTime = Math.max(end - 0.3, ranges.start(ranges.length - 1));
    }
    this.#video.playbackRate = behind > 0.8 && behind <= 3 ? 1.1 : 1;
    if (this.#video.paused) this.#video.play().catch(() => {});
  }
}
)js";

constexpr std::string_view kScript = R"js('use strict';
// Binary messages: camera and age of its picture in milliseconds, four bytes each, then a picture in JPEG; with the
// highest bit of the camera set, a piece of its video.
const ofVideo = 0x80000000;
const tiles = [];
const seen = new Set();
let socket = null;
let large = -1;
let player = null;
let codec = '';      // of the initialisation segment that comes next
let failures = 0;    // of the video that is shown
let patience = 500;
const byId = id => document.getElementById(id);
const observer = new IntersectionObserver(entries => {
  for (const entry of entries) {
    const index = Number(entry.target.dataset.index);
    if (entry.isIntersecting) seen.add(index); else seen.delete(index);
  }
  watch();
}, {rootMargin: '100px'});

function send(message) {
  if (socket?.readyState === WebSocket.OPEN) socket.send(JSON.stringify(message));
}

function watch() {
  const hidden = document.visibilityState === 'hidden';
  send({watch: hidden ? [] : [...new Set(large < 0 ? seen : [...seen, large])]});
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
  box.type = 'button';
  box.dataset.index = index;
  const frame = element(box, 'span', 'frame');
  const tile = {box, image: element(frame, 'img', ''), badge: element(frame, 'span', 'badge'), name: element(box, 'span', 'name'),
                facts: element(box, 'span', 'facts'), why: element(box, 'span', 'why'), url: ''};
  tile.image.alt = '';
  box.addEventListener('click', () => open(index));
  tiles[index] = tile;
  observer.observe(box);
  return tile;
}

function open(index) {
  large = index;
  failures = 0;
  byId('large').showModal();
  byId('large-picture').removeAttribute('src');
  show(index);
  watch();
  play();
}

// Asks for the video of the enlarged camera, from its next key picture on.
function play() {
  stopPlaying();
  if (large < 0 || document.visibilityState === 'hidden') return;
  byId('video-state').textContent = 'MediaSource' in window ? 'Video begins with the next key picture' : 'This browser plays no live video';
  if ('MediaSource' in window) send({video: large});
}

function stopPlaying() {
  player?.close();
  player = null;
  codec = '';
  byId('large-video').hidden = true;
  byId('large-picture').hidden = false;
}

function failed(text) {
  ++failures;
  stopPlaying();
  send({video: null});
  byId('video-state').textContent = `Video stopped (${failures}): ${text}`;
  const index = large;
  setTimeout(() => { if (large === index && large >= 0) play(); }, Math.min(1000 * 2 ** failures, 30000));
}

function takeVideo(message) {
  const view = new DataView(message);
  if ((view.getUint32(0) & ~ofVideo) !== large) return;
  if (!player) {
    if (!codec) return;
    player = new Player(byId('large-video'), failed);
    byId('large-video').onplaying = () => {
      byId('large-video').hidden = false;
      byId('large-picture').hidden = true;
      byId('video-state').textContent = 'Live video';
    };
  }
  player.take(new Uint8Array(message, 8), codec);
  codec = '';
}

const age = milliseconds => milliseconds === null ? 'no picture yet' : `${(milliseconds / 1000).toFixed(1)} s old`;
const counted = (count, word) => `${count} ${word}${count === 1 ? '' : 's'}`;

function takeStates(cameras) {
  cameras.forEach((camera, index) => {
    const tile = tileOf(index);
    tile.camera = camera;
    tile.received = performance.now();
    tile.name.textContent = camera.name;
    show(index);
  });
  const live = cameras.filter(camera => camera.state === 'live').length;
  const text = `${live} of ${counted(cameras.length, 'camera')} live`;
  if (byId('state').textContent !== text) byId('state').textContent = text;
}

function show(index) {
  const tile = tiles[index];
  const camera = tile?.camera;
  if (!camera) return;
  const waited = performance.now() - tile.received;
  const old = camera.ageMilliseconds === null ? null : camera.ageMilliseconds + waited;
  const stale = camera.stale || socket?.readyState !== WebSocket.OPEN || waited > 3000;
  const facts = [`${camera.picturesPerSecond}/s`, age(old), counted(camera.interruptions, 'interruption')];
  if (!camera.hasPicture && camera.pictures > 0) facts.push('no JPEG stream: enlarge for video');
  const state = stale && camera.state === 'live' ? 'not current' : camera.state;
  tile.box.classList.toggle('stale', stale);
  tile.box.classList.toggle('live', !stale && camera.state === 'live');
  tile.badge.textContent = state;
  tile.facts.textContent = facts.join(', ');
  tile.why.textContent = camera.state === 'live' ? '' : camera.why;
  tile.box.setAttribute('aria-label', `${camera.name}, ${state}. Enlarge`);
  if (index !== large) return;
  byId('large').classList.toggle('stale', stale);
  byId('large-name').textContent = camera.name;
  byId('large-facts').textContent = `${state}, ${facts.join(', ')} ${tile.why.textContent}`;
  byId('large-picture').alt = `Picture of ${camera.name}`;
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

function take(data) {
  if (typeof data !== 'string') {
    const isVideo = new DataView(data).getUint32(0) >= ofVideo;
    return isVideo ? takeVideo(data) : takePicture(data);
  }
  const message = JSON.parse(data);
  if (message.cameras) takeStates(message.cameras);
  if (message.video?.camera === large) codec = message.video.codec;
}

function connect() {
  const address = new URL('ws', location.href);
  address.protocol = location.protocol === 'https:' ? 'wss:' : 'ws:';
  address.search = '';
  address.hash = '';
  socket = new WebSocket(address);
  socket.binaryType = 'arraybuffer';
  socket.onopen = () => { patience = 500; watch(); play(); };
  socket.onmessage = event => take(event.data);
  socket.onclose = () => {
    byId('state').textContent = 'The server does not answer; trying again';
    stopPlaying();
    tiles.forEach((_, index) => show(index));
    setTimeout(connect, patience);
    patience = Math.min(patience * 2, 10000);
  };
}

byId('large').addEventListener('close', () => {
  const index = large;
  large = -1;
  stopPlaying();
  send({video: null});
  tiles[index]?.box.focus();
  watch();
});
document.addEventListener('visibilitychange', () => { watch(); if (large >= 0) play(); });
setInterval(() => tiles.forEach((_, index) => show(index)), 500);
// A browser that has the cookie already keeps the token out of its history too.
if (location.hash) history.replaceState(null, '', location.pathname);
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
    "/cameras/{name}/video.mp4": {"get": {"summary": "Its H.264 as fragmented MP4, from the next key picture on",
      "parameters": [{"name": "name", "in": "path", "required": true, "schema": {"type": "string"}}],
      "responses": {"200": {"description": "MP4 without an end", "content": {"video/mp4": {}}},
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
                               {"/player.js", "text/javascript", kPlayer},
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
