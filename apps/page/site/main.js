// The page: joins the engine, the hand, the tools, storage and files.

import {openEngine} from '#page/engine.js';
import {droppedFiles, openFile, pastedFiles, copyPng, saveInkml, savePng} from '#page/files.js';
import {Input} from '#page/input.js';
import {Meter} from '#page/meter.js';
import {Replay} from '#page/replay.js';
import {loadSettings, saveSettings} from '#page/settings.js';
import {openStore} from '#page/store.js';
import {say, sayFatal, Tools} from '#page/ui.js';
import {View} from '#page/view.js';

const SLICE = 5;         // ms of redrawing at a time: the hand comes first
const REST = 120;        // ms without a move of the page before it is drawn sharp
const METER_PACE = 250;  // ms

const $ = (id) => document.getElementById(id);
const canvas = $('paper');

let engine, view, input, tools, store, replay = null;
const settings = loadSettings();
const meter = new Meter();
const keys = new Map();  // of stored strokes: id on this page -> key in storage
const ids = new Map();   // and back

/** Makes the call; what goes wrong is told, and the page goes on. */
function guard(call) {
  try {
    return call();
  } catch (error) {
    console.warn(error);
    say(error.message);
    return undefined;
  }
}
const guarded = (call) => (...values) => guard(() => {
  const result = call(...values);
  return result instanceof Promise ? result.catch((error) => guard(() => { throw error; })) : result;
});

// Showing: once a frame, and only when something changed; in between, slices of redrawing.

let frame = 0, restsAt = 0, worker = 0;
function show() {
  frame ||= requestAnimationFrame(() => {
    frame = 0;
    guard(() => {
      if (replay && !replay.step(performance.now())) endReplay();
      if (replay) show();
      engine.present();
    });
    redraw();
  });
}
function redraw() {
  if (worker || !engine.busy) return;
  worker = setTimeout(() => {
    worker = 0;
    if (performance.now() < restsAt || input.isBusy) return redraw();
    if (guard(() => engine.work(SLICE)) === false) show();
    redraw();
  }, Math.max(restsAt - performance.now(), 0));
}
function moved() {
  restsAt = performance.now() + REST;
  tools?.showZoom(view.zoom);
  show();
}

// The hand.

const OPAQUE = 0xff;
function style(tool) {
  const {look, size, color, opacity, smooth, outline} = settings;
  return {
    look, size, smooth, tool, color: ((Math.round(opacity * OPAQUE) << 24) | color) >>> 0,
    outline: outline.on ? {size: outline.size, color: (0xff000000 | outline.color) >>> 0} : null,
  };
}

const hand = {
  style,
  get tool() { return settings.tool; },
  get fingerDraws() { return settings.finger; },
  penSeen() {
    if (settings.penSeen) return;
    Object.assign(settings, {penSeen: true, finger: false});
    saveSettings(settings);
    tools.show();
  },
  guard,
  quiet() {
    endReplay();
    tools.close();
  },
  drawn(event) {
    if (!event) return show();
    // At once: the next frame may be 16 ms away.
    engine.present();
    meter.note(event, hand.began);
  },
  stored(id) {
    keep(id);
    showHistory();
  },
  erased(change) { changed(change); },
  moved: show,
  began: 0,
};
canvas.addEventListener('pointerdown', () => { hand.began = performance.now(); }, {capture: true});
canvas.addEventListener('pointermove', () => { hand.began = performance.now(); }, {capture: true});

// What is stored.

function keep(id) {
  // Marked before it is there, so that an undo at once finds it.
  const key = store.add(engine.record(id));
  keys.set(id, key);
  key.then((known) => ids.set(known, id));
}
async function changed(change) {
  if (!change) return;
  show();
  showHistory();
  for (const id of change.shown) if (!keys.has(id)) keep(id);
  const keysOf = (list) => Promise.all(list.map((id) => keys.get(id)).filter(Boolean));
  store.setShown({shown: await keysOf(change.shown), hidden: await keysOf(change.hidden)});
}
function showHistory() { tools.showHistory(engine.canUndo, engine.canRedo); }

function take(records) {
  let bad = 0;
  for (const {key, bytes} of records) {
    try {
      const id = engine.addRecord(bytes);
      keys.set(id, Promise.resolve(key));
      ids.set(key, id);
    } catch (error) {
      console.warn(error);
      ++bad;
    }
  }
  if (bad > 0) say(`${bad === 1 ? 'One stroke' : `${bad} strokes`} could not be read from this browser's storage.`);
  show();
}
function onChange({added = [], shown = [], hidden = []}) {
  take(added);
  const known = (list) => list.map((key) => ids.get(key)).filter((id) => id !== undefined);
  engine.setShown(known(shown), known(hidden));
  show();
}

// Commands.

function endReplay() {
  if (!replay) return;
  const ending = replay;
  replay = null;
  ending.end();
  show();
}

