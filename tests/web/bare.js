// Goes behind engine.js into the page that tests the engine alone. What a test calls hangs on `window`.

const canvas = document.getElementById('ink');

async function open() {
  window.engine = await openEngine(canvas);
  canvas.addEventListener('webglcontextlost', (event) => {
    event.preventDefault();
    engine.contextLost();
  });
  canvas.addEventListener('webglcontextrestored', () => engine.contextRestored());
}

window.nextFrame = () => new Promise((resolve) => requestAnimationFrame(resolve));

/** Until the page is redrawn. */
window.settle = async () => {
  const stop = performance.now() + 60_000;
  while (engine.work(8)) {
    if (performance.now() > stop) throw new Error('The page was not redrawn within a minute.');
    await new Promise((resolve) => setTimeout(resolve));
  }
};

/** What the canvas shows. */
window.shown = async () => {
  await settle();
  engine.present();
  const copy = new OffscreenCanvas(canvas.width, canvas.height).getContext('2d', {willReadFrequently: true});
  copy.drawImage(canvas, 0, 0);
  return copy.getImageData(0, 0, canvas.width, canvas.height);
};

window.compare = (one, other) => {
  if (one.width !== other.width || one.height !== other.height) {
    throw new Error(`${one.width} x ${one.height} pixels against ${other.width} x ${other.height}`);
  }
  // Sums over the bytes: `darkness` of the ink, `lighter` what the first picture has less of it, `apart` what has
  // another place.
  const result = {bytes: one.data.length, differing: 0, most: 0, inked: 0, darkness: 0, lighter: 0, apart: 0};
  for (let i = 0; i < one.data.length; ++i) {
    const apart = Math.abs(one.data[i] - other.data[i]);
    if (apart) ++result.differing;
    result.most = Math.max(result.most, apart);
    result.apart += apart;
    if (one.data[i] !== 255) ++result.inked;
    result.darkness += 255 - other.data[i];
    result.lighter += one.data[i] - other.data[i];
  }
  return result;
};

window.differing = (one, other) => compare(one, other).differing;

/** The browser takes the context away, and gives it back. */
window.loseContext = async () => {
  const handle = canvas.getContext('webgl2').getExtension('WEBGL_lose_context');
  const event = (name) => new Promise((resolve) => canvas.addEventListener(name, resolve, {once: true}));
  const lost = event('webglcontextlost');
  handle.loseContext();
  await lost;
  return async () => {
    const restored = event('webglcontextrestored');
    // One in the same turn as the loss would come too early.
    setTimeout(() => handle.restoreContext());
    await restored;
  };
};

/** Pixels of an opaque PNG in base64. */
window.decode = async (base64) => {
  const bytes = Uint8Array.from(atob(base64), (letter) => letter.charCodeAt(0));
  const bitmap = await createImageBitmap(new Blob([bytes], {type: 'image/png'}), {colorSpaceConversion: 'none'});
  const copy = new OffscreenCanvas(bitmap.width, bitmap.height).getContext('2d');
  copy.drawImage(bitmap, 0, 0);
  return copy.getImageData(0, 0, bitmap.width, bitmap.height);
};

window.style = (changes = {}) => ({
  look: 8, size: 4, color: 0xFF202020, smooth: true, outline: null, tool: 'pen', ...changes,
});

/** Sample number `i` of a wavy line from (x, y); tilted and turning when asked. */
window.wave = (x, y, i, tilted = false) => [
  x + 5 * i, y + 30 * Math.sin(i / 6), 0.2 + 0.6 * Math.abs(Math.sin(i / 9)), tilted ? 0.3 + i / 100 : 0,
  tilted ? i / 20 - 1 : 0, 1000 + 4 * i,
];

/** Draws it, with moves of four samples. */
window.drawWave = (x, y, {samples = 41, tilted = false, ...changes} = {}) => {
  engine.begin(style(changes), wave(x, y, 0, tilted));
  for (let i = 1; i < samples; i += 4) {
    const rows = [];
    for (let k = i; k < Math.min(i + 4, samples); ++k) rows.push(...wave(x, y, k, tilted));
    engine.move(rows);
  }
  return engine.end(wave(x, y, samples - 1, tilted));
};
