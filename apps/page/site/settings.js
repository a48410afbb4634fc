// What the person chose, kept from visit to visit. What is stored is believed only where it makes sense.

const NAME = 'qelt-pencil';

const isColor = (value) => typeof value === 'string' && /^#[0-9a-f]{6}$/.test(value);
const isFlag = (value) => typeof value === 'boolean';
const between = (least, most) => (value) => Number.isFinite(value) && value >= least && value <= most;

/** Each setting's first value, and what it may be. */
const SETTINGS = {
  look: [8, (value) => Number.isInteger(value) && value >= 1 && value <= 8],
  size: [2.4, between(0.01, 1000)],  // stroke units; the pen's own limits are narrower
  color: ['#000000', isColor],
  opacity: [100, between(1, 100)],
  smooth: [true, isFlag],
  outline: [false, isFlag],
  outlineSize: [4, between(0.5, 12)],
  outlineColor: ['#ffd84d', isColor],
  eraser: [false, isFlag],
  finger: [true, isFlag],
  penSeen: [false, isFlag],
  paper: ['#ffffff', isColor],
  pictureZoom: [2, (value) => [1, 2, 4].includes(value)],
  transparent: [false, isFlag],
  measure: [false, isFlag],
  /** Where each page lies in the window, by its number. */
  views: [{}, (value) => typeof value === 'object' && value !== null && !Array.isArray(value)],
};

export class Settings {
  #values = {};
  #listeners = [];

  constructor() {
    let stored = {};
    try {
      stored = JSON.parse(localStorage.getItem(NAME) ?? '{}') ?? {};
    } catch {
      // No storage, or not what was stored: everything is as on the first visit.
    }
    for (const [name, [first, isGood]] of Object.entries(SETTINGS)) {
      this.#values[name] = isGood(stored[name]) ? stored[name] : first;
    }
  }

  get(name) { return this.#values[name]; }

  /** Takes some settings, keeps them, and tells everybody. */
  set(some) {
    for (const [name, value] of Object.entries(some)) if (SETTINGS[name][1](value)) this.#values[name] = value;
    try {
      localStorage.setItem(NAME, JSON.stringify(this.#values));
    } catch {
      // They hold until the tab closes. That strokes are not stored either is told where they are.
    }
    for (const listener of this.#listeners) listener(some);
  }

  /** @param {(some: object) => void} listener called with what changed */
  listen(listener) { this.#listeners.push(listener); }

  /** The style of the next stroke, as the engine takes it. */
  style(tool) {
    const {look, size, color, opacity, smooth, outline, outlineSize, outlineColor} = this.#values;
    const argb = (css, alpha) => ((alpha << 24) | parseInt(css.slice(1), 16)) >>> 0;
    return {look, size, color: argb(color, Math.round(opacity * 2.55)), smooth, tool,
            outline: outline ? {size: outlineSize, color: argb(outlineColor, 255)} : null};
  }
}

/** Red, green and blue of a CSS colour of six digits. */
export const rgbOf = (css) => [1, 3, 5].map((at) => parseInt(css.slice(at, at + 2), 16));
