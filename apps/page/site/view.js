// Where the page lies in the window. Places in the window are device pixels from its top left corner; 100 % is one
// stroke unit to a CSS pixel.

const LEAST = 1 / 16, MOST = 32;  // of the natural size

export class View {
  #engine;
  #changed;
  #scale = 1;  // device pixels per CSS pixel

  /** `changed` is called after every move. */
  constructor(engine, changed) {
    this.#engine = engine;
    this.#changed = changed;
  }

  /** The window's size in device pixels, and how many of them a CSS pixel has. */
  resize(width, height, scale) {
    const before = this.#engine.view, factor = scale / this.#scale;
    this.#scale = scale;
    this.#engine.resize(width, height);
    if (factor !== 1) this.#set(before.zoom * factor, before.x * factor, before.y * factor);
    this.#changed();
  }

  get scale() { return this.#scale; }
  /** 1 is the natural size. */
  get zoom() { return this.#engine.view.zoom / this.#scale; }

  /** The stroke units at a place in the window. */
  toPage(x, y) {
    const view = this.#engine.view;
    return [(x - view.x) / view.zoom, (y - view.y) / view.zoom];
  }

  #set(zoom, x, y) {
    const limited = Math.min(Math.max(zoom, LEAST * this.#scale), MOST * this.#scale);
    const far = 1e6 * limited;  // nothing can be drawn out there
    this.#engine.setView({zoom: limited, x: Math.min(Math.max(x, -far), far), y: Math.min(Math.max(y, -far), far)});
    this.#changed();
  }

  move(dx, dy) {
    const {zoom, x, y} = this.#engine.view;
    this.#set(zoom, Math.round(x + dx), Math.round(y + dy));
  }

  /** Zooms by a factor; what lies at (x, y) stays there. */
  zoomAt(factor, x, y) {
    const view = this.#engine.view;
    const zoom = Math.min(Math.max(view.zoom * factor, LEAST * this.#scale), MOST * this.#scale);
    const real = zoom / view.zoom;
    this.#set(zoom, x - (x - view.x) * real, y - (y - view.y) * real);
  }

  /** The natural size; the middle of the window stays. */
  natural(width, height) { this.zoomAt(1 / this.zoom, width / 2, height / 2); }

  /** The whole page in the window, at most at its natural size. */
  fit(width, height) {
    const bounds = this.#engine.bounds();
    if (!bounds) return this.#set(this.#scale, 0, 0);
    const margin = 24 * this.#scale, bar = 72 * this.#scale;
    const wide = Math.max(bounds.right - bounds.left, 1), high = Math.max(bounds.bottom - bounds.top, 1);
    const zoom = Math.min((width - 2 * margin) / wide, (height - 2 * margin - bar) / high, this.#scale);
    const real = Math.max(zoom, LEAST * this.#scale);
    return this.#set(real, Math.round((width - real * (bounds.left + bounds.right)) / 2),
                     Math.round((height - bar - real * (bounds.top + bounds.bottom)) / 2));
  }
}
