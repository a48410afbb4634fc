// When the page is shown and when it is redrawn: shown once a frame at most, redrawn in slices in between, input first.

const SLICE = {idle: 6, drawing: 2};  // milliseconds
const REST = 90;  // milliseconds after the last move of the view before the page is redrawn sharp

export class Frames {
  #engine;
  #guard;
  #asked = false;
  #timer = 0;
  /** Whether a stroke is under way. */
  drawing = () => false;
  /** Called with each frame that was shown. */
  shown = () => {};

  constructor(engine, guard) {
    this.#engine = engine;
    this.#guard = guard;
  }

  /** Shows the page with the next frame. */
  ask() {
    if (this.#asked) return;
    this.#asked = true;
    requestAnimationFrame(() => {
      this.#asked = false;
      this.now();
    });
  }

  /** Shows the page at once, as for the first ink of a stroke. */
  now() {
    if (this.#guard(() => this.#engine.present())) this.shown();
  }

  /** Goes on with what the engine has to redraw, if anything, after so many milliseconds. */
  work(delay = 0) {
    clearTimeout(this.#timer);
    this.#timer = setTimeout(() => this.#slice(), delay);
  }
  workAtRest() {
    this.ask();
    this.work(REST);
  }

  #slice() {
    let more = false;
    if (navigator.scheduling?.isInputPending?.()) more = true;
    else this.#guard(() => { more = this.#engine.work(this.drawing() ? SLICE.drawing : SLICE.idle); });
    if (more) this.work();
    else this.ask();
  }
}
