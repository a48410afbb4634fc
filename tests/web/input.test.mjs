// What pens, fingers and mice do on the page.

import assert from 'node:assert/strict';
import {after, before, describe, test} from 'node:test';
import {launch, openFor, paper, RENDERERS, settled, strokes, wave} from './browser.mjs';

const samples = (page, index = -1) => page.evaluate((at) => {
  const {engine} = window.qeltPage;
  const flat = [...engine.samples(engine.strokes().at(at))];
  return Array.from({length: flat.length / 6}, (_, i) => flat.slice(6 * i, 6 * i + 6));
}, index);
const view = (page) => page.evaluate(() => ({scale: window.qeltPage.view.scale, x: window.qeltPage.view.x, y: window.qeltPage.view.y}));
const near = (actual, expected, within = 1e-4) => assert.ok(Math.abs(actual - expected) <= within, `${actual} is not ${expected}`);
/** Any pointer event, as a script makes it: what the DevTools protocol does not. */
const event = (page, type, values) => page.evaluate(([kind, given]) => {
  const odd = Object.entries(given).filter(([name, value]) => value === 'NaN' || name === 'timeStamp');
  const init = Object.fromEntries(Object.entries(given).filter(([, value]) => value !== 'NaN'));
  const made = new PointerEvent(kind, {pointerId: 77, pointerType: 'pen', bubbles: true, cancelable: true, pressure: 0.5, buttons: 1, ...init});
  for (const [name, value] of odd) Object.defineProperty(made, name, {value: Number(value)});
  document.getElementById('paper').dispatchEvent(made);
}, [type, values]);

