// Ink and pictures on their way in and out.

import assert from 'node:assert/strict';
import {readFileSync, writeFileSync} from 'node:fs';
import {join} from 'node:path';
import {after, before, describe, test} from 'node:test';
import {deflateSync, inflateSync} from 'node:zlib';
import {crc32, inkOfPng, writePng} from '../../apps/page/site/png.js';
import {launch, messages, openFor, paper, strokes, wave} from './browser.mjs';
import {scratch, sketch} from './engine-page.mjs';

const INK = '<ink xmlns="http://www.w3.org/2003/InkML"><trace>10 10, 200 40, 400 300</trace></ink>';
const bytesOf = async (blob) => new Uint8Array(await blob.arrayBuffer());
const picture = (width, height, alpha = 255) => ({
  width, height, data: Uint8ClampedArray.from({length: width * height * 4}, (_, i) => (i % 4 === 3 ? alpha : (i * 37) % 251)),
});
const chunk = (type, data, length = data.length) => {
  const head = Buffer.alloc(8), tail = Buffer.alloc(4), body = Buffer.concat([Buffer.from(type, 'latin1'), data]);
  head.writeUInt32BE(length);
  body.copy(head, 4, 0, 4);
  tail.writeUInt32BE(crc32(body));
  return Buffer.concat([head.subarray(0, 4), body, tail]);
};
const signature = Buffer.from('89504e470d0a1a0a', 'hex');
const png = (...chunks) => Buffer.concat([signature, chunk('IHDR', Buffer.alloc(13)), ...chunks, chunk('IEND', Buffer.alloc(0))]);
const iTXt = (text, packed = 0, keyword = 'InkML') =>
  chunk('iTXt', Buffer.concat([Buffer.from(`${keyword}\0${String.fromCharCode(packed)}\0en\0Tinte\0`, 'latin1'), Buffer.from(text)]));

describe('a PNG file', () => {
  test('holds its pixels exactly, as others read them, and its ink', async () => {
    assert.equal(crc32(Buffer.from('123456789')), 0xCBF43926);
    for (const [alpha, values] of [[255, 3], [7, 4]]) {
      const source = picture(19, 150, alpha);
      const bytes = Buffer.from(await bytesOf(await writePng(source, `${INK} é 🖊`)));
      assert.equal(new TextDecoder().decode(await inkOfPng(bytes, 'x')), `${INK} é 🖊`);
      // Read by hand: chunks one after the other, rows as differences to the row above.
      const data = [];
      for (let at = 8; at < bytes.length; at += 12 + bytes.readUInt32BE(at)) {
        if (bytes.toString('latin1', at + 4, at + 8) === 'IDAT') data.push(bytes.subarray(at + 8, at + 8 + bytes.readUInt32BE(at)));
      }
      const rows = inflateSync(Buffer.concat(data));
      assert.equal(rows.length, 150 * (19 * values + 1));
      for (let y = 0; y < 150; ++y) {
        for (let i = 0; i < 19 * values; ++i) {
          const at = y * (19 * values + 1) + 1 + i;
          if (y > 0) rows[at] = (rows[at] + rows[at - 19 * values - 1]) & 255;
          assert.equal(rows[at], source.data[(y * 19 + Math.floor(i / values)) * 4 + (i % values)]);
        }
      }
    }
  });

  test('that was cut or changed anywhere is answered with one sentence', async () => {
    const bytes = await bytesOf(await writePng(picture(3, 3), INK.repeat(3)));
    const refused = async (hostile) => {
      await assert.rejects(inkOfPng(hostile, 'sketch.png'), /^Error: sketch\.png: [a-z][^\n]{5,100}$/);
    };
    for (let length = 0; length < bytes.length; ++length) await refused(bytes.subarray(0, length));
    for (let at = 0; at < bytes.length; ++at) {
      const changed = bytes.slice();
      changed[at] ^= 1 << (at % 8);
      await refused(changed);
    }
  });

  test('whose ink lies is refused, saying how', async () => {
    const bomb = Buffer.concat([Buffer.from('InkML\0\x01\0\0\0'), deflateSync(Buffer.alloc(130 << 20, ' '))]);
    for (const [file, sentence] of [
      [png(), 'carries no ink'],
      [png(iTXt(INK, 0, 'inkml')), 'carries no ink'],
      [png(iTXt(INK), iTXt(INK)), 'carries ink twice'],
      [png(chunk('tEXt', Buffer.from(`InkML\0${INK}`))), 'not in an iTXt chunk'],
      [png(iTXt(INK, 1)), 'is damaged'],
      [png(iTXt(INK, 2)), 'is damaged'],
      [png(chunk('iTXt', Buffer.from('InkML\0\0\0'))), 'is damaged'],
      [png(iTXt(Buffer.from([0x3C, 0xFF, 0xFE]))), 'is not UTF-8'],
      [png(chunk('iTXt', bomb)), 'is too large'],
      [Buffer.concat([signature, chunk('IHDR', Buffer.alloc(13), 0xFFFFFFF0)]), 'was cut short'],
      [Buffer.from('GIF89a'), 'not a PNG picture'],
    ]) await assert.rejects(inkOfPng(file, 'x.png'), (error) => error.message.startsWith('x.png: ') && error.message.includes(sentence));
  });
});

