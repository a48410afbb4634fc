// Pictures that carry their ink: PNG files with an iTXt chunk of the keyword "InkML".

const KEYWORD = 'InkML';
const MOST_INK = 128 * 1024 * 1024;  // bytes of text, as qelt-sketch takes
const SIGNATURE = [0x89, 0x50, 0x4E, 0x47, 0x0D, 0x0A, 0x1A, 0x0A];

const TABLE = Uint32Array.from({length: 256}, (_, n) => {
  for (let bit = 0; bit < 8; ++bit) n = n & 1 ? 0xEDB88320 ^ (n >>> 1) : n >>> 1;
  return n;
});

/** @param {Uint8Array} bytes */
export function crc32(bytes) {
  let crc = ~0;
  for (let i = 0; i < bytes.length; ++i) crc = TABLE[(crc ^ bytes[i]) & 0xFF] ^ (crc >>> 8);
  return ~crc >>> 0;
}

export const isPng = (bytes) => SIGNATURE.every((byte, i) => bytes[i] === byte);

const ascii = (bytes) => String.fromCharCode(...bytes);
const bytesOf = (text) => new TextEncoder().encode(text);

/** A chunk's bytes: length, type, data, check sum. */
function chunk(type, ...parts) {
  const length = parts.reduce((sum, part) => sum + part.length, 0);
  const bytes = new Uint8Array(length + 12);
  const view = new DataView(bytes.buffer);
  view.setUint32(0, length);
  bytes.set(bytesOf(type), 4);
  let at = 8;
  for (const part of parts) {
    bytes.set(part, at);
    at += part.length;
  }
  view.setUint32(at, crc32(bytes.subarray(4, at)));
  return bytes;
}

/** Runs a stream of bytes through a transform; answers with the pieces. Stops with an error past `most` bytes. */
async function through(pieces, transform, most = Infinity) {
  const writer = transform.writable.getWriter();
  // Of an error the reader learns as well.
  const written = (async () => {
    for (const piece of pieces) await writer.write(piece);
    await writer.close();
  })().catch(() => {});
  const out = [];
  let size = 0;
  const reader = transform.readable.getReader();
  for (let step = await reader.read(); !step.done; step = await reader.read()) {
    size += step.value.length;
    if (size > most) {
      await reader.cancel().catch(() => {});
      throw new RangeError('too large');
    }
    out.push(step.value);
  }
  await written;
  return out;
}

const deflated = (pieces) => through(pieces, new CompressionStream('deflate'));

/** The rows of a picture as PNG has them: differences to the row above, without alpha where the picture is opaque. */
function* rowsOf({width, height, data}, values) {
  const high = 64;  // rows a piece
  let above = new Uint8Array(width * values), row = new Uint8Array(width * values);
  for (let top = 0; top < height; top += high) {
    const rows = Math.min(high, height - top);
    const piece = new Uint8Array(rows * (width * values + 1));
    let at = 0;
    for (let y = top; y < top + rows; ++y) {
      for (let x = 0, from = y * width * 4, to = 0; x < width; ++x, from += 4) {
        for (let value = 0; value < values; ++value) row[to++] = data[from + value];
      }
      piece[at++] = 2;  // the filter "up"
      for (let i = 0; i < row.length; ++i) piece[at++] = row[i] - above[i];
      [above, row] = [row, above];
    }
    yield piece;
  }
}

/**
 * A PNG file of straight RGBA pixels, exact to the byte, which a canvas would not keep of pixels that let the paper
 * through. The ink goes in front of the pixels.
 * @param {{width: number, height: number, data: Uint8ClampedArray}} picture
 * @param {string} ink
 */
export async function writePng(picture, ink) {
  let opaque = true;
  for (let i = 3; i < picture.data.length && opaque; i += 4) opaque = picture.data[i] === 255;
  const header = new Uint8Array(13);
  const view = new DataView(header.buffer);
  view.setUint32(0, picture.width);
  view.setUint32(4, picture.height);
  header.set([8, opaque ? 2 : 6], 8);
  const text = bytesOf(ink);
  const small = await deflated([text]);
  const isSmaller = small.reduce((sum, part) => sum + part.length, 0) < text.length;
  const parts = [
    Uint8Array.from(SIGNATURE),
    chunk('IHDR', header),
    // Keyword, compression, its method, no language, no translated keyword.
    chunk('iTXt', bytesOf(`${KEYWORD}\0${isSmaller ? '\x01' : '\0'}\0\0\0`), ...(isSmaller ? small : [text])),
  ];
  for (const piece of await deflated(rowsOf(picture, opaque ? 3 : 4))) parts.push(chunk('IDAT', piece));
  parts.push(chunk('IEND'));
  return new Blob(parts, {type: 'image/png'});
}

/** Goes through the chunks, each whole and with the check sum it says, to the last. */
function* chunksOf(bytes, refuse) {
  const view = new DataView(bytes.buffer, bytes.byteOffset, bytes.byteLength);
  for (let at = SIGNATURE.length; ;) {
    if (bytes.length - at < 12) throw refuse('the picture was cut short');
    const length = view.getUint32(at);
    if (length > bytes.length - at - 12) throw refuse('the picture was cut short');
    const type = ascii(bytes.subarray(at + 4, at + 8));
    const data = bytes.subarray(at + 8, at + 8 + length);
    if (view.getUint32(at + 8 + length) !== crc32(bytes.subarray(at + 4, at + 8 + length))) {
      throw refuse(`the picture is damaged: the check sum of a chunk ${/^[A-Za-z]{4}$/.test(type) ? `${type} ` : ''}is wrong`);
    }
    yield {type, data};
    if (type === 'IEND') return;
    at += length + 12;
  }
}

/**
 * The ink that a picture carries, as bytes of UTF-8. Throws an Error with one sentence, "name: what is wrong", of
 * files that are no sound pictures, carry no ink, or ink that cannot be believed.
 * @param {Uint8Array} bytes
 * @param {string} name
 */
export async function inkOfPng(bytes, name) {
  const refuse = (what) => new Error(`${name}: ${what}`);
  if (!isPng(bytes)) throw refuse('not a PNG picture');
  let found = null;
  for (const {type, data} of chunksOf(bytes, refuse)) {
    if (!['iTXt', 'tEXt', 'zTXt'].includes(type)) continue;
    const end = data.indexOf(0);
    if (end < 0 || end > 79 || ascii(data.subarray(0, end)) !== KEYWORD) continue;
    if (type !== 'iTXt') throw refuse("the picture's ink is not in an iTXt chunk");
    if (found) throw refuse('the picture carries ink twice');
    found = data.subarray(end + 1);
  }
  if (!found) throw refuse('the picture carries no ink');
  const [packed, method] = found;
  const language = found.indexOf(0, 2), keyword = language < 0 ? -1 : found.indexOf(0, language + 1);
  if (keyword < 0 || packed > 1 || (packed === 1 && method !== 0)) throw refuse("the picture's ink is damaged");
  let text = found.subarray(keyword + 1);
  if (packed === 1) {
    try {
      text = new Uint8Array(await new Blob(await through([text], new DecompressionStream('deflate'), MOST_INK)).arrayBuffer());
    } catch (error) {
      throw refuse(`the picture's ink is ${error instanceof RangeError ? 'too large' : 'damaged'}`);
    }
  }
  if (text.length > MOST_INK) throw refuse("the picture's ink is too large");
  try {
    new TextDecoder('utf-8', {fatal: true}).decode(text);
  } catch {
    throw refuse("the picture's ink is not UTF-8");
  }
  return text;
}
