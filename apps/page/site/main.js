// Puts the page together: the engine that draws, input, storage, files and tools.

import {openEngine} from '#page/engine.js';
import {Files} from '#page/files.js';
import {Frames} from '#page/frames.js';
import {Input} from '#page/input.js';
import {Meter} from '#page/meter.js';
import {Replay} from '#page/replay.js';
import {Settings, rgbOf} from '#page/settings.js';
import {Store} from '#page/store.js';
import {Ui, sentence} from '#page/ui.js';
import {View} from '#page/view.js';

const ERASER_REACH = {pen: 6, mouse: 6, touch: 12};  // CSS pixels
const METER_PACE = 250;  // milliseconds

const canvas = /** @type {HTMLCanvasElement} */ (document.getElementById('paper'));

/** Instead of a page that cannot draw. */
function apologise(error) {
  const text = document.createElement('p');
  text.id = 'sorry';
  text.setAttribute('role', 'alert');
  text.textContent = sentence(error?.message ?? error);
  document.body.replaceChildren(text);
  document.body.classList.add('sorry');
}

async function start() {
  const settings = new Settings();
  const ratio = devicePixelRatio || 1;
  canvas.width = Math.max(1, Math.round(canvas.clientWidth * ratio));
  canvas.height = Math.max(1, Math.round(canvas.clientHeight * ratio));

  // What storage has to tell may come before there is anybody to tell it to.
  let ui = null;
  const early = [];
  const say = (text, isBad = false) => (ui ? ui.say(text, isBad) : early.push([text, isBad]));
  let engine = null;
  const store = new Store((id) => engine.record(id), say);
  const wanted = /^#page=(new|[1-9]\d{0,8})$/.exec(location.hash)?.[1] ?? null;
  const stored = store.open(wanted === null || wanted === 'new' ? wanted : Number(wanted));
  engine = await openEngine(canvas);

  /** Does something that may fail, at once or later; what is wrong is told, and the page goes on. */
  const failed = (error) => {
    if (!(error instanceof Error) || error instanceof TypeError || error instanceof ReferenceError) console.error(error);
    say(error?.message ?? error, true);
  };
  const guard = (task) => {
    try {
      const later = task();
      if (later instanceof Promise) later.catch(failed);
      return true;
    } catch (error) {
      failed(error);
      return false;
    }
  };
  window.addEventListener('unhandledrejection', (event) => failed(event.reason));

  const meter = new Meter();
  const frames = new Frames(engine, guard);
  frames.shown = () => meter.frame();
  const view = new View((shown) => {
    guard(() => engine.setView(shown));
    frames.workAtRest();
    ui?.showZoom(view.scale);
    keepView();
  });
  let viewTimer = 0;
  const keepView = () => {
    clearTimeout(viewTimer);
    viewTimer = setTimeout(() => {
      const {scale, x, y} = view;
      settings.set({views: {...settings.get('views'), [store.page]: {scale, x, y}}});
    }, 400);
  };

  /** After the page was changed by a step: shown, stored, and offered to be undone. */
  const changed = (change) => {
    if (!change) return;
    frames.ask();
    frames.work();
    // In a task of its own, so that the next event is drawn first.
    guard(() => store.apply(change));
    refreshSoon();
  };
  let refreshing = false;
  const refreshSoon = () => {
    if (refreshing) return;
    refreshing = true;
    requestAnimationFrame(() => {
      refreshing = false;
      guard(() => ui.showHint(!input.drawing && engine.stats().strokes === 0));
      ui.refresh();
    });
  };

  const input = new Input(canvas, {
    erasing: () => settings.get('eraser'),
    fingerDraws: () => settings.get('finger'),
    penSeen: () => {
      if (settings.get('penSeen')) return;
      settings.set({penSeen: true, finger: false});
      say('The pen draws; fingers now move the page.');
    },
    // A finger that taps beside an open panel wants to be rid of it, and leaves no dot.
    dismisses: (tool) => ui.close() && tool === 'touch',
    begin: (tool, sample) => {
      ui.showHint(false);
      engine.begin(settings.style(tool), sample);
      frames.now();
    },
    move: (rows, expected) => {
      engine.move(rows, expected);
      frames.ask();
    },
    end: (sample) => {
      const id = engine.end(sample);
      changed({shown: id > 0 ? [id] : [], hidden: []});
    },
    cancel: () => {
      engine.cancel();
      frames.ask();
      refreshSoon();
    },
    erase: (tool, from, to) => {
      if (engine.erase(from[0], from[1], to[0], to[1], ERASER_REACH[tool] / view.scale) > 0) {
        frames.ask();
        frames.work();
      }
    },
    eraseEnd: (keep) => {
      const change = engine.eraseEnd();
      if (keep) changed(change);
      else if (change) engine.undo();
      frames.ask();
      frames.work();
    },
    grip: (before, after) => view.grip(before, after),
    toUnits: (x, y) => view.toUnits(x, y),
    guard,
    measure: (time, handled) => meter.event(time, handled),
  });
  frames.drawing = () => input.drawing;

  const replay = new Replay(engine, frames, guard, () => refreshSoon());
  const files = new Files(engine, (change, name) => {
    const bounds = engine.bounds();
    if (bounds && !view.shows(bounds)) view.fit(bounds);
    changed(change);
    const count = change?.shown.length ?? 0;
    say(`${name}: ${count} ${count === 1 ? 'stroke' : 'strokes'} opened`);
  }, () => ({zoom: settings.get('pictureZoom'), transparent: settings.get('transparent'), paper: settings.get('paper')}));
  const chooser = /** @type {HTMLInputElement} */ (document.getElementById('file'));

  // The address says which page it is; another address is another page.
  const goTo = (page) => { location.hash = `page=${page}`; };
  window.addEventListener('hashchange', () => location.reload());
  let isLost = false;  // the context, for a moment; strokes are taken, but nothing else can be drawn
  const still = () => !input.drawing && !replay.running;
  const hasInk = () => still() && engine.stats().strokes > 0;
  const canDraw = () => !isLost && hasInk();
  const step = (dx, dy) => () => view.pan(dx * view.width / 8, dy * view.height / 8);
  ui = new Ui(settings, engine, {
    undo: {label: 'Undo', keys: ['Ctrl z', 'u'], can: () => still() && engine.canUndo, run: () => changed(engine.undo())},
    redo: {label: 'Redo', keys: ['Ctrl Shift z', 'Ctrl y'], can: () => still() && engine.canRedo, run: () => changed(engine.redo())},
    clear: {label: 'Clear the page', keys: ['Ctrl Backspace'], can: hasInk, run: () => changed(engine.clear())},
    open: {label: 'Open ink or a picture…', keys: ['Ctrl o'], can: still, run: () => chooser.click()},
    // The browser's own paste brings files; it needs no leave to read the clipboard.
    paste: {label: 'Paste', can: still, run: () => files.paste()},
    saveInk: {label: 'Save ink', keys: ['Ctrl s'], can: hasInk, run: () => files.saveInk()},
    savePicture: {label: 'Save picture', keys: ['Ctrl Shift s'], can: canDraw, run: () => files.savePicture()},
    copyPicture: {label: 'Copy picture', keys: ['Ctrl c'], can: canDraw,
                  run: () => files.copyPicture().then(() => say('The picture is on the clipboard.'))},
    newPage: {label: 'New page', can: still, run: () => goTo('new')},
    fit: {label: 'Show the whole page', keys: ['f'], run: () => view.fit(engine.bounds())},
    actualSize: {label: 'Actual size', keys: ['0'], run: () => view.zoom(1 / view.scale)},
    zoomIn: {label: 'Zoom in', keys: ['+', '='], run: () => view.zoom(Math.SQRT2)},
    zoomOut: {label: 'Zoom out', keys: ['-'], run: () => view.zoom(Math.SQRT1_2)},
    left: {label: 'Move the page', keys: ['ArrowLeft'], run: step(1, 0)},
    right: {label: 'Move the page', keys: ['ArrowRight'], run: step(-1, 0)},
    up: {label: 'Move the page', keys: ['ArrowUp'], run: step(0, 1)},
    down: {label: 'Move the page', keys: ['ArrowDown'], run: step(0, -1)},
    replay: {label: 'Replay', keys: ['r'], can: canDraw, run: () => replay.start()},
    thinner: {label: 'Thinner', keys: ['['], run: () => settings.set({size: settings.get('size') / 1.2})},
    thicker: {label: 'Thicker', keys: [']'], run: () => settings.set({size: settings.get('size') * 1.2})},
    ...Object.fromEntries([1, 2, 3, 4, 5, 6, 7, 8].map((look) => [`look${look}`, {
      label: `Look ${look}`, family: 'Look', keys: [String(look)], run: () => settings.set({look}),
    }])),
    measure: {label: 'Measurements', keys: ['t'], run: () => settings.set({measure: !settings.get('measure')})},
  }, guard, () => !isLost);
  for (const [text, isBad] of early) ui.say(text, isBad);
  // While the list of pages is open, it follows what other tabs do.
  let nextListing = 0;
  const listPages = () => guard(async () => {
    if (!ui.isOpen('files')) return;
    ui.showPages(await store.pages(), store.page, goTo);
    clearTimeout(nextListing);
    nextListing = setTimeout(listPages, 1000);
  });
  ui.opened = (id) => {
    if (id !== 'files') return;
    // Asked here rather than while somebody draws, since some browsers ask the person.
    navigator.storage?.persist?.().catch(() => {});
    listPages();
  };

  // The window.
  const paper = () => {
    engine.paper = rgbOf(settings.get('paper'));
    frames.ask();
  };
  settings.listen((some) => 'paper' in some && paper());
  const resize = (width, height) => guard(() => {
    engine.resize(width, height);
    view.resize(canvas.clientWidth, canvas.clientHeight, width / Math.max(1, canvas.clientWidth));
    frames.now();  // a canvas of a new size is blank until it is drawn on
  });
  const watch = new ResizeObserver(([entry]) => {
    const exact = entry.devicePixelContentBoxSize?.[0];
    const pixels = (css, box) => {
      const about = css * (devicePixelRatio || 1);
      // The exact size is how the browser rounded. Where a device is only emulated it is something else.
      return Math.max(1, Math.abs(box - about) < 1 ? box : Math.round(about));
    };
    resize(pixels(entry.contentRect.width, exact?.inlineSize), pixels(entry.contentRect.height, exact?.blockSize));
  });
  canvas.addEventListener('webglcontextlost', (event) => {
    event.preventDefault();  // so that it is given back
    isLost = true;
    guard(() => engine.contextLost());
  });
  canvas.addEventListener('webglcontextrestored', () => {
    isLost = !guard(() => engine.contextRestored());
    frames.ask();
    frames.work();
    ui.refresh();
  });

  // The page as it was left.
  let unread = 0;
  const rows = await stored;
  for (const {key, bytes} of rows) {
    try {
      store.know(engine.addRecord(bytes), key);
    } catch {
      ++unread;
    }
  }
  if (unread > 0) say(`${unread} of the page's ${rows.length} stored strokes could not be read; they stay where they are`, true);
  if (location.hash !== `#page=${store.page}`) history.replaceState(null, '', `#page=${store.page}`);
  const left = settings.get('views')[store.page];
  view.resize(canvas.clientWidth, canvas.clientHeight, canvas.width / Math.max(1, canvas.clientWidth));
  if (left && typeof left === 'object') view.set(left);
  try {
    watch.observe(canvas, {box: 'device-pixel-content-box'});
  } catch {
    watch.observe(canvas);
  }
  paper();
  frames.work();
  ui.showHint(engine.stats().strokes === 0);
  ui.refresh();
  document.getElementById('tools').inert = false;

  // What comes from the window rather than a pointer.
  canvas.addEventListener('wheel', (event) => {
    event.preventDefault();
    if (input.drawing || replay.running) return;
    const unit = [1, 16, view.height][event.deltaMode] ?? 1;
    const dx = event.deltaX * unit, dy = event.deltaY * unit;
    if (event.ctrlKey || event.metaKey) view.zoom(Math.exp(-Math.max(-120, Math.min(120, dy)) / 200), event.clientX, event.clientY);
    else if (event.shiftKey && dx === 0) view.pan(-dy, 0);
    else view.pan(-dx, -dy);
  }, {passive: false});
  const space = (isHeld) => (event) => {
    if (event.key !== ' ' || event.target.closest?.('button, input, select')) return;
    event.preventDefault();
    input.space = isHeld;
  };
  window.addEventListener('keydown', space(true));
  window.addEventListener('keyup', space(false));
  window.addEventListener('blur', () => { input.space = false; });
  window.addEventListener('keydown', (event) => { if (event.key === 'Escape') input.cancel(); }, {capture: true});

  chooser.addEventListener('change', () => {
    const chosen = [...chooser.files];
    chooser.value = '';
    guard(async () => { for (const file of chosen) await files.open(file); });
  });
  window.addEventListener('paste', (event) => {
    if (!still() || event.target.closest?.('input')) return;
    event.preventDefault();
    guard(() => files.take(event.clipboardData, true));
  });
  window.addEventListener('dragover', (event) => {
    event.preventDefault();
    document.body.classList.add('dropping');
  });
  window.addEventListener('dragleave', (event) => {
    if (!event.relatedTarget) document.body.classList.remove('dropping');
  });
  window.addEventListener('drop', (event) => {
    event.preventDefault();
    document.body.classList.remove('dropping');
    if (still()) guard(() => files.take(event.dataTransfer));
  });

  // A page that goes keeps the stroke under the pen.
  document.addEventListener('visibilitychange', () => { if (document.hidden) input.finish(); });
  window.addEventListener('pagehide', () => input.finish());
  window.addEventListener('beforeunload', (event) => { if (store.owes) event.preventDefault(); });
  setInterval(() => { if (settings.get('measure')) guard(() => ui.showMeter(meter.rows(engine.stats()))); }, METER_PACE);

  Object.assign(window, {qeltPage: {engine, store, view, settings}});  // for the console, and for tests
  document.documentElement.dataset.ready = '';  // strokes are taken from here on
}

start().catch(apologise);
