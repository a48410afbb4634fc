// How long it takes from an event to its ink.

const KEPT = 500;  // events

export class Meter {
  #times = [];
  #handled = [];
  #at = 0;
  #stamps = [];  // [when, how many so far]

  /** The event's ink has been handed to the screen; its handler began at `began`. */
  note(event, began) {
    const now = performance.now();
    this.#times[this.#at] = now - event.timeStamp;
    this.#handled[this.#at] = now - began;
    this.#at = (this.#at + 1) % KEPT;
  }

  /** Of the last events, in milliseconds: the median and the 99th of a hundred. */
  get() {
    const of = (list) => {
      const sorted = [...list].sort((a, b) => a - b);
      const share = (p) => sorted.length > 0 ? sorted[Math.min(Math.floor(p * sorted.length), sorted.length - 1)] : 0;
      return {median: share(0.5), p99: share(0.99)};
    };
    return {latency: of(this.#times), handler: of(this.#handled), events: this.#times.length};
  }

  text(stats, renderer) {
    const now = performance.now(), {latency, handler} = this.get();
    this.#stamps.push([now, stats.stamps]);
    while (this.#stamps.length > 2 && now - this.#stamps[0][0] > 1000) this.#stamps.shift();
    const [since, before] = this.#stamps[0];
    const rate = now > since ? (stats.stamps - before) / (now - since) * 1000 : 0;
    const ms = (value) => value.toFixed(2).padStart(7);
    const mega = (bytes) => `${(bytes / 1048576).toFixed(1)} MB`;
    const drawn = stats.cacheHits + stats.cacheMisses;
    return [
      'ms            median    99th',
      `event to ink ${ms(latency.median)} ${ms(latency.p99)}`,
      `handler      ${ms(handler.median)} ${ms(handler.p99)}`,
      `stamps a second ${Math.round(rate).toLocaleString('en')}`,
      `strokes ${stats.strokes}   tiles ${stats.tiles}`,
      `cache ${mega(stats.cachedBytes)}, hits ${drawn > 0 ? Math.round(100 * stats.cacheHits / drawn) : 0}%`,
      `undo ${mega(stats.backupBytes)}   memory ${mega(stats.heapBytes)}`,
      renderer.slice(0, 60),
    ].join('\n');
  }
}
