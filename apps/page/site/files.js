// Ink and pictures that come from outside, and those that go there.

import {inkOfPng, isPng, writePng} from '#page/png.js';

const MOST_BYTES = 256 * 1024 * 1024;  // of a file; more is a slip of the hand
// A picture on the clipboard is drawn anew by browsers, which drops its ink; under this name it stays as it is.
const UNTOUCHED = 'web image/png';

/** A name for what is saved now. */
function fileName(ending, now = new Date()) {
  const two = (value) => String(value).padStart(2, '0');
  return `pencil-${now.getFullYear()}-${two(now.getMonth() + 1)}-${two(now.getDate())}-${two(now.getHours())}${two(now.getMinutes())}.${ending}`;
}

function save(blob, ending) {
  const link = document.createElement('a');
  link.href = URL.createObjectURL(blob);
  link.download = fileName(ending);
  link.click();
  // The browser reads it at its leisure.
  setTimeout(() => URL.revokeObjectURL(link.href), 60_000);
}

/** The picture of the page, with its ink and what qelt-sketch needs to draw it alike. */
async function pictureOf(engine, {zoom, transparent, paper}) {
  const picture = engine.picture({zoom, transparent});
  const background = transparent ? ' --background transparent' : paper === '#ffffff' ? '' : ` --background ${paper.toUpperCase()}`;
  return writePng(picture, `${engine.inkml()}<?qelt-sketch --mode stroke --zoom ${zoom}${background}?>\n`);
}

export class Files {
  #engine;
  #opened;
  #options;

  /**
   * @param {import('#page/engine.js').Engine} engine
   * @param {(change: object, name: string) => void} opened takes the step that a file was
   * @param {() => {zoom: number, transparent: boolean, paper: string}} options of pictures
   */
  constructor(engine, opened, options) {
    this.#engine = engine;
    this.#opened = opened;
    this.#options = options;
  }

  /** Opens ink or a picture that carries ink; throws an Error with one sentence. @param {Blob} file */
  async open(file, name = file instanceof File ? file.name : 'clipboard') {
    if (file.size > MOST_BYTES) throw new Error(`${name}: too large; at most ${MOST_BYTES >> 20} MB can be opened`);
    let bytes;
    try {
      bytes = new Uint8Array(await file.arrayBuffer());
    } catch {
      throw new Error(`${name}: could not be read`);
    }
    if (isPng(bytes)) bytes = await inkOfPng(bytes, name);
    this.#opened(this.#engine.openInkml(bytes, name), name);
  }

  /** What was pasted or dropped: files, or text that is ink. True when there was something. */
  async take(transfer, isPasted = false) {
    // All of it is gone once this has waited.
    const files = [...transfer.files], text = transfer.getData('text/plain');
    for (const file of files) {
      try {
        await this.open(file);
      } catch (error) {
        // A pasted picture may lie there untouched as well.
        const untouched = isPasted && file.type === 'image/png' ? await this.#untouched() : null;
        if (!untouched) throw error;
        await this.open(untouched, file.name);
      }
    }
    if (files.length === 0 && text.trim() !== '') await this.open(new Blob([text]), 'pasted text');
    return files.length > 0 || text.trim() !== '';
  }

  async #untouched() {
    try {
      for (const item of await navigator.clipboard.read()) {
        if (item.types.includes(UNTOUCHED)) return await item.getType(UNTOUCHED);
      }
    } catch {
      // Not allowed, or not known here: then there is none.
    }
    return null;
  }

  /** Opens what the clipboard holds, where the browser lets a page read it. */
  async paste() {
    if (!navigator.clipboard?.read) throw new Error('This browser only pastes with the keyboard: press Ctrl V.');
    let items;
    try {
      items = await navigator.clipboard.read();
    } catch {
      throw new Error('The browser did not let the page read the clipboard; Ctrl V may work.');
    }
    for (const type of [UNTOUCHED, 'image/png', 'text/plain']) {
      const item = items.find(({types}) => types.includes(type));
      if (item) return this.open(await item.getType(type), 'clipboard');
    }
    throw new Error('The clipboard holds neither ink nor a picture.');
  }

  saveInk() {
    if (this.#engine.strokes().length === 0) throw new Error('There is nothing on the page.');
    save(new Blob([this.#engine.inkml()], {type: 'application/inkml+xml'}), 'inkml');
  }
  async savePicture() { save(await pictureOf(this.#engine, this.#options()), 'png'); }

  async copyPicture() {
    if (typeof ClipboardItem === 'undefined' || !navigator.clipboard?.write) {
      throw new Error('This browser copies no pictures; save it instead.');
    }
    const picture = pictureOf(this.#engine, this.#options());
    const types = ClipboardItem.supports?.(UNTOUCHED) ? ['image/png', UNTOUCHED] : ['image/png'];
    const typed = (type) => picture.then((blob) => blob.slice(0, blob.size, type));
    try {
      // Promises, since browsers want the call within the click.
      await navigator.clipboard.write([new ClipboardItem(Object.fromEntries(types.map((type) => [type, typed(type)])))]);
    } catch {
      await picture;  // what was wrong with it says more
      throw new Error('The browser did not let the page write to the clipboard; save the picture instead.');
    }
  }
}
