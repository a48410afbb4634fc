// The tools around the paper: a bar, the pencil's settings, a menu, messages.

export const COLORS = [['Graphite', 0x2b2d2f], ['Blue', 0x23508e], ['Red', 0xa8322c], ['Green', 0x2f6b3c],
                       ['Brown', 0x6e4a2c], ['Violet', 0x5b3b84]];
const LOOKS = 8;
const MESSAGE_TIME = 6000;

const $ = (id) => document.getElementById(id);
const hex = (rgb) => `#${(rgb & 0xffffff).toString(16).padStart(6, '0')}`;
const rgbOf = (text) => parseInt(text.slice(1), 16);

/** A sentence at the top, read out by screen readers; gone after a while. */
export function say(sentence) {
  const box = $('message');
  box.textContent = sentence;
  box.classList.add('shown');
  clearTimeout(say.timer);
  say.timer = setTimeout(() => box.classList.remove('shown'), MESSAGE_TIME);
}

/** Instead of the page: what keeps it from working at all. */
export function sayFatal(sentence) {
  $('fatal').textContent = sentence;
  $('fatal').hidden = false;
}

export class Tools {
  #settings;
  #limits;
  #actions;
  #changed;

  /**
   * `settings` is changed in place, then `changed` called; `limits(look)` gives the pen's own sizes;
   * `preview(canvas)` draws the sample stroke; `actions` has a function for every command.
   */
  constructor({settings, limits, preview, actions, changed}) {
    [this.#settings, this.#limits, this.#actions] = [settings, limits, actions];
    this.#changed = () => {
      changed();
      this.show();
    };
    this.preview = preview;
    this.#build();
    $('pen').onclick = () => this.choosePen();
    $('eraser').onclick = () => this.chooseEraser();
    $('undo').onclick = actions.undo;
    $('redo').onclick = actions.redo;
    $('zoom').onclick = actions.natural;
    $('menu').onclick = () => this.toggle('menu-panel');
    $('menu-panel').onclick = (event) => {
      const item = event.target.closest('[data-do]');
      if (!item) return;
      this.close();
      actions[item.dataset.do]();
    };
    for (const button of document.querySelectorAll('[data-key]')) {
      button.title = `${button.getAttribute('aria-label')} (${button.dataset.key})`;
    }
    addEventListener('keydown', (event) => this.#key(event));
    this.show();
  }

  #build() {
    const choice = (group, name, value, label, content) => {
      const one = document.createElement('label');
      one.title = label;
      one.innerHTML = `<input type="radio" name="${name}" value="${value}" aria-label="${label}">${content}`;
      group.append(one);
    };
    const looks = $('looks').appendChild(document.createElement('div'));
    for (let look = 1; look <= LOOKS; ++look) choice(looks, 'look', look, `Look ${look}`, look);
    looks.onchange = (event) => this.#set({look: Number(event.target.value)});
    const colors = $('colors').appendChild(document.createElement('div'));
    for (const [name, rgb] of COLORS) choice(colors, 'color', rgb, name, `<span style="background:${hex(rgb)}"></span>`);
    const any = Object.assign(document.createElement('input'), {type: 'color', id: 'any-color', title: 'Another colour'});
    any.setAttribute('aria-label', 'Another colour');
    colors.append(any);
    colors.onchange = (event) => {
      const {type, value} = event.target;
      this.#set({color: type === 'color' ? rgbOf(value) : Number(value)});
    };
    $('size').oninput = () => this.#set({size: Number($('size').value)});
    $('opacity').oninput = () => this.#set({opacity: Number($('opacity').value)});
    for (const name of ['smooth', 'finger']) $(name).onchange = () => this.#set({[name]: $(name).checked});
    const outline = (change) => this.#set({outline: {...this.#settings.outline, ...change}});
    $('outline').onchange = () => outline({on: $('outline').checked});
    $('outline-size').oninput = () => outline({size: Number($('outline-size').value)});
    $('outline-color').oninput = () => outline({color: rgbOf($('outline-color').value)});
  }
  #set(change) {
    Object.assign(this.#settings, change);
    this.#changed();
  }

