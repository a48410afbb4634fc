// Pointer events become strokes, erasing, and moves of the page. One pointer draws at a time; what the others do never
// reaches its stroke. Nothing here throws into the browser: `guard` catches and tells.

const TIME_TO_PINCH = 300;  // ms after a finger's first touch in which a second one means a pinch, not a palm
const MOST_PREDICTED = 4;
const LONGEST_PREDICTION = 40;  // ms; further ahead browsers extrapolate wildly
const ERASER_BUTTON = 32;
const USUAL_PRESSURE = 0.5;  // what platforms give where nothing is measured

/** The angle from upright, and the direction clockwise from up in which the pen leans. Radians. */
export function lean(event) {
  const {altitudeAngle, azimuthAngle, tiltX, tiltY} = event;
  if (tiltX || tiltY) {
    const x = Math.tan((tiltX || 0) * Math.PI / 180), y = Math.tan((tiltY || 0) * Math.PI / 180);
    return [Math.atan(Math.hypot(x, y)), Math.atan2(x, -y)];
  }
  if (!Number.isFinite(altitudeAngle) || altitudeAngle >= Math.PI / 2) return [0, 0];
  const turned = (azimuthAngle || 0) + Math.PI / 2;  // an azimuth counts from the right
  return [Math.PI / 2 - altitudeAngle, turned > Math.PI ? turned - 2 * Math.PI : turned];
}

/** Pressure from 0 to 1. A mouse, and a finger on a screen that does not measure, press as platforms say they do. */
export function pressure(event) {
  if (event.pointerType === 'mouse') return USUAL_PRESSURE;
  const given = event.pressure;
  return Number.isFinite(given) && given > 0 ? Math.min(given, 1) : USUAL_PRESSURE;
}

export class Input {
  #canvas;
  #engine;
  #view;
  #page;
  #drawing = null;   // {id, type, last, began, style}
  #erasing = null;   // {id, x, y}
  #holding = new Map();  // pointers that move the page: id -> [x, y] in device pixels
  #space = false;

