// Pointer Events become strokes, erasing and moves of the page. One pointer draws at a time; what others do never
// reaches its stroke.

/** @typedef {[number, number, number, number, number, number]} Sample x, y, pressure, tilt, orientation, milliseconds */

const finite = (value, otherwise) => (Number.isFinite(value) ? value : otherwise);

/**
 * How the pen is held: tilt from upright, and the direction it leans to, clockwise from up, in (-pi, pi]. Browsers
 * give altitude and azimuth, or only the two tilts, or nothing, which is an upright pen.
 */
export function attitudeOf({altitudeAngle, azimuthAngle, tiltX, tiltY}) {
  const upright = Math.PI / 2;
  let tilt, azimuth;  // the azimuth is clockwise from the right
  if (Number.isFinite(altitudeAngle) && Number.isFinite(azimuthAngle)) {
    tilt = upright - altitudeAngle;
    azimuth = azimuthAngle;
  } else {
    const along = (degrees) => Math.tan(Math.max(-89, Math.min(89, finite(degrees, 0))) * Math.PI / 180);
    const x = along(tiltX), y = along(tiltY);
    tilt = Math.atan(Math.hypot(x, y));
    azimuth = Math.atan2(y, x);
  }
  tilt = Math.max(0, Math.min(upright, tilt));
  // An upright pen leans nowhere, whatever the browser says.
  if (tilt < 1e-6) return {tilt: 0, orientation: 0};
  let orientation = (azimuth + upright) % (2 * Math.PI);
  if (orientation > Math.PI) orientation -= 2 * Math.PI;
  if (orientation <= -Math.PI) orientation += 2 * Math.PI;
  return {tilt, orientation};
}

/**
 * The sample of one event; null where it has no place. The pressure is the device's own: half of the most is what
 * Pointer Events have for a device that measures none, and for fingers and mice the pen takes its own instead.
 * Times count from 1970, so that they go on from visit to visit.
 * @param {PointerEvent} event
 * @param {(x: number, y: number) => [number, number]} toUnits
 * @returns {Sample | null}
 */
export function sampleOf(event, toUnits) {
  const [x, y] = toUnits(event.clientX, event.clientY);
  if (!Number.isFinite(x) || !Number.isFinite(y)) return null;
  const {tilt, orientation} = event.pointerType === 'pen' ? attitudeOf(event) : {tilt: 0, orientation: 0};
  const pressure = event.pointerType === 'touch' && !(event.pressure > 0) ? 0.5 : finite(event.pressure, 0.5);
  const time = performance.timeOrigin + finite(event.timeStamp, performance.now());
  return [x, y, Math.max(0, Math.min(1, pressure)), tilt, orientation, time];
}

const rowsOf = (events, toUnits) => events.map((event) => sampleOf(event, toUnits)).filter((row) => row !== null);

// Browsers extrapolate wildly when events come in bursts; what is further ahead than this is not worth showing.
const AHEAD = {milliseconds: 40, pixels: 120, samples: 12};

function expectedAfter(event) {
  const near = (next) => next.timeStamp - event.timeStamp <= AHEAD.milliseconds &&
    Math.hypot(next.clientX - event.clientX, next.clientY - event.clientY) <= AHEAD.pixels;
  return (event.getPredictedEvents?.() ?? []).slice(0, AHEAD.samples).filter(near);
}

// A finger's stroke is given up for a second finger that lands so early.
const EARLY = {milliseconds: 300, pixels: 24};
const ERASER_END = 32;  // among PointerEvent.buttons

/**
 * @typedef {object} Hand what input acts on
 * @property {() => boolean} erasing         the eraser is the tool
 * @property {() => boolean} fingerDraws
 * @property {(tool: string) => boolean} dismisses   closes what is open; true when that was all the tool wanted
 * @property {() => void} penSeen            called with every pen that comes down
 * @property {(tool: string, sample: Sample) => void} begin
 * @property {(rows: number[], expected: number[]) => void} move
 * @property {(sample: Sample) => void} end
 * @property {() => void} cancel
 * @property {(tool: string, from: number[], to: number[]) => void} erase
 * @property {(keep: boolean) => void} eraseEnd
 * @property {(before: number[][], after: number[][]) => void} grip   fingers that hold the page, before and after
 * @property {(x: number, y: number) => [number, number]} toUnits
 * @property {(task: () => void) => boolean} guard                    false when the task threw
 * @property {(time: number, handled: number) => void} measure
 */

