// The tools: panels, settings, keys and messages. What they do stands in a table of commands, which buttons, keys and
// the help panel share.

import {rgbOf} from '#page/settings.js';

const COLORS = [
  ['Black', '#000000'], ['Graphite', '#454a52'], ['Grey', '#8f959e'], ['White', '#ffffff'], ['Brown', '#7a4a2b'],
  ['Red', '#c0392b'], ['Orange', '#e0672e'], ['Yellow', '#e8b023'], ['Green', '#4f9a3d'], ['Teal', '#1f8a80'],
  ['Blue', '#1f6fb2'], ['Indigo', '#3b4cc0'], ['Purple', '#8e44ad'],
];
const PAPERS = [['White', '#ffffff'], ['Ivory', '#fbf5e6'], ['Grey', '#e4e4e1'], ['Slate', '#262a30']];
const MESSAGE_TIME = 7000;  // milliseconds that good news stays

const $ = (id) => /** @type {any} */ (document.getElementById(id));

/** An element with properties and children. */
function make(tag, properties = {}, ...children) {
  const element = Object.assign(document.createElement(tag), properties);
  element.append(...children);
  return element;
}

/** One sentence, as people write it. */
export const sentence = (text) => {
  const trimmed = String(text).trim();
  // What begins with the name of a file is left as it is.
  const first = /^[a-z]+ [^:]*$/.test(trimmed) ? trimmed[0].toUpperCase() + trimmed.slice(1) : trimmed;
  return /[.!?]$/.test(first) ? first : `${first}.`;
};

/** What a key press is called in the table of commands. @param {KeyboardEvent} event */
function keyOf(event) {
  const key = event.key.length === 1 ? event.key.toLowerCase() : event.key;
  const shift = event.shiftKey && (key.length > 1 || /[a-z]/.test(key)) ? 'Shift ' : '';
  return `${event.ctrlKey || event.metaKey ? 'Ctrl ' : ''}${shift}${key === ' ' ? 'Space' : key}`;
}

/** How a key of the table is shown. */
const keyText = (key) => key.replace('Arrow', '').split(' ').map((part) => (part.length === 1 ? part.toUpperCase() : part)).join(' ');

/**
 * @typedef {object} Command
 * @property {string} label
 * @property {string[]} [keys] as keyOf calls them
 * @property {string} [family] what the help panel says of this and others alike
 * @property {() => unknown} run
 * @property {() => boolean} [can]
 */

export class Ui {
  #settings;
  #engine;
  /** @type {Record<string, Command>} */ #commands;
  #guard;
  #canDraw;
  #previewAsked = false;

