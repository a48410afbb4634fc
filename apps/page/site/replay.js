// Plays the page at the speed at which it was drawn. Longer pauses than this are shortened to it, in milliseconds.
const LONGEST_PAUSE = 600;
const VALUES = 6;

export class Replay {
  #engine;
  #steps = [];  // {at, call}: what happens when, milliseconds from the start
  #began = 0;
  #next = 0;

  /** `strokes`: [{style, samples}] in the order in which they were drawn. */
  constructor(engine, strokes) {
    this.#engine = engine;
    let clock = 0, before = null;
    for (const {style, samples} of strokes) {
      const count = samples.length / VALUES;
      for (let i = 0; i < count; ++i) {
        const sample = samples.subarray(i * VALUES, (i + 1) * VALUES);
        const pause = before === null ? 0 : Math.min(Math.max(sample[5] - before, 0), LONGEST_PAUSE);
        clock += i === 0 && before !== null ? Math.max(pause, 60) : pause;
        before = sample[5];
        this.#steps.push({at: clock, style: i === 0 ? style : null, sample, last: i === count - 1});
      }
    }
    engine.replayBegin();
  }

  /** Draws what is due by now; false when it is over. */
  step(now) {
    if (this.#next === 0) this.#began = now;
    const due = [];
    const flush = () => {
      if (due.length > 0) this.#engine.move(due.splice(0));
    };
    for (; this.#next < this.#steps.length; ++this.#next) {
      const {at, style, sample, last} = this.#steps[this.#next];
      if (at > now - this.#began) break;
      if (style) {
        this.#engine.begin(style, sample);
      } else {
        due.push(...sample);
      }
      if (last) {
        flush();
        this.#engine.end(sample);
      }
    }
    flush();
    return this.#next < this.#steps.length;
  }

  end() { this.#engine.replayEnd(); }
}
