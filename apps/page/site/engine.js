// The pen and its page, compiled to WebAssembly, behind calls in JavaScript's own terms. Lengths are stroke units
// unless a name says pixels; colours are 0xAARRGGBB; ids are positive integers that a stroke keeps while the page is
// open. Whatever goes wrong comes as an EngineError with one clear sentence, and the page stays as it was.

export class EngineError extends Error {
  constructor(message) {
    super(message);
    this.name = 'EngineError';
  }
}

const TOOLS = {touch: 1, pen: 2, mouse: 3};
const VALUES = 6;  // of a sample: x, y, pressure, tilt, orientation, milliseconds

// The page carries the compiled code gzipped, in base64: a third of what it takes as it is.
async function compiledCode() {
  const packed = Uint8Array.from(atob(document.getElementById('qelt-wasm').textContent), (byte) => byte.charCodeAt(0));
  return new Response(new Blob([packed]).stream().pipeThrough(new DecompressionStream('gzip'))).arrayBuffer();
}

/**
 * Makes the canvas's WebGL 2 context and the engine that draws with it.
 * `makeModule` is what Emscripten wrote.
 */
export async function openEngine(canvas, makeModule = globalThis.createQelt) {
  const code = compiledCode();
  // Made here, as the compiled code cannot ask for a desynchronized one; it then gets this one.
  const gl = canvas.getContext('webgl2', {
    alpha: true, antialias: false, depth: false, stencil: false, premultipliedAlpha: true,
    preserveDrawingBuffer: false, desynchronized: true,
  });
  if (!gl) throw new EngineError('This browser cannot draw here: it offers no WebGL 2.');
  const module = await makeModule({canvas, wasmBinary: await code});
  return new Engine(module, canvas, gl);
}

export class Engine {
  #module;
  #canvas;
  #view = {zoom: 1, x: 0, y: 0};
  #paper = [255, 255, 255];

  constructor(module, canvas, gl) {
    this.#module = module;
    this.#canvas = canvas;
    // The compiled code looks the canvas up by its id, and gets the context that it has.
    const selector = this.#bytes(new TextEncoder().encode(`#${canvas.id}\0`));
    this.#call('open', selector, canvas.width, canvas.height);
    const real = gl.getExtension('WEBGL_debug_renderer_info');
    this.renderer = gl.getParameter(real ? real.UNMASKED_RENDERER_WEBGL : gl.RENDERER);
  }