describe('the page', () => {
  let browser;
  before(async () => { browser = await launch('llvmpipe'); });
  after(() => browser.close());
  const opened = (t, options) => openFor(t, browser, options);
  /** Drops or pastes files, each [name, type, bytes], or text. */
  const hand = (page, type, what) => page.evaluate(([kind, given]) => {
    const transfer = new DataTransfer();
    if (typeof given === 'string') transfer.setData('text/plain', given);
    else for (const [name, mime, bytes] of given) transfer.items.add(new File([new Uint8Array(bytes)], name, {type: mime}));
    const Kind = kind === 'drop' ? DragEvent : ClipboardEvent;
    document.body.dispatchEvent(new Kind(kind, {bubbles: true, cancelable: true, dataTransfer: transfer, clipboardData: transfer}));
  }, [type, what]);
  const ink = (text, name = 'a.inkml') => [[name, '', [...Buffer.from(text)]]];
  const told = async (page, text) => page.getByText(text).first().waitFor({timeout: 10_000});
  const saved = async (page, label) => {
    await page.keyboard.press('o');
    const download = page.waitForEvent('download');
    await page.getByRole('button', {name: label}).click();
    const file = await download;
    return {name: file.suggestedFilename(), bytes: readFileSync(await file.path())};
  };
  const records = (page) => page.evaluate(() => window.qeltPage.engine.strokes().map((id) => [...window.qeltPage.engine.record(id)].join()));

  test('opens ink by dialog, drop and paste, each as one step, and shows where it lies', async (t) => {
    const page = await opened(t);
    page.on('filechooser', (chooser) => chooser.setFiles({name: 'one.inkml', mimeType: '', buffer: Buffer.from(INK)}));
    await page.waitForTimeout(200);  // so that the browser asks us rather than a person
    await page.keyboard.press('Control+o');
    await told(page, 'one.inkml: 1 stroke opened.');
    await hand(page, 'drop', ink(INK.replace('</ink>', '<trace>9000 9000, 9100 9100</trace></ink>'), 'far.inkml'));
    await told(page, 'far.inkml: 2 strokes opened.');
    assert.ok(await page.evaluate(() => window.qeltPage.view.shows(window.qeltPage.engine.bounds())));
    await hand(page, 'paste', INK);
    await told(page, 'pasted text: 1 stroke opened.');
    assert.equal(await strokes(page), 4);
    for (const left of [3, 1, 0]) {
      await page.keyboard.press('Control+z');
      assert.equal(await strokes(page), left);
    }
  });

  test('tells what is wrong with a file, and changes nothing', async (t) => {
    const page = await opened(t);
    await page.hand.stroke(wave(100, 300, 200));
    const kept = await paper(page);
    for (const [what, message] of [
      [ink('<ink>\n<trace>1 2, 3 x</trace></ink>', 'bad.inkml'), /^bad\.inkml:2: .*x/],
      [ink('<ink><trace>1 2'), /^a\.inkml:1: /],
      [ink(''), /^a\.inkml/],
      [ink('<ink>' + '<traceGroup>'.repeat(5000)), /^a\.inkml:1: /],
      [[['start.png', '', [...signature]]], /^start\.png: the picture was cut short\.$/],
      [[['cut.png', 'image/png', [...png(iTXt(INK)).subarray(0, 90)]]], /^cut\.png: the picture was cut short\.$/],
      [[['lies.png', 'image/png', [...png(iTXt('<ink>\n<trace>?</trace></ink>'))]]], /^lies\.png:2: /],
      ['no ink at all', /^pasted text:1: /],
    ]) {
      await hand(page, 'paste', what);
      await page.waitForFunction(() => document.querySelector('#messages .bad'));
      assert.match((await messages(page)).at(-1), message);
      for (const close of await page.getByRole('button', {name: 'Close message'}).all()) await close.click();
    }
    assert.equal(await strokes(page), 1);
    assert.deepEqual(await paper(page), kept);
    assert.deepEqual(page.errors, []);
  });

  /** Whether two PNG files hold the same pixels. */
  const alike = (page, ...pictures) => page.evaluate(async (all) => {
    const [one, other] = await Promise.all(all.map(async (base64) => {
      const image = await createImageBitmap(new Blob([Uint8Array.from(atob(base64), (letter) => letter.charCodeAt(0))]));
      const paint = new OffscreenCanvas(image.width, image.height).getContext('2d');
      paint.drawImage(image, 0, 0);
      return [image.width, image.height, ...paint.getImageData(0, 0, image.width, image.height).data];
    }));
    return one.length > 100 && one.length === other.length && one.every((value, i) => value === other[i]);
  }, pictures.map((bytes) => Buffer.from(bytes).toString('base64')));

  test('saves ink and pictures that open again as the same strokes, and that qelt-sketch draws alike', async (t) => {
    const page = await opened(t);
    for (let look = 1; look <= 8; ++look) {
      await page.keyboard.press(String(look));
      await page.evaluate((even) => window.qeltPage.settings.set({outline: even, outlineSize: 3.5, smooth: !even, opacity: even ? 60 : 100, paper: '#fbf5e6'}), look % 2 === 0);
      await page.hand.stroke(wave(100 + 20 * look, 60 * look, 300, 24, (share) => ({tiltX: Math.round(60 * share)})), look === 3 ? 'mouse' : 'pen');
    }
    const was = await records(page);
    const inkml = await saved(page, /^Save ink/), image = await saved(page, /^Save picture/);
    assert.match(inkml.name, /^pencil-\d{4}-\d\d-\d\d-\d{4}\.inkml$/);
    const carried = new TextDecoder().decode(await inkOfPng(image.bytes, image.name));
    assert.equal(carried, `${inkml.bytes}<?qelt-sketch --mode stroke --zoom 2 --background #FBF5E6?>\n`);
    const folder = scratch(), [from, to] = ['saved.png', 'drawn.png'].map((name) => join(folder, name));
    writeFileSync(from, image.bytes);
    sketch('draw', from, '-o', to);
    assert.ok(await alike(page, image.bytes, readFileSync(to)));
    for (const {name, bytes} of [inkml, image, {name: 'drawn.png', bytes: readFileSync(to)}]) {
      await page.keyboard.press('Control+Backspace');
      await hand(page, 'drop', [[name, '', [...bytes]]]);
      await told(page, `${name}: 8 strokes opened.`);
      assert.deepEqual(await records(page), was);
    }
  });

  test('copies a picture whose ink is there when it is pasted', async (t) => {
    const page = await opened(t, {permissions: ['clipboard-read', 'clipboard-write']});
    await page.hand.stroke(wave(100, 100, 300));
    const was = await records(page);
    await page.keyboard.press('Control+c');
    await told(page, 'The picture is on the clipboard.');
    await page.keyboard.press('Control+Backspace');
    await page.keyboard.press('o');
    await page.getByRole('button', {name: /^Paste/}).click();
    await told(page, 'clipboard: 1 stroke opened.');
    assert.deepEqual(await records(page), was);
    await page.keyboard.press('Control+v');
    await page.waitForFunction(() => window.qeltPage.engine.strokes().length === 2);
    assert.deepEqual(page.errors, []);
  });
});