export class Input {
  #canvas;
  /** @type {Hand} */ #hand;
  /** The pointers that are down, and where. @type {Map<number, {type: string, x: number, y: number}>} */
  #down = new Map();
  /** @type {null | {id: number, tool: string, erases: boolean, at: number[], x: number, y: number, time: number, way: number}} */
  #stroke = null;
  /** The pointers that hold the page. @type {number[]} */
  #grip = [];
  #space = false;

  /** @param {HTMLCanvasElement} canvas @param {Hand} hand */
  constructor(canvas, hand) {
    this.#canvas = canvas;
    this.#hand = hand;
    const on = (type, handle) => canvas.addEventListener(type, (event) => this.#handled(event, handle), {passive: false});
    on('pointerdown', this.#pointerDown);
    on('pointermove', this.#pointerMove);
    on('pointerup', this.#pointerUp);
    on('pointercancel', this.#pointerLost);
    on('lostpointercapture', this.#pointerLost);
    canvas.addEventListener('contextmenu', (event) => event.preventDefault());
    // Old Safari selects and magnifies text regardless of touch-action.
    canvas.addEventListener('touchstart', (event) => event.preventDefault(), {passive: false});
  }

  get drawing() { return this.#stroke !== null; }

  /** The space bar held down turns every pointer into a hand that moves the page. */
  set space(held) {
    this.#space = held;
    this.#showHand();
  }

  /** Leaves no mark of the stroke under way. */
  cancel() {
    const stroke = this.#stroke;
    if (!stroke) return;
    this.#stroke = null;
    this.#showDrawing();
    this.#hand.guard(() => (stroke.erases ? this.#hand.eraseEnd(false) : this.#hand.cancel()));
  }

  /** Ends the stroke under way where it is, as when the page is about to go. */
  finish() {
    const stroke = this.#stroke;
    if (!stroke) return;
    this.#stroke = null;
    this.#showDrawing();
    this.#hand.guard(() => {
      if (stroke.erases) this.#hand.eraseEnd(true);
      else this.#hand.end(/** @type {Sample} */ (stroke.at));
    });
  }

  #handled(event, handle) {
    const start = performance.now();
    const measured = handle.call(this, event);
    if (measured) this.#hand.measure(event.timeStamp, performance.now() - start);
  }
  #showHand() {
    const canvas = this.#canvas;
    if (this.#grip.length > 0) canvas.dataset.hand = 'closed';
    else if (this.#space) canvas.dataset.hand = 'open';
    else delete canvas.dataset.hand;
  }
  #showDrawing() { document.body.classList.toggle('drawing', this.drawing); }

  /** @param {PointerEvent} event */
  #pointerDown(event) {
    event.preventDefault();
    this.#canvas.focus({preventScroll: true});
    const {pointerId: id, pointerType: type, clientX: x, clientY: y} = event;
    if (!Number.isFinite(x) || !Number.isFinite(y)) return false;
    if (this.#stroke?.id === id) this.finish();  // its end never came
    this.#down.set(id, {type, x, y});
    try {
      this.#canvas.setPointerCapture(id);
    } catch {
      // Made by a script, or gone already; it works without.
    }
    if (type === 'pen') this.#hand.penSeen();

    const stroke = this.#stroke;
    if (stroke) {
      if (stroke.tool === 'touch' && type === 'pen') {
        this.cancel();  // the palm was first
      } else if (stroke.tool === 'touch' && type === 'touch' && !stroke.erases && stroke.way <= EARLY.pixels &&
                 event.timeStamp - stroke.time <= EARLY.milliseconds) {
        this.cancel();
        this.#grip = [stroke.id, id];
        this.#showHand();
        return false;
      } else {
        return false;
      }
    }
    if (type === 'pen') this.#grip = [];  // what lay on the page before was a palm
    const moves = this.#space || event.button === 1 || event.button === 2 ||
      (type === 'touch' && !this.#hand.fingerDraws());
    if (this.#grip.length > 0) {
      if (type === 'touch' && this.#grip.length < 2) this.#grip.push(id);
      return false;
    }
    if (moves) {
      this.#grip = [id];
      this.#showHand();
      return false;
    }
    return this.#begin(event);
  }

  /** @param {PointerEvent} event */
  #begin(event) {
    const sample = sampleOf(event, this.#hand.toUnits);
    if (!sample || this.#hand.dismisses(event.pointerType)) return false;
    const tool = ['pen', 'touch', 'mouse'].includes(event.pointerType) ? event.pointerType : 'pen';
    const erases = this.#hand.erasing() || event.button === 5 || (event.buttons & ERASER_END) !== 0;
    this.#stroke = {id: event.pointerId, tool, erases, at: sample, x: event.clientX, y: event.clientY,
                    time: event.timeStamp, way: 0};
    this.#showDrawing();
    const begun = this.#hand.guard(() => {
      if (erases) this.#hand.erase(tool, sample, sample);
      else this.#hand.begin(tool, sample);
    });
    if (!begun) this.cancel();
    return begun;
  }

  /** @param {PointerEvent} event */
  #pointerMove(event) {
    const pointer = this.#down.get(event.pointerId);
    if (!pointer) return false;
    // A mouse or pen that was let go where nobody told.
    if (event.buttons === 0 && event.pointerType !== 'touch') return this.#pointerUp(event);
    if (this.#grip.includes(event.pointerId)) {
      this.#moveGrip(event, pointer);
      return false;
    }
    // A finger that draws may yet become one of two that hold the page.
    pointer.x = finite(event.clientX, pointer.x);
    pointer.y = finite(event.clientY, pointer.y);
    const stroke = this.#stroke;
    if (stroke?.id !== event.pointerId) return false;
    const together = event.getCoalescedEvents?.() ?? [];
    const rows = rowsOf(together.length > 0 ? together : [event], this.#hand.toUnits);
    if (rows.length === 0) return false;
    stroke.way = Math.max(stroke.way, finite(Math.hypot(event.clientX - stroke.x, event.clientY - stroke.y), 0));
    return this.#hand.guard(() => {
      if (stroke.erases) {
        for (const row of rows) {
          this.#hand.erase(stroke.tool, stroke.at, row);
          stroke.at = row;
        }
      } else {
        stroke.at = rows[rows.length - 1];
        this.#hand.move(rows.flat(), rowsOf(expectedAfter(event), this.#hand.toUnits).flat());
      }
    });
  }

  #moveGrip(event, pointer) {
    const {clientX: x, clientY: y} = event;
    if (!Number.isFinite(x) || !Number.isFinite(y)) return;
    const places = () => this.#grip.map((id) => [this.#down.get(id).x, this.#down.get(id).y]);
    const before = places();
    pointer.x = x;
    pointer.y = y;
    this.#hand.guard(() => this.#hand.grip(before, places()));
  }

  /** @param {PointerEvent} event */
  #pointerUp(event) {
    if (!this.#letGo(event.pointerId)) return false;
    const stroke = this.#stroke;
    if (stroke?.id !== event.pointerId) return false;
    const sample = sampleOf(event, this.#hand.toUnits);
    if (sample) {
      // A lifted pen reports no pressure and sometimes no tilt; its place and time count.
      const [, , pressure, tilt, orientation] = stroke.at;
      if (stroke.erases) this.#hand.guard(() => this.#hand.erase(stroke.tool, stroke.at, sample));
      stroke.at = [sample[0], sample[1], pressure, tilt, orientation, sample[5]];
    }
    this.finish();
    return true;
  }

  /** @param {PointerEvent} event */
  #pointerLost(event) {
    // After every pointerup the capture is lost as well; the pointer is forgotten by then.
    if (this.#letGo(event.pointerId) && this.#stroke?.id === event.pointerId) this.cancel();
    return false;
  }

  #letGo(id) {
    this.#grip = this.#grip.filter((held) => held !== id);
    this.#showHand();
    return this.#down.delete(id);
  }
}