  // What crosses the border. The compiled code answers with a number; a negative one is a refusal, whose sentence
  // `qelt_error` holds. Longer answers lie in two lists, of numbers and of bytes, until the next call.
  #call(name, ...values) {
    let answer;
    try {
      answer = this.#module[`_qelt_${name}`](...values);
    } catch (error) {
      // A number is a C++ exception that nobody caught; anything else is the machine itself giving up.
      throw new EngineError(`The pen could not go on (${error instanceof Error ? error.message : error}).`);
    }
    if (answer < 0) throw new EngineError(this.#text(this.#module._qelt_error()));
    return answer;
  }
  #text(address) {
    const {HEAPU8} = this.#module;
    return new TextDecoder().decode(HEAPU8.subarray(address, HEAPU8.indexOf(0, address)));
  }
  #numbers() {
    const from = this.#module._qelt_numbers() / 8;
    return this.#module.HEAPF64.slice(from, from + this.#module._qelt_number_count());
  }
  #answerBytes() {
    const from = this.#module._qelt_bytes();
    return this.#module.HEAPU8.slice(from, from + this.#module._qelt_byte_count());
  }
  #room(size) {
    const address = this.#module._qelt_input(size);
    if (address === 0) throw new EngineError('There is not enough memory for this.');
    return address;
  }
  #bytes(bytes) {
    const address = this.#room(bytes.length);
    this.#module.HEAPU8.set(bytes, address);
    return address;
  }
  #rows(rows, more = []) {
    if (rows.length % VALUES || more.length % VALUES) throw new EngineError('A sample has six values.');
    const address = this.#room((rows.length + more.length) * 8);
    this.#module.HEAPF64.set(rows, address / 8);
    this.#module.HEAPF64.set(more, address / 8 + rows.length);
    return address;
  }
  #style({look, size, color, smooth, outline, tool}) {
    return [look, size, color | 0, smooth ? 1 : 0, outline ? outline.size : 0, outline ? outline.color | 0 : 0,
            TOOLS[tool] ?? TOOLS.pen];
  }
  // Ids shown (above 0) and hidden (below 0), or nothing at all.
  #change(happened) {
    if (!happened) return null;
    const ids = [...this.#numbers()];
    return {shown: ids.filter((id) => id > 0), hidden: ids.filter((id) => id < 0).map((id) => -id)};
  }

  // The window.
  resize(width, height) {
    this.#call('resize', width, height);
    if (this.#canvas.width !== width) this.#canvas.width = width;
    if (this.#canvas.height !== height) this.#canvas.height = height;
  }
  /** Device pixel = zoom * unit + (x, y). What there is shows at once, moved; `work` then draws it sharp. */
  setView({zoom, x, y}) {
    this.#call('view', zoom, x, y);
    this.#view = {zoom, x, y};
  }
  get view() { return {...this.#view}; }
  set paper(rgb) { this.#paper = [...rgb]; }
  get paper() { return [...this.#paper]; }
  present() { this.#call('present', ...this.#paper); }
  /** One slice of redrawing, of about so many milliseconds. True while there is more to do. */
  work(milliseconds) { return this.#call('work', milliseconds) === 1; }
  get busy() { return this.#call('busy') === 1; }

  // A stroke. A sample is [x, y, pressure 0..1, tilt, orientation, milliseconds].
  begin(style, sample) { this.#call('begin', ...this.#style(style), ...sample); }
  /** `samples`: rows of a sample each; all but the last are the event's history. */
  move(samples, predicted = []) {
    const address = this.#rows(samples, predicted);
    this.#call('move', address, samples.length / VALUES, predicted.length / VALUES);
  }
  /** The id of the stroke that is on the page now; 0 when there is none. */
  end(sample) { return this.#call('end', ...sample); }
  cancel() { this.#call('cancel'); }

  // What is on the page.
  /** Hides what the segment meets; the step stays open until `eraseEnd`. */
  erase(x0, y0, x1, y1, radius) { return this.#call('erase', x0, y0, x1, y1, radius); }
  eraseEnd() { return this.#change(this.#call('erase_end')); }
  undo() { return this.#change(this.#call('undo')); }
  redo() { return this.#change(this.#call('redo')); }
  clear() { return this.#change(this.#call('clear')); }
  get canUndo() { return this.#call('can_undo') === 1; }
  get canRedo() { return this.#call('can_redo') === 1; }
  strokes() {
    this.#call('strokes');
    return [...this.#numbers()];
  }
  /** Null on an empty page. */
  bounds() {
    if (this.#call('bounds') === 0) return null;
    const [left, top, right, bottom] = this.#numbers();
    return {left, top, right, bottom};
  }
  /** The stroke's samples, rows of six values. */
  samples(id) {
    this.#call('samples', id);
    return this.#numbers();
  }
  /** As another window on the same page did: no step of the history. */
  setShown(shown, hidden) {
    for (const id of shown) this.#call('set_shown', id, 1);
    for (const id of hidden) this.#call('set_shown', id, 0);
  }
  style(id) {
    this.#call('style', id);
    const [look, size, color, smooth, outlineSize, outlineColor, tool] = this.#numbers();
    return {look, size, color, smooth: smooth === 1,
            outline: outlineSize > 0 ? {size: outlineSize, color: outlineColor} : null,
            tool: Object.keys(TOOLS).find((name) => TOOLS[name] === tool)};
  }

  // Storage and files.
  record(id) {
    this.#call('record', id);
    return this.#answerBytes();
  }
  addRecord(bytes) {
    return this.#call('add_record', this.#bytes(bytes), bytes.length);
  }
  openInkml(bytes, name) {
    const text = new TextEncoder().encode(name);
    const both = new Uint8Array(bytes.length + text.length);
    both.set(bytes);
    both.set(text, bytes.length);
    return this.#change(this.#call('open_inkml', this.#bytes(both), bytes.length, text.length));
  }
  inkml() {
    this.#call('inkml');
    return new TextDecoder().decode(this.#answerBytes());
  }

  // Pictures: straight RGBA, as ImageData takes it.
  #picture(width, height) { return {width, height, data: new Uint8ClampedArray(this.#answerBytes().buffer)}; }
  picture({zoom = 1, transparent = false} = {}) {
    this.#call('picture', zoom, transparent ? 1 : 0, ...this.#paper);
    return this.#picture(...this.#numbers());
  }
  preview(width, height, style) {
    this.#call('preview', width, height, ...this.#style(style));
    return this.#picture(width, height);
  }

  replayBegin() { this.#call('replay_begin'); }
  replayEnd() { this.#call('replay_end'); }

  // The canvas's own events.
  contextLost() { this.#call('context_lost'); }
  contextRestored() { this.#call('context_restored'); }

  /** What the pen itself says of a look. */
  limits(look) {
    this.#call('limits', look);
    const [minSize, maxSize, size, color] = this.#numbers();
    return {minSize, maxSize, size, color};
  }
  stats() {
    this.#call('stats');
    const [strokes, stamps, tiles, cacheHits, cacheMisses, cachedBytes, backupBytes] = this.#numbers();
    return {strokes, stamps, tiles, cacheHits, cacheMisses, cachedBytes, backupBytes,
            heapBytes: this.#module.HEAPU8.length};
  }
}