const actions = {
  undo: () => changed(engine.undo()),
  redo: () => changed(engine.redo()),
  clear: () => changed(engine.clear()),
  natural: () => { view.natural(canvas.width, canvas.height); moved(); },
  fit: () => { view.fit(canvas.width, canvas.height); moved(); },
  zoomIn: () => { view.zoomAt(1.25, canvas.width / 2, canvas.height / 2); moved(); },
  zoomOut: () => { view.zoomAt(0.8, canvas.width / 2, canvas.height / 2); moved(); },
  move: (x, y) => { view.move(x * 60 * view.scale, y * 60 * view.scale); moved(); },
  open: () => $('file').click(),
  savePicture: () => savePng(engine),
  saveInk: () => saveInkml(engine),
  copy: async () => {
    await copyPng(engine);
    say('The picture is copied.');
  },
  replay: () => {
    if (replay) return endReplay();
    const strokes = engine.strokes().map((id) => ({style: engine.style(id), samples: engine.samples(id)}));
    if (strokes.length === 0) return say('There is nothing to replay yet.');
    strokes.sort((a, b) => a.samples[5] - b.samples[5]);
    replay = new Replay(engine, strokes);
    show();
    return undefined;
  },
  stop: endReplay,
  meter: () => {
    $('meter').hidden = !$('meter').hidden;
    showMeter();
  },
  help: () => $('help').showModal(),
};
for (const [name, call] of Object.entries(actions)) {
  actions[name] = guarded((...values) => {
    if (input.isBusy) return undefined;  // a stroke under way goes first
    if (name !== 'replay') endReplay();
    return call(...values);
  });
}
function showMeter() {
  if ($('meter').hidden) return;
  $('meter').textContent = meter.text(engine.stats(), engine.renderer);
  setTimeout(showMeter, METER_PACE);
}

async function openFiles(files) {
  for (const file of files) {
    try {
      await changed(await openFile(engine, file));
      actions.fit();
    } catch (error) {
      say(error.message);
    }
  }
}

function listen() {
  $('file').onchange = guarded(async () => {
    await openFiles([...$('file').files]);
    $('file').value = '';  // so that the same file can be opened again
  });
  addEventListener('dragover', (event) => {
    event.preventDefault();
    document.body.classList.add('dropping');
  });
  addEventListener('dragleave', (event) => {
    if (!event.relatedTarget) document.body.classList.remove('dropping');
  });
  addEventListener('drop', guarded((event) => {
    event.preventDefault();
    document.body.classList.remove('dropping');
    return openFiles(droppedFiles(event.dataTransfer));
  }));
  addEventListener('paste', guarded((event) => openFiles(pastedFiles(event.clipboardData))));
  addEventListener('keydown', (event) => {
    if (event.key !== ' ' || event.target.matches?.('button, input')) return;
    event.preventDefault();
    input.space = true;
  });
  addEventListener('keyup', (event) => { if (event.key === ' ') input.space = false; });
  canvas.addEventListener('webglcontextlost', guarded((event) => {
    event.preventDefault();  // or it never comes back
    endReplay();
    input.abandon();
    engine.contextLost();
  }));
  canvas.addEventListener('webglcontextrestored', guarded(() => {
    engine.contextRestored();
    show();
  }));
  document.addEventListener('visibilitychange', guarded(() => input.abandon()));
  new ResizeObserver(guarded(([entry]) => resize(entry))).observe(canvas);
}

function resize(entry) {
  const scale = devicePixelRatio || 1;
  const exact = entry?.devicePixelContentBoxSize?.[0];
  const width = exact ? exact.inlineSize : Math.round(canvas.clientWidth * scale);
  const height = exact ? exact.blockSize : Math.round(canvas.clientHeight * scale);
  if (width < 1 || height < 1) return;
  if (width === canvas.width && height === canvas.height && scale === view.scale) return;
  input?.abandon();
  view.resize(width, height, scale);
  engine.present();  // a canvas that was resized is blank
  moved();
}

async function start() {
  const scale = devicePixelRatio || 1;
  canvas.width = Math.max(Math.round(canvas.clientWidth * scale), 1);
  canvas.height = Math.max(Math.round(canvas.clientHeight * scale), 1);
  engine = await openEngine(canvas);
  view = new View(engine, moved);
  input = new Input(canvas, engine, view, hand);
  const limits = new Map();
  tools = new Tools({
    settings,
    limits: (look) => {
      if (!limits.has(look)) limits.set(look, engine.limits(look));
      return limits.get(look);
    },
    preview: guarded((sample) => {
      const pixels = view.scale;
      sample.width = Math.round(sample.clientWidth * pixels);
      sample.height = Math.round(sample.clientHeight * pixels);
      const {width, height, data} = engine.preview(sample.width, sample.height, style('pen'));
      sample.getContext('2d').putImageData(new ImageData(data, width, height), 0, 0);
    }),
    actions,
    changed: () => saveSettings(settings),
  });
  view.resize(canvas.width, canvas.height, scale);
  engine.present();
  store = await openStore({onChange: (change) => guard(() => onChange(change)), onProblem: say});
  take(await store.load());
  showHistory();
  listen();
  // For tests, and for the curious.
  window.qelt = {engine, view, meter, settings, store};
}

start().catch((error) => {
  console.error(error);
  sayFatal(error.message);
});