  /** Brings what is shown in line with the settings. */
  show() {
    const {look, size, color, opacity, smooth, outline, finger, tool} = this.#settings;
    const {minSize, maxSize} = this.#limits(look);
    $('pen').setAttribute('aria-pressed', tool === 'pen');
    $('eraser').setAttribute('aria-pressed', tool === 'eraser');
    $('paper').classList.toggle('erasing', tool === 'eraser');
    $('dot').style.background = hex(color);
    for (const input of $('looks').querySelectorAll('input')) input.checked = Number(input.value) === look;
    for (const input of $('colors').querySelectorAll('[type="radio"]')) input.checked = Number(input.value) === color;
    $('any-color').value = hex(color);
    Object.assign($('size'), {min: minSize, max: maxSize, value: size});
    $('size-value').textContent = size.toFixed(1);
    $('opacity').value = opacity;
    $('opacity-value').textContent = `${Math.round(opacity * 100)}%`;
    $('smooth').checked = smooth;
    $('finger').checked = finger;
    $('outline').checked = outline.on;
    $('outline-more').hidden = !outline.on;
    $('outline-size').value = outline.size;
    $('outline-value').textContent = outline.size.toFixed(1);
    $('outline-color').value = hex(outline.color);
    if (!$('pen-panel').hidden) this.preview($('sample'));
  }
  showHistory(canUndo, canRedo) {
    $('undo').disabled = !canUndo;
    $('redo').disabled = !canRedo;
  }
  showZoom(zoom) { $('zoom').textContent = `${zoom < 0.1 ? (zoom * 100).toFixed(1) : Math.round(zoom * 100)}%`; }

  choosePen() {
    if (this.#settings.tool === 'pen') return this.toggle('pen-panel');
    this.#set({tool: 'pen'});
  }
  chooseEraser() {
    this.close();
    this.#set({tool: this.#settings.tool === 'eraser' ? 'pen' : 'eraser'});
  }

  toggle(id) {
    const opens = $(id).hidden;
    this.close();
    if (!opens) return;
    $(id).hidden = false;
    if (id === 'menu-panel') {
      $('menu').setAttribute('aria-expanded', 'true');
      $(id).querySelector('button').focus({focusVisible: false});
    } else {
      this.preview($('sample'));
    }
  }
  /** True when something was open. */
  close() {
    const open = document.querySelector('.panel:not([hidden])');
    if (!open) return false;
    const inside = open.contains(document.activeElement);
    open.hidden = true;
    $('menu').setAttribute('aria-expanded', 'false');
    if (inside) $(open.id === 'menu-panel' ? 'menu' : 'pen').focus({preventScroll: true});
    return true;
  }

  #key(event) {
    if (event.defaultPrevented || event.altKey || $('help').open) return;
    const target = event.target, ctrl = event.ctrlKey || event.metaKey;
    const {key} = event;
    if (key === 'Escape') return void (this.close() || this.#actions.stop());
    if (!$('menu-panel').hidden && (key === 'ArrowDown' || key === 'ArrowUp')) {
      const items = [...$('menu-panel').querySelectorAll('button')];
      const next = items.indexOf(document.activeElement) + (key === 'ArrowDown' ? 1 : -1);
      items.at(next % items.length).focus();
      return event.preventDefault();
    }
    if (target.matches?.('input') && !ctrl && !/^[a-z?]$/i.test(key)) return;  // its own keys
    const {size, look} = this.#settings, {minSize, maxSize} = this.#limits(look);
    const thicker = (factor) => this.#set({size: Math.min(Math.max(size * factor, minSize), maxSize)});
    const a = this.#actions;
    const call = ctrl ? {
      z: event.shiftKey ? a.redo : a.undo, Z: a.redo, y: a.redo, o: a.open, s: event.shiftKey ? a.saveInk : a.savePicture,
      S: a.saveInk, c: String(getSelection()) === '' ? a.copy : null, Delete: a.clear, Backspace: a.clear,
    }[key] : {
      p: () => this.choosePen(), e: () => this.chooseEraser(), m: () => this.toggle('menu-panel'), f: a.fit, r: a.replay,
      i: a.meter, '?': a.help, '+': a.zoomIn, '=': a.zoomIn, '-': a.zoomOut, 0: a.natural, '[': () => thicker(1 / 1.15),
      ']': () => thicker(1.15), ArrowLeft: () => a.move(1, 0), ArrowRight: () => a.move(-1, 0),
      ArrowUp: () => a.move(0, 1), ArrowDown: () => a.move(0, -1),
    }[key.length === 1 ? key.toLowerCase() : key] ?? (/^[1-8]$/.test(key) ? () => this.#set({look: Number(key)}) : null);
    if (!call) return;
    event.preventDefault();
    call();
  }
}