  /** @param {import('#page/settings.js').Settings} settings @param {() => boolean} canDraw false while the context is lost */
  constructor(settings, engine, commands, guard, canDraw) {
    this.#canDraw = canDraw;
    this.#settings = settings;
    this.#engine = engine;
    this.#commands = {
      ...commands,
      pencil: {label: 'Pencil', keys: ['b', 'p'], run: () => this.#tool('pencil')},
      eraser: {label: 'Eraser', keys: ['e'], run: () => this.#tool('eraser')},
      ...Object.fromEntries(['files', 'more', 'help'].map((id) => [id, {
        label: {files: 'Files and pages', more: 'View and page', help: 'Help'}[id], keys: [{files: 'o', more: 'm', help: '?'}[id]],
        run: () => this.toggle(id),
      }])),
      close: {label: 'Close', keys: ['Escape'], run: () => this.close()},
    };
    this.#guard = guard;
    this.#buildChoices();
    this.#bindSettings();
    this.#bindCommands();
    settings.listen(() => this.refresh());
    new ResizeObserver(() => this.#preview()).observe($('preview'));
    this.refresh();
  }

  // --- Commands ---

  #bindCommands() {
    for (const button of /** @type {NodeListOf<HTMLButtonElement>} */ (document.querySelectorAll('[data-command]'))) {
      const {label, keys = []} = this.#commands[button.dataset.command];
      const hint = keys.length > 0 ? keyText(keys[0]) : '';
      if (button.childElementCount === 0) {
        button.append(label, make('kbd', {textContent: hint, ariaHidden: 'true'}));
      } else {
        if (!button.querySelector('output')) button.setAttribute('aria-label', label);
        button.title = hint ? `${label} (${hint})` : label;
      }
      button.addEventListener('click', () => this.run(button.dataset.command));
    }
    const byKey = new Map(Object.entries(this.#commands).flatMap(([id, {keys = []}]) => keys.map((key) => [key, id])));
    window.addEventListener('keydown', (event) => {
      if (event.defaultPrevented || event.altKey || event.isComposing) return;
      const target = /** @type {HTMLElement} */ (event.target);
      const key = keyOf(event);
      // A control has its own keys; only a command with Ctrl, or one to leave it, comes before.
      const isControl = target.matches('input, select, button');
      const isOwn = target.matches('button') ? key === 'Space' || key === 'Enter' : isControl && !key.startsWith('Ctrl ') && key !== 'Escape';
      const id = byKey.get(key);
      if (key === 'Ctrl c' && !getSelection()?.isCollapsed) return;  // text of the help
      if (isOwn || !id || (event.repeat && ['pencil', 'eraser', 'files', 'more', 'help'].includes(id))) return;
      event.preventDefault();
      this.run(id);
    });
    const list = $('keys');
    const shown = new Map();  // what several keys do alike takes one line
    for (const {label, keys = [], family = label} of Object.values(this.#commands)) {
      if (keys.length > 0) shown.set(family, [...(shown.get(family) ?? []), ...keys]);
    }
    for (const [label, keys] of shown) {
      list.append(make('dt', {}, ...keys.flatMap((key) => [make('kbd', {textContent: keyText(key)}), ' '])),
                  make('dd', {textContent: label}));
    }
    // The paper shows that it has the focus only to those who walk with the keyboard.
    const keys = (are) => () => document.body.classList.toggle('keys', are);
    window.addEventListener('keydown', (event) => event.key === 'Tab' && keys(true)());
    window.addEventListener('pointerdown', keys(false), {capture: true});
  }

  run(id) {
    const command = this.#commands[id];
    if (command.can && !command.can()) return;
    // A menu has done its part once something was chosen from it.
    if (['open', 'paste', 'saveInk', 'savePicture', 'copyPicture', 'newPage', 'fit', 'replay', 'clear'].includes(id)) this.close();
    this.#guard(command.run);
    this.refresh();
  }

  #tool(tool) {
    const isEraser = tool === 'eraser';
    const was = this.#settings.get('eraser');
    this.#settings.set({eraser: isEraser});
    if (!isEraser && !was) this.toggle('pencil');
    else this.close();
  }

  // --- Panels ---

  toggle(id) {
    const panel = $(`${id}-panel`);
    const opens = panel.hidden;
    this.close();
    if (!opens) return;
    panel.hidden = false;
    this.#showExpanded();
    if (id === 'pencil') this.#preview();
    this.opened(id);
    panel.querySelector('button, input:not([hidden]), select')?.focus({preventScroll: true});
  }
  /** Told of every panel that opens. */
  opened = (_id) => {};

  isOpen(id) { return !$(`${id}-panel`).hidden; }

  /** Closes what is open, if anything; the keyboard goes back to where it came from. */
  close() {
    let wasOpen = false;
    for (const panel of document.querySelectorAll('.panel:not([hidden])')) {
      const had = panel.contains(document.activeElement);
      /** @type {HTMLElement} */ (panel).hidden = true;
      wasOpen = true;
      const opener = /** @type {HTMLElement | null} */ (document.querySelector(`[aria-controls=${panel.id}]`));
      if (had) (opener ?? $('paper')).focus({preventScroll: true});
    }
    this.#showExpanded();
    return wasOpen;
  }
  #showExpanded() {
    for (const button of document.querySelectorAll('[aria-controls]')) {
      button.setAttribute('aria-expanded', String(!$(button.getAttribute('aria-controls')).hidden));
    }
  }

  // --- Settings ---

  #buildChoices() {
    const settings = this.#settings;
    const group = (parent, name, values, choose) => {
      const box = make('div', {className: 'choices'});
      for (const [label, value, face] of values) {
        const radio = make('input', {type: 'radio', name, value, ariaLabel: label});
        radio.addEventListener('change', () => choose(value));
        box.append(make('label', {title: label}, radio, face));
      }
      $(parent).append(box);
      return box;
    };
    const dot = (color, kind = '') => {
      const face = make('i', {className: kind});
      face.style.setProperty('--color', color);
      return face;
    };
    const colors = group('colors', 'color', COLORS.map(([label, color]) => [label, color, dot(color)]),
                         (color) => settings.set({color}));
    colors.append(make('label', {id: 'own-color', title: 'Another colour'},
                       make('input', {type: 'color', id: 'color', ariaLabel: 'Another colour'}), dot('', 'custom')));
    group('looks', 'look', [1, 2, 3, 4, 5, 6, 7, 8].map((look) => [`Look ${look}`, look, make('span', {textContent: String(look)})]),
          (look) => settings.set({look}));
    group('papers', 'paper', PAPERS.map(([label, color]) => [label, color, dot(color)]), (paper) => this.#choosePaper(paper));
  }

  /** Ink that could not be seen on the new paper is exchanged for ink that can. */
  #choosePaper(paper) {
    const light = (css) => rgbOf(css).reduce((sum, value, i) => sum + value * [0.299, 0.587, 0.114][i], 0);
    const change = {paper};
    if (Math.abs(light(this.#settings.get('color')) - light(paper)) < 70) change.color = light(paper) > 128 ? '#000000' : '#ffffff';
    this.#settings.set(change);
  }

  #bindSettings() {
    const settings = this.#settings;
    const bind = (id, name, property, convert = (value) => value) => {
      $(id).addEventListener('input', () => this.#guard(() => settings.set({[name]: convert($(id)[property])})));
    };
    for (const [id, name] of [['smooth', 'smooth'], ['outline', 'outline'], ['finger', 'finger'], ['measure', 'measure'], ['transparent', 'transparent']]) {
      bind(id, name, 'checked');
    }
    for (const [id, name] of [['size', 'size'], ['opacity', 'opacity'], ['outline-size', 'outlineSize'], ['picture-zoom', 'pictureZoom']]) {
      bind(id, name, 'value', Number);
    }
    bind('color', 'color', 'value');
    bind('outline-color', 'outlineColor', 'value');
  }

  /** Shows everything as it is now. */
  refresh() {
    const get = (name) => this.#settings.get(name);
    this.#guard(() => {
      const {minSize, maxSize} = this.#engine.limits(get('look'));
      const size = Math.max(minSize, Math.min(maxSize, get('size')));
      if (size !== get('size')) return this.#settings.set({size});
      Object.assign($('size'), {min: minSize, max: maxSize});
      for (const [id, value, text] of [['size', size, size.toFixed(1)], ['opacity', get('opacity'), `${get('opacity')} %`],
                                       ['outline-size', get('outlineSize'), get('outlineSize').toFixed(1)]]) {
        $(id).value = value;
        $(id).nextElementSibling.value = text;
      }
    });
    for (const name of ['smooth', 'outline', 'finger', 'measure', 'transparent']) $(name).checked = get(name);
    for (const name of ['color', 'look', 'paper']) {
      for (const radio of /** @type {NodeListOf<HTMLInputElement>} */ (document.querySelectorAll(`input[type=radio][name=${name}]`))) {
        radio.checked = radio.value === String(get(name));
      }
    }
    $('color').value = get('color');
    $('own-color').classList.toggle('chosen', !COLORS.some(([, color]) => color === get('color')));
    $('outline-color').value = get('outlineColor');
    $('outline-rows').hidden = !get('outline');
    $('picture-zoom').value = get('pictureZoom');
    $('meter').hidden = !get('measure');
    $('ink-mark').style.setProperty('--mark', get('color'));
    $('paper').dataset.tool = get('eraser') ? 'eraser' : 'pencil';
    document.documentElement.style.setProperty('--paper', get('paper'));
    for (const id of ['pencil', 'eraser']) {
      document.querySelector(`[data-command=${id}]`)?.setAttribute('aria-pressed', String((id === 'eraser') === get('eraser')));
    }
    for (const button of /** @type {NodeListOf<HTMLButtonElement>} */ (document.querySelectorAll('[data-command]'))) {
      const {can} = this.#commands[button.dataset.command];
      if (can) this.#guard(() => { button.disabled = !can(); });
    }
    this.#preview();
  }

  /** The sample stroke, once a frame while settings move. */
  #preview() {
    if ($('pencil-panel').hidden || this.#previewAsked) return;
    this.#previewAsked = true;
    requestAnimationFrame(() => {
      this.#previewAsked = false;
      const canvas = $('preview');
      const ratio = devicePixelRatio || 1;
      const width = Math.round(canvas.clientWidth * ratio), height = Math.round(canvas.clientHeight * ratio);
      if (width < 1 || height < 1 || !this.#canDraw()) return;
      this.#guard(() => {
        const {data} = this.#engine.preview(width, height, this.#settings.style('pen'));
        Object.assign(canvas, {width, height});
        canvas.getContext('2d').putImageData(new ImageData(data, width, height), 0, 0);
      });
    });
  }

  // --- What the person is told ---

  /** Bad news stays until it is read; the same news is told once. */
  say(text, isBad = false) {
    const message = sentence(text);
    const box = $('messages');
    for (const old of [...box.children]) {
      if (old.classList.contains('bad') && old.firstChild.textContent === message) return;
      if (!old.classList.contains('bad')) old.remove();
    }
    while (box.childElementCount > 2) box.firstChild.remove();
    const note = make('p', {className: isBad ? 'bad' : ''}, make('span', {textContent: message}));
    const close = make('button', {type: 'button', ariaLabel: 'Close message', innerHTML: '<svg><use href="#i-close"/></svg>'});
    close.addEventListener('click', () => note.remove());
    note.append(close);
    box.append(note);
    if (!isBad) setTimeout(() => note.remove(), MESSAGE_TIME);
  }

  showZoom(scale) { $('zoom').value = `${Math.round(scale * 100)} %`; }
  showHint(isShown) { $('hint').hidden = !isShown; }

  showMeter(rows) {
    $('meter').replaceChildren(make('dl', {}, ...rows.flatMap(([name, value]) => [make('dt', {textContent: name}), make('dd', {textContent: value})])));
  }

  showPages(pages, current, go) {
    const list = $('pages');
    const shown = JSON.stringify([pages, current]);
    if (list.dataset.shown === shown) return;  // whoever reads it, or has the focus there, is not disturbed
    list.dataset.shown = shown;
    const focused = /** @type {HTMLElement | null} */ (document.activeElement?.closest('#pages button'))?.dataset.page;
    list.replaceChildren(...pages.map(({page, count, last, taken}) => {
      const isHere = page === current;
      const when = new Date(last).toLocaleString(undefined, {dateStyle: 'short', timeStyle: 'short'});
      const button = make('button', {type: 'button', disabled: taken}, make('span', {textContent: `Page ${page}`}), ' ',
                          make('small', {textContent: taken ? 'open in another tab' : `${count} ${count === 1 ? 'stroke' : 'strokes'}, ${when}`}));
      if (isHere) button.setAttribute('aria-current', 'page');
      button.dataset.page = page;
      button.addEventListener('click', () => (isHere ? this.close() : go(page)));
      return make('li', {}, button);
    }));
    /** @type {HTMLElement | null} */ (list.querySelector(`[data-page="${focused}"]`))?.focus();
  }
}
