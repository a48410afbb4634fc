// How long events take to be drawn, and what the engine has done for it.

const KEPT = 512;  // newest events

/** The value below which that share of the values lies. @param {number[]} values */
export function quantile(values, share) {
  if (values.length === 0) return NaN;
  const sorted = Float64Array.from(values).sort();
  return sorted[Math.min(sorted.length - 1, Math.floor(share * sorted.length))];
}

export class Meter {
  #handled = [];  // milliseconds in the handler
  #drawn = [];  // milliseconds from the event until it was drawn
  #shown = [];  // ... until the frame with it was handed over
  #waiting = [];  // times of the events that the next frame shows
  #stamps = {count: 0, time: 0};

  #keep(list, value) {
    if (!(value >= 0 && value < 10_000)) return;  // a clock of its own
    list.push(value);
    if (list.length > KEPT) list.shift();
  }

  /** An event of that time was drawn, which took so long. */
  event(time, handled) {
    this.#keep(this.#handled, handled);
    this.#keep(this.#drawn, performance.now() - time);
    if (this.#waiting.length < KEPT) this.#waiting.push(time);
  }
  frame() {
    for (const time of this.#waiting) this.#keep(this.#shown, performance.now() - time);
    this.#waiting.length = 0;
  }

  /** What to show: a name and a text each. @param {ReturnType<import('#page/engine.js').Engine['stats']>} stats */
  rows(stats) {
    const now = performance.now();
    const seconds = (now - this.#stamps.time) / 1000;
    const rate = seconds > 0 && this.#stamps.time > 0 ? (stats.stamps - this.#stamps.count) / seconds : 0;
    this.#stamps = {count: stats.stamps, time: now};
    const two = (values) => values.length === 0 ? '–'
      : `${quantile(values, 0.5).toFixed(2)} / ${quantile(values, 0.99).toFixed(2)} ms`;
    const whole = (value) => Math.round(value).toLocaleString('en');
    const mega = (bytes) => `${(bytes / 2 ** 20).toFixed(1)} MB`;
    return [
      ['Event to draw, median / 99th', two(this.#drawn)],
      ['Event to frame', two(this.#shown)],
      ['In the handler', two(this.#handled)],
      ['Stamps a second', whole(rate)],
      ['Strokes', whole(stats.strokes)],
      ['Tiles', whole(stats.tiles)],
      ['Cache hits / misses', `${whole(stats.cacheHits)} / ${whole(stats.cacheMisses)}`],
      ['Cache, undo', `${mega(stats.cachedBytes)}, ${mega(stats.backupBytes)}`],
      ['Memory', mega(stats.heapBytes)],
    ];
  }
}
