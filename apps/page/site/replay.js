// Draws the page again at the speed it was drawn. Long pauses are made short.

const VALUES = 6;  // of a sample
const MOST = {pause: 600, still: 400};  // milliseconds between strokes, and within one
const UNTIMED = 8;  // milliseconds a sample where the times say nothing

/**
 * The style in a stroke's record, whose layout PageRecord.h holds.
 * @param {Uint8Array} record
 */
export function styleOfRecord(record) {
  const view = new DataView(record.buffer, record.byteOffset, record.byteLength);
  const flags = view.getUint16(6, true);
  return {
    look: view.getUint8(8),
    tool: ['pen', 'touch', 'pen', 'mouse'][view.getUint8(9)] ?? 'pen',
    size: view.getFloat32(12, true),
    color: view.getUint32(16, true),
    smooth: (flags & 1) !== 0,
    outline: (flags & 2) !== 0 ? {size: view.getFloat32(20, true), color: view.getUint32(24, true)} : null,
  };
}

/**
 * When each sample of each stroke is due, in milliseconds from the start.
 * @param {Float64Array[]} strokes rows of samples
 * @returns {number[][]}
 */
export function timeline(strokes) {
  let now = 0, lastEnd = null;
  return strokes.map((rows) => {
    const time = (i) => rows[i * VALUES + 5];
    const count = rows.length / VALUES;
    const isTimed = count > 1 && time(count - 1) > time(0);
    if (lastEnd !== null) now += Math.max(UNTIMED, Math.min(MOST.pause, isTimed ? time(0) - lastEnd : MOST.pause));
    const due = [];
    for (let i = 0; i < count; ++i) {
      if (i > 0) now += isTimed ? Math.max(0, Math.min(MOST.still, time(i) - time(i - 1))) : UNTIMED;
      due.push(now);
    }
    lastEnd = isTimed ? time(count - 1) : -Infinity;
    return due;
  });
}

export class Replay {
  #engine;
  #frames;
  #guard;
  #stopped;
  #running = false;
  #stop = (event) => {
    event.preventDefault();
    event.stopImmediatePropagation();
    this.stop();
  };

  /** @param {() => void} stopped called when it has ended, by itself or not */
  constructor(engine, frames, guard, stopped) {
    this.#engine = engine;
    this.#frames = frames;
    this.#guard = guard;
    this.#stopped = stopped;
  }

  get running() { return this.#running; }

  /** Throws what the engine throws, and then nothing has begun. */
  start() {
    const engine = this.#engine;
    const ids = engine.strokes();
    const strokes = ids.map((id) => engine.samples(id));
    const styles = ids.map((id) => styleOfRecord(engine.record(id)));
    const due = timeline(strokes);
    engine.replayBegin();
    this.#running = true;
    for (const type of ['keydown', 'pointerdown']) window.addEventListener(type, this.#stop, {capture: true});
    this.#frames.ask();

    let stroke = 0, sample = 0, from = null;
    const row = (i) => strokes[stroke].subarray(i * VALUES, (i + 1) * VALUES);
    const step = (time) => {
      if (!this.#running) return;
      from ??= time;
      const now = time - from;
      const went = this.#guard(() => {
        while (stroke < strokes.length && due[stroke][sample] <= now) {
          const times = due[stroke];
          if (sample === 0) engine.begin(styles[stroke], row(sample++));
          const first = sample;
          while (sample < times.length && times[sample] <= now) ++sample;
          if (sample > first) engine.move(strokes[stroke].subarray(first * VALUES, sample * VALUES));
          if (sample < times.length) break;
          engine.end(row(sample - 1));
          ++stroke;
          sample = 0;
        }
        engine.present();
      });
      if (!went || stroke >= strokes.length) this.stop();
      else requestAnimationFrame(step);
    };
    requestAnimationFrame(step);
  }

  stop() {
    if (!this.#running) return;
    this.#running = false;
    for (const type of ['keydown', 'pointerdown']) window.removeEventListener(type, this.#stop, {capture: true});
    this.#guard(() => this.#engine.replayEnd());
    this.#frames.ask();
    this.#frames.work();
    this.#stopped();
  }
}
