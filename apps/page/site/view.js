// Where the page lies in the window. Scale and place are in CSS pixels, so that a page looks the same on every screen;
// the engine has them in device pixels.

export const LEAST_SCALE = 1 / 16, MOST_SCALE = 32;
const FARTHEST = 100_000;  // stroke units from the page's origin; the engine takes no ink beyond

const within = (value, least, most) => Math.max(least, Math.min(most, value));

export class View {
  scale = 1;
  x = 0;
  y = 0;
  width = 1;
  height = 1;
  ratio = 1;  // device pixels a CSS pixel
  #changed;

  /** @param {(view: {zoom: number, x: number, y: number}) => void} changed takes what the engine is to show */
  constructor(changed) {
    this.#changed = changed;
  }

  /** The window's size, CSS pixels. */
  resize(width, height, ratio) {
    Object.assign(this, {width, height, ratio});
    this.set(this);
  }

  /** Takes what makes sense of it, and nothing else. */
  set({scale, x, y}) {
    if (![scale, x, y].every(Number.isFinite)) return;
    this.scale = within(scale, LEAST_SCALE, MOST_SCALE);
    const far = FARTHEST * this.scale;
    this.x = within(x, -far, far + this.width);
    this.y = within(y, -far, far + this.height);
    // On whole device pixels a moved picture stays as sharp as it was.
    const {ratio} = this;
    this.#changed({zoom: this.scale * ratio, x: Math.round(this.x * ratio), y: Math.round(this.y * ratio)});
  }

  /** Window pixels to stroke units. */
  toUnits(x, y) { return [(x - this.x) / this.scale, (y - this.y) / this.scale]; }

  pan(dx, dy) { this.set({scale: this.scale, x: this.x + dx, y: this.y + dy}); }

  /** Zooms about a place of the window, its middle unless told. */
  zoom(factor, x = this.width / 2, y = this.height / 2) {
    this.#hold(this.toUnits(x, y), this.scale * factor, x, y);
  }

  /** One or two fingers moved, each [x, y]: what was below them stays there. */
  grip(before, after) {
    const middle = (places) => [0, 1].map((i) => places.reduce((sum, place) => sum + place[i], 0) / places.length);
    const span = ([a, b]) => (b ? Math.max(1, Math.hypot(a[0] - b[0], a[1] - b[1])) : 1);
    const [x, y] = middle(before), [toX, toY] = middle(after);
    this.#hold(this.toUnits(x, y), this.scale * span(after) / span(before), toX, toY);
  }

  /** Shows the whole page, enlarged at most to its own size. */
  fit(bounds) {
    if (!bounds) return this.set({scale: 1, x: 0, y: 0});
    const margin = 24;
    const wide = bounds.right - bounds.left, high = bounds.bottom - bounds.top;
    const scale = within(Math.min(1, (this.width - 2 * margin) / wide, (this.height - 2 * margin) / high),
                         LEAST_SCALE, MOST_SCALE);
    this.set({scale, x: (this.width - scale * (bounds.left + bounds.right)) / 2,
              y: (this.height - scale * (bounds.top + bounds.bottom)) / 2});
  }

  /** Whether all of that is in the window. */
  shows({left, top, right, bottom}) {
    const [fromX, fromY] = this.toUnits(0, 0), [toX, toY] = this.toUnits(this.width, this.height);
    return left >= fromX && top >= fromY && right <= toX && bottom <= toY;
  }

  #hold([unitX, unitY], scale, x, y) {
    const kept = within(scale, LEAST_SCALE, MOST_SCALE);
    this.set({scale: kept, x: x - unitX * kept, y: y - unitY * kept});
  }
}