  /**
   * `page` has: style(pointerType), tool ('pen' or 'eraser'), fingerDraws, penSeen(), guard(call), stored(id),
   * erased(change), drawn(event), moved(), quiet().
   */
  constructor(canvas, engine, view, page) {
    [this.#canvas, this.#engine, this.#view, this.#page] = [canvas, engine, view, page];
    const on = (name, handle, options) =>
      canvas.addEventListener(name, (event) => page.guard(() => handle.call(this, event)), options);
    on('pointerdown', this.#down);
    on('pointermove', this.#move);
    on('pointerup', this.#up);
    on('pointercancel', this.#cancel);
    on('lostpointercapture', this.#cancel);
    on('wheel', this.#wheel, {passive: false});
    for (const name of ['contextmenu', 'selectstart', 'dragstart']) canvas.addEventListener(name, (e) => e.preventDefault());
    // Safari zooms the page by gestures of its own unless its touches are taken.
    canvas.addEventListener('touchstart', (e) => e.preventDefault(), {passive: false});
    addEventListener('blur', () => page.guard(() => this.abandon()));
  }

  get isBusy() { return this.#drawing !== null || this.#erasing !== null; }

  /** The space bar is held: the next drag moves the page. */
  set space(held) {
    this.#space = held;
    this.#canvas.classList.toggle('moving', held || this.#holding.size > 0);
  }

  /** Whatever is under way leaves no mark. */
  abandon() {
    if (this.#drawing) this.#stop(() => this.#engine.cancel());
    if (this.#erasing) this.#endErasing();
    this.#holding.clear();
    this.space = false;
  }

  #place(event) {
    const box = this.#canvas.getBoundingClientRect(), scale = this.#view.scale;
    return [(event.clientX - box.left) * scale, (event.clientY - box.top) * scale];
  }
  #sample(event) {
    const [tilt, orientation] = event.pointerType === 'pen' ? lean(event) : [0, 0];
    return [...this.#view.toPage(...this.#place(event)), pressure(event), tilt, orientation,
            performance.timeOrigin + event.timeStamp];
  }

  #down(event) {
    const {pointerId: id, pointerType: type} = event;
    this.#canvas.focus({preventScroll: true});
    this.#page.quiet();
    if (type === 'pen') this.#page.penSeen();
    // An up that never came.
    if (this.#drawing?.id === id) this.#finish(this.#drawing.last);
    if (this.#erasing?.id === id) this.#endErasing();
    const moves = event.button === 1 || this.#space || (type === 'touch' && !this.#page.fingerDraws);
    if (moves || this.#holding.size > 0) return this.#hold(event);
    if (this.#drawing) {
      const isPinch = type === 'touch' && this.#drawing.type === 'touch' &&
                      event.timeStamp - this.#drawing.began < TIME_TO_PINCH;
      if (!isPinch) return;
      const first = this.#drawing;
      this.#stop(() => this.#engine.cancel());
      this.#holding.set(first.id, first.place);
      return this.#hold(event);
    }
    const erases = this.#page.tool === 'eraser' || event.button === 5 || (event.buttons & ERASER_BUTTON) !== 0;
    if (this.#erasing || (event.button !== 0 && !erases)) return;
    this.#capture(id);
    document.body.classList.add('drawing');
    if (erases) {
      this.#erasing = {id, at: this.#place(event)};
      return this.#eraseTo(event);
    }
    const sample = this.#sample(event);
    this.#drawing = {id, type, last: sample, place: this.#place(event), began: event.timeStamp};
    try {
      this.#engine.begin(this.#page.style(type), sample);
    } catch (error) {
      this.#stop(() => {});
      throw error;
    }
    this.#page.drawn(event);
  }

  #move(event) {
    const {pointerId: id} = event;
    if (this.#holding.has(id)) return this.#drag(event);
    if (this.#erasing?.id === id) return event.buttons === 0 ? this.#endErasing() : this.#eraseTo(event);
    if (this.#drawing?.id !== id) return;
    if (event.buttons === 0) return this.#finish(this.#drawing.last);  // lifted where nobody saw it
    const coalesced = event.getCoalescedEvents?.() ?? [];
    const events = coalesced.length > 0 ? coalesced : [event];
    const rows = [];
    for (const one of events) this.#push(rows, this.#sample(one));
    if (rows.length === 0) return;
    this.#drawing.last = rows.slice(-6);
    this.#drawing.place = this.#place(event);
    this.#engine.move(rows, this.#predicted(event));
    this.#page.drawn(event);
  }
  // Samples that are no numbers, or from before the last, are dropped.
  #push(rows, sample) {
    const before = rows.length > 0 ? rows.at(-1) : this.#drawing.last[5];
    if (sample.every(Number.isFinite) && sample[5] >= before) rows.push(...sample);
  }
  #predicted(event) {
    const rows = [];
    for (const one of (event.getPredictedEvents?.() ?? []).slice(0, MOST_PREDICTED)) {
      const ahead = one.timeStamp - event.timeStamp;
      const sample = this.#sample(one);
      if (ahead > 0 && ahead <= LONGEST_PREDICTION && sample.every(Number.isFinite)) rows.push(...sample);
    }
    return rows;
  }

  #up(event) {
    const {pointerId: id} = event;
    if (this.#holding.delete(id)) return this.#settle();
    if (this.#erasing?.id === id) {
      this.#eraseTo(event);
      return this.#endErasing();
    }
    if (this.#drawing?.id !== id) return;
    const sample = this.#sample(event), last = this.#drawing.last;
    const usable = sample.every(Number.isFinite) && sample[5] >= last[5];
    // A lifted pen presses and leans no more; the stroke ends as it last did.
    this.#finish(usable ? [sample[0], sample[1], ...last.slice(2, 5), sample[5]] : last);
  }
  #cancel(event) {
    const {pointerId: id} = event;
    if (this.#holding.delete(id)) return this.#settle();
    if (this.#erasing?.id === id) return this.#endErasing();
    if (this.#drawing?.id !== id) return;
    this.#stop(() => this.#engine.cancel());
    this.#page.drawn(null);
  }

  #finish(sample) {
    let stroke = 0;
    this.#stop(() => { stroke = this.#engine.end(sample); });
    this.#page.drawn(null);
    if (stroke > 0) this.#page.stored(stroke);
  }
  // Whatever comes of it, the next stroke can begin.
  #stop(call) {
    const id = this.#drawing?.id;
    this.#drawing = null;
    document.body.classList.remove('drawing');
    call();
    if (id !== undefined && this.#canvas.hasPointerCapture?.(id)) this.#canvas.releasePointerCapture(id);
  }
  #capture(id) {
    try {
      this.#canvas.setPointerCapture(id);
    } catch {
      // Gone already, or made by a script: its events come without.
    }
  }

  #eraseTo(event) {
    const at = this.#place(event), from = this.#erasing.at;
    this.#erasing.at = at;
    const radius = (event.pointerType === 'touch' ? 12 : 6) / this.#view.zoom;
    if (this.#engine.erase(...this.#view.toPage(...from), ...this.#view.toPage(...at), radius) > 0) this.#page.drawn(null);
  }
  #endErasing() {
    this.#erasing = null;
    document.body.classList.remove('drawing');
    const change = this.#engine.eraseEnd();
    if (change) this.#page.erased(change);
    this.#page.drawn(null);
  }

  // Moving the page.
  #hold(event) {
    if (this.#holding.size >= 2) return;
    this.#capture(event.pointerId);
    this.#holding.set(event.pointerId, this.#place(event));
    this.#canvas.classList.add('moving');
  }
  #drag(event) {
    const at = this.#place(event), before = this.#holding.get(event.pointerId);
    if (!at.every(Number.isFinite)) return;
    const other = [...this.#holding].find(([id]) => id !== event.pointerId)?.[1];
    this.#holding.set(event.pointerId, at);
    if (!other) {
      this.#view.move(at[0] - before[0], at[1] - before[1]);
    } else {
      const apart = (a) => Math.max(Math.hypot(a[0] - other[0], a[1] - other[1]), 1);
      const middle = (a) => [(a[0] + other[0]) / 2, (a[1] + other[1]) / 2];
      const [from, to] = [middle(before), middle(at)];
      this.#view.zoomAt(apart(at) / apart(before), ...from);
      this.#view.move(to[0] - from[0], to[1] - from[1]);
    }
    this.#page.moved();
  }
  #settle() {
    this.#canvas.classList.toggle('moving', this.#space || this.#holding.size > 0);
  }
  #wheel(event) {
    event.preventDefault();
    if (this.isBusy) return;
    const unit = this.#view.scale * [1, 16, 400][event.deltaMode] || this.#view.scale;
    if (event.ctrlKey || event.metaKey) {
      this.#view.zoomAt(Math.exp(-Math.max(-60, Math.min(60, event.deltaY)) / 100), ...this.#place(event));
    } else if (event.shiftKey && event.deltaX === 0) {
      this.#view.move(-event.deltaY * unit, 0);
    } else {
      this.#view.move(-event.deltaX * unit, -event.deltaY * unit);
    }
    this.#page.moved();
  }
}