for (const renderer of Object.keys(RENDERERS)) {
  describe(`on ${renderer}`, () => {
    let browser;
    before(async () => { browser = await launch(renderer); });
    after(() => browser.close());
    const opened = async (t, options) => {
      const page = await openFor(t, browser, options);
      t.after(() => assert.deepEqual(page.errors, []));
      return page;
    };

    test('a pen stroke keeps place, pressure, tilt, direction and time of every sample', async (t) => {
      const page = await opened(t);
      const tilts = [[0, 0, 0, 0], [45, 0, Math.PI / 4, Math.PI / 2], [0, 45, Math.PI / 4, Math.PI], [-30, 0, Math.PI / 6, -Math.PI / 2],
                     [0, -30, Math.PI / 6, 0]];
      await page.hand.stroke(tilts.map(([tiltX, tiltY], i) => [100.25 + 40 * i, 200.5, {tiltX, tiltY, force: 0.25 + i / 8}]));
      const rows = await samples(page);
      assert.equal(rows.length, tilts.length);
      tilts.forEach(([, , tilt, orientation], i) => {
        near(rows[i][0], 100.25 + 40 * i);
        near(rows[i][1], 200.5);
        near(rows[i][2], 0.25 + i / 8);
        near(rows[i][3], tilt);
        near(rows[i][4], orientation);
        if (i > 0) near(rows[i][5] - rows[i - 1][5], 4, 0.6);
      });
      assert.ok(Math.abs(rows[0][5] - Date.now()) < 60_000, 'times count from 1970');
    });

    test('moves that pile up while the page is blocked all arrive, in order', async (t) => {
      const page = await opened(t);
      await page.hand.pen('mousePressed', 100, 100);
      const blocked = page.evaluate(() => { for (const end = performance.now() + 300; performance.now() < end;); });
      const moves = Array.from({length: 40}, (_, i) => page.hand.pen('mouseMoved', 101 + 5 * i, 100 + (i % 7)));
      await Promise.all([...moves, blocked]);
      await page.hand.pen('mouseReleased', 296, 104);
      const rows = await samples(page);
      assert.deepEqual(rows.map(([x]) => Math.round(x)), [100, ...Array.from({length: 40}, (_, i) => 101 + 5 * i)]);
    });

    test('the first ink is on the paper with the first event', async (t) => {
      const page = await opened(t);
      // Within one task, so that no frame comes in between.
      const {before, after: then} = await page.evaluate(() => {
        const canvas = document.getElementById('paper');
        window.qeltPage.engine.present();
        const empty = canvas.toDataURL();
        canvas.dispatchEvent(new PointerEvent('pointerdown', {pointerType: 'pen', clientX: 200, clientY: 200, pressure: 0.7, buttons: 1}));
        return {before: empty, after: canvas.toDataURL()};
      });
      assert.notEqual(then, before);
    });

    test('mouse and finger draw as what they are, until a pen was seen', async (t) => {
      const page = await opened(t, {hasTouch: true});
      const tool = () => page.evaluate(() => window.qeltPage.engine.record(window.qeltPage.engine.strokes().at(-1))[9]);
      await page.hand.stroke(wave(100, 100, 200), 'mouse');
      assert.equal(await tool(), 3);
      await page.hand.touch('touchStart', [1, 100, 300]);
      await page.hand.touch('touchMove', [1, 300, 300]);
      await page.hand.touch('touchEnd');
      assert.equal(await tool(), 1);
      await page.hand.stroke(wave(100, 200, 200));
      assert.equal(await tool(), 2);
      assert.equal(await strokes(page), 3);

      // From now on a finger moves the page, and does so again and again.
      await page.hand.touch('touchStart', [1, 100, 300]);
      await page.hand.touch('touchMove', [1, 150, 320]);
      await page.hand.touch('touchEnd');
      assert.equal(await strokes(page), 3);
      assert.deepEqual(await view(page), {scale: 1, x: 50, y: 20});

      // Unless somebody wants it otherwise; the next pen does not change that.
      await page.keyboard.press('m');
      await page.getByLabel('Draw with a finger').check();
      await page.keyboard.press('Escape');
      await page.hand.stroke(wave(100, 200, 200));
      await page.hand.touch('touchStart', [1, 100, 300]);
      await page.hand.touch('touchMove', [1, 300, 340]);
      await page.hand.touch('touchEnd');
      assert.equal(await strokes(page), 5);
    });

    test('a palm neither bends nor ends the stroke of a pen, and its own dot goes', async (t) => {
      const page = await opened(t, {hasTouch: true});
      await page.hand.touch('touchStart', [1, 400, 400]);
      await page.hand.pen('mousePressed', 100, 100);
      await page.hand.touch('touchMove', [1, 420, 440]);
      await page.hand.pen('mouseMoved', 200, 120);
      await page.hand.touch('touchStart', [1, 420, 440], [2, 500, 500]);
      await page.hand.pen('mouseMoved', 300, 140);
      await page.hand.touch('touchEnd');
      await page.hand.pen('mouseReleased', 300, 140);
      assert.equal(await strokes(page), 1);
      assert.deepEqual((await samples(page)).map(([x, y]) => [x, y]), [[100, 100], [200, 120], [300, 140]]);
      assert.deepEqual(await view(page), {scale: 1, x: 0, y: 0});
    });

    test('two fingers pinch and move the page, and leave no mark', async (t) => {
      const page = await opened(t, {hasTouch: true});
      const empty = await paper(page);
      await page.hand.touch('touchStart', [1, 300, 300]);
      await page.hand.touch('touchMove', [1, 304, 300]);
      await page.hand.touch('touchStart', [1, 304, 300], [2, 404, 300]);
      for (let i = 1; i <= 10; ++i) await page.hand.touch('touchMove', [1, 304 - 5 * i, 300 + i], [2, 404 + 5 * i, 300 + i]);
      const {scale, x, y} = await view(page);
      near(scale, 2, 0.01);
      near(scale * 354 + x, 354, 0.5);  // what lay between the fingers
      near(scale * 300 + y, 310, 0.5);
      await page.hand.touch('touchEnd');
      assert.equal(await strokes(page), 0);
      assert.deepEqual(await paper(page), empty);

      // A second finger that comes late is none of the stroke's business.
      await page.hand.touch('touchStart', [1, 100, 100]);
      for (let i = 1; i < 8; ++i) await page.hand.touch('touchMove', [1, 100 + 20 * i, 100]);
      await page.hand.touch('touchStart', [1, 240, 100], [2, 500, 500]);
      await page.hand.touch('touchMove', [1, 260, 100], [2, 400, 300]);
      await page.hand.touch('touchEnd');
      assert.equal(await strokes(page), 1);
      assert.equal((await view(page)).scale, scale);
      const places = await samples(page);
      assert.ok(places.every(([, row]) => Math.abs(row - places[0][1]) < 0.01), 'the stroke stays straight');
    });

    test('cancelled strokes and lost pointers leave no mark', async (t) => {
      const page = await opened(t, {hasTouch: true});
      await page.hand.stroke(wave(100, 100, 300));
      const kept = await paper(page);
      for (const lose of ['pointercancel', 'lostpointercapture']) {
        await event(page, 'pointerdown', {clientX: 100, clientY: 300});
        await event(page, 'pointermove', {clientX: 300, clientY: 350});
        await event(page, lose, {clientX: 300, clientY: 350});
        await event(page, 'pointermove', {clientX: 400, clientY: 100});
        await event(page, 'pointerup', {clientX: 400, clientY: 100, buttons: 0});
      }
      await page.hand.pen('mousePressed', 100, 300);
      await page.hand.pen('mouseMoved', 400, 300);
      await page.keyboard.press('Escape');
      await page.hand.pen('mouseMoved', 500, 400);
      await page.hand.pen('mouseReleased', 500, 400);
      assert.equal(await strokes(page), 1);
      assert.deepEqual(await paper(page), kept);
    });

    test('events that make no sense are dropped, and a stroke that never ended ends', async (t) => {
      const page = await opened(t);
      await event(page, 'pointermove', {clientX: 50, clientY: 50});
      await event(page, 'pointerup', {clientX: 50, clientY: 50});
      await event(page, 'pointerdown', {clientX: 'NaN', clientY: 50});
      assert.equal(await strokes(page), 0);
      await event(page, 'pointerdown', {clientX: 100, clientY: 100});
      await event(page, 'pointermove', {clientX: 'NaN', clientY: 100});
      await event(page, 'pointermove', {clientX: 200, clientY: 100, pressure: 'NaN', altitudeAngle: 'NaN', tiltX: 'NaN', timeStamp: 'NaN'});
      await event(page, 'pointermove', {clientX: 220, clientY: 100, timeStamp: -5e6});
      await event(page, 'pointermove', {clientX: 1e30, clientY: 100});
      await page.evaluate(() => window.qeltPage.settings.set({penSeen: true, finger: true}));
      // The same pen comes down again, though it never went up; and again a button is up that was down.
      await event(page, 'pointerdown', {clientX: 100, clientY: 200});
      await event(page, 'pointermove', {clientX: 200, clientY: 200});
      await event(page, 'pointermove', {clientX: 210, clientY: 200, buttons: 0});
      assert.equal(await strokes(page), 2);
      const first = await samples(page, 0);
      assert.deepEqual(first.map(([x]) => x), [100, 200, 220]);
      first.flat().forEach((value) => assert.ok(Number.isFinite(value)));
      assert.ok(first[2][5] >= first[1][5], 'time does not run back');
      // A finger that held the page and was never lifted, and another that drew.
      await event(page, 'pointerdown', {pointerId: 5, pointerType: 'touch', isPrimary: true, clientX: 10, clientY: 10, button: 1});
      await event(page, 'pointerdown', {pointerId: 6, pointerType: 'touch', isPrimary: true, clientX: 10, clientY: 250});
      await event(page, 'pointermove', {pointerId: 6, pointerType: 'touch', isPrimary: true, clientX: 90, clientY: 250});
      await event(page, 'pointerdown', {pointerId: 7, pointerType: 'touch', isPrimary: true, clientX: 10, clientY: 270});
      await event(page, 'pointerup', {pointerId: 7, pointerType: 'touch', isPrimary: true, clientX: 10, clientY: 270});
      assert.equal(await strokes(page), 4);
      await page.hand.stroke(wave(100, 300, 200));
      assert.equal(await strokes(page), 5);
    });

    test("the pen's other end and the eraser remove strokes, in one step a drag", async (t) => {
      const page = await opened(t);
      const empty = await paper(page);
      for (const y of [100, 200, 300]) await page.hand.stroke([[100, y], [300, y]]);
      const all = await paper(page);
      await event(page, 'pointerdown', {clientX: 150, clientY: 60, button: 5, buttons: 32});
      await event(page, 'pointermove', {clientX: 150, clientY: 240, buttons: 32});
      await event(page, 'pointerup', {clientX: 150, clientY: 240, button: 5, buttons: 0});
      assert.equal(await strokes(page), 1);
      await page.keyboard.press('Control+z');
      assert.equal(await strokes(page), 3);
      assert.deepEqual(await paper(page), all);

      await page.keyboard.press('e');
      await page.hand.stroke([[200, 60], [200, 250], [200, 340]], 'mouse');
      assert.equal(await strokes(page), 0);
      assert.deepEqual(await paper(page), empty);
      await page.keyboard.press('b');
      await page.hand.stroke([[100, 200], [300, 200]]);
      assert.equal(await strokes(page), 1);
    });

    test('the wheel, the space bar and other buttons move the page and draw nothing', async (t) => {
      const page = await opened(t);
      await page.mouse.move(400, 300);
      await page.mouse.wheel(30, 50);
      await page.waitForFunction(() => window.qeltPage.view.y === -50);
      assert.deepEqual(await view(page), {scale: 1, x: -30, y: -50});
      await page.keyboard.down('Space');
      await page.hand.stroke([[200, 200], [260, 280]], 'mouse');
      await page.keyboard.up('Space');
      assert.deepEqual(await view(page), {scale: 1, x: 30, y: 30});
      await page.hand.mouse('mousePressed', 200, 200, {button: 'middle', buttons: 4});
      await page.hand.mouse('mouseMoved', 190, 195, {button: 'middle', buttons: 4});
      await page.hand.mouse('mouseReleased', 190, 195, {button: 'middle', buttons: 0});
      assert.deepEqual(await view(page), {scale: 1, x: 20, y: 25});
      await page.keyboard.down('Control');
      await page.mouse.wheel(0, -100);
      await page.keyboard.up('Control');
      await page.waitForFunction(() => window.qeltPage.view.scale > 1);
      for (let i = 0; i < 40; ++i) await page.keyboard.press('+');
      assert.equal((await view(page)).scale, 32);
      await settled(page);
      for (let i = 0; i < 60; ++i) await page.keyboard.press('-');
      assert.equal((await view(page)).scale, 1 / 16);
      assert.equal(await strokes(page), 0);
    });
  });
}
