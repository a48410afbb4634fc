// The page as a whole: tools, keyboard, replay, lost contexts, sizes of windows.

import assert from 'node:assert/strict';
import {after, before, describe, test} from 'node:test';
import {launch, openFor, outFolder, pageUrl, paper, RENDERERS, settled, strokes, wave} from './browser.mjs';
import {timeline} from '../../apps/page/site/replay.js';

for (const renderer of Object.keys(RENDERERS)) {
  describe(`on ${renderer}`, () => {
    let browser;
    before(async () => { browser = await launch(renderer); });
    after(() => browser.close());
    const opened = (t, options) => openFor(t, browser, options);
    const context = (page, call) => page.evaluate((what) => {
      window.lose ??= document.getElementById('paper').getContext('webgl2').getExtension('WEBGL_lose_context');
      window.lose[what]();
    }, call);

    test('a lost context is given back with every pixel, and may be lost while somebody draws', async (t) => {
      const page = await opened(t);
      for (let i = 0; i < 5; ++i) await page.hand.stroke(wave(100, 100 + 60 * i, 500, 30, (share) => ({tiltY: Math.round(50 * share)})));
      await page.mouse.wheel(0, 33);
      const was = await paper(page);
      await context(page, 'loseContext');
      await page.waitForTimeout(100);
      for (const key of ['Control+z', 'Control+y', 'b', '7', '8', 'Escape', 'r', '+', '-', '0']) await page.keyboard.press(key);
      await page.evaluate(() => window.qeltPage.view.set({scale: 1, x: 0, y: -33}));
      await context(page, 'restoreContext');
      await page.waitForTimeout(200);
      assert.deepEqual(await paper(page), was);

      await page.hand.pen('mousePressed', 100, 500);
      await page.hand.pen('mouseMoved', 300, 520);
      await context(page, 'loseContext');
      await page.hand.pen('mouseMoved', 400, 480);
      await page.hand.pen('mouseReleased', 400, 480);
      await page.hand.stroke(wave(100, 450, 300));
      await context(page, 'restoreContext');
      await page.waitForTimeout(200);
      assert.equal(await strokes(page), 7);
      const both = await paper(page);
      await page.keyboard.press('Control+z');
      await page.keyboard.press('Control+z');
      assert.deepEqual(await paper(page), was);
      await page.keyboard.press('Control+y');
      await page.keyboard.press('Control+y');
      assert.deepEqual(await paper(page), both);
      assert.equal(await page.locator('#messages .bad').count(), 0);
      assert.deepEqual(page.errors, []);
    });

    test('a zoom there and back shows the same pixels, and so does a window of another size', async (t) => {
      const page = await opened(t);
      await page.hand.stroke(wave(100, 200, 500, 60));
      const was = await paper(page);
      await page.keyboard.press('+');
      await settled(page);
      assert.notDeepEqual(await paper(page), was);
      await page.hand.stroke(wave(100, 300, 500));
      await page.keyboard.press('u');
      await page.keyboard.press('0');
      await page.evaluate(() => window.qeltPage.view.set({scale: 1, x: 0, y: 0}));
      assert.deepEqual(await paper(page), was);
      await page.setViewportSize({width: 500, height: 400});
      await settled(page);
      await page.setViewportSize({width: 800, height: 600});
      await settled(page);
      assert.deepEqual(await paper(page), was);
    });

    test('a replay draws the page again, stops at a key, and leaves it as it was', async (t) => {
      const page = await opened(t);
      page.hand.pace = 0.1;
      for (const y of [100, 200]) await page.hand.stroke(wave(150, y, 300, 20));
      const was = await paper(page);
      await page.keyboard.press('r');
      await page.waitForTimeout(120);
      assert.notDeepEqual(await paper(page), was);
      await page.waitForFunction(() => !document.querySelector('[data-command=undo]').disabled, null, {timeout: 15_000});
      assert.deepEqual(await paper(page), was);
      await page.keyboard.press('r');
      await page.waitForTimeout(60);
      assert.notDeepEqual(await paper(page), was);
      await page.hand.pen('mousePressed', 400, 400);
      await page.hand.pen('mouseReleased', 400, 400);
      assert.equal(await strokes(page), 2);
      assert.deepEqual(await paper(page), was);
      await page.hand.stroke(wave(150, 300, 300));
      assert.equal(await strokes(page), 3);
      assert.deepEqual(page.errors, []);
    });
  });
}

test('a replay keeps the pace, and makes pauses short', () => {
  const rows = (...times) => Float64Array.from(times.flatMap((time) => [0, 0, 1, 0, 0, time]));
  assert.deepEqual(timeline([rows(1000, 1004, 1010), rows(1110, 1120), rows(99_000, 99_001)]), [[0, 4, 10], [110, 120], [720, 721]]);
  // A time that stands still or runs back, and strokes without times.
  assert.deepEqual(timeline([rows(5, 5, 5), rows(0, 9000, 8000, 9001)]), [[0, 8, 16], [616, 1016, 1016, 1416]]);
});

describe('tools', () => {
  let browser;
  before(async () => { browser = await launch(); });
  after(() => browser.close());
  const opened = (t, options) => openFor(t, browser, options);

  test('are all within reach of the keyboard, and have names', async (t) => {
    const page = await opened(t);
    const focused = () => page.evaluate(() => {
      const {id, dataset, ariaLabel, textContent} = document.activeElement;
      return dataset.command ?? id ?? ariaLabel ?? textContent;
    });
    const seen = [];
    for (let i = 0; i < 6; ++i) {
      await page.keyboard.press('Tab');
      seen.push(await focused());
    }
    assert.deepEqual(seen.slice(0, 5), ['paper', 'pencil', 'eraser', 'files', 'more']);
    await page.getByRole('button', {name: 'Pencil'}).focus();
    await page.keyboard.press('Enter');
    assert.equal(await focused(), 'size');
    await page.keyboard.press('ArrowRight');
    await page.getByRole('radio', {name: 'Black'}).focus();
    await page.keyboard.press('ArrowRight');
    await page.getByRole('radio', {name: 'Look 8'}).focus();
    await page.keyboard.press('ArrowLeft');
    await page.getByRole('switch', {name: 'Smooth curves'}).focus();
    await page.keyboard.press('Space');
    await page.getByRole('switch', {name: 'Outline'}).focus();
    await page.keyboard.press('Space');
    await page.getByRole('slider', {name: 'Outline size'}).focus();
    await page.keyboard.press('End');
    const style = await page.evaluate(() => window.qeltPage.settings.style('mouse'));
    assert.ok(style.size > 2.4);
    assert.deepEqual({...style, size: 0}, {look: 7, size: 0, color: 0xFF454A52, smooth: false, tool: 'mouse', outline: {size: 12, color: 0xFFFFD84D}});
    await page.keyboard.press('Escape');
    assert.equal(await focused(), 'pencil');
    const names = await page.evaluate(() => [...document.querySelectorAll('button, input, select, canvas')]
      .filter((one) => !(one.ariaLabel || one.getAttribute('aria-label') || one.labels?.length || one.textContent.trim() || one.id === 'file'))
      .map((one) => one.outerHTML));
    assert.deepEqual(names, []);
  });

  test('the sample stroke and every limit are those of the pen', async (t) => {
    const page = await opened(t);
    await page.keyboard.press('b');
    const shown = () => page.evaluate(() => document.getElementById('preview').toDataURL());
    await page.waitForFunction(() => document.getElementById('preview').width > 300);
    const thin = await shown();
    const limits = await page.evaluate(() => window.qeltPage.engine.limits(8));
    await page.getByRole('slider', {name: 'Size'}).focus();
    await page.keyboard.press('End');
    assert.equal(await page.evaluate(() => window.qeltPage.settings.get('size')), limits.maxSize);
    await page.keyboard.press('Escape');
    for (let i = 0; i < 30; ++i) await page.keyboard.press('[');
    assert.ok(Math.abs(await page.evaluate(() => window.qeltPage.settings.get('size')) - limits.minSize) < 1e-6);
    for (let i = 0; i < 30; ++i) await page.keyboard.press(']');
    await page.keyboard.press('b');
    await page.waitForTimeout(100);
    assert.notEqual(await shown(), thin);
  });

  test('measurements are shown while somebody draws', async (t) => {
    const page = await opened(t);
    await page.keyboard.press('t');
    await page.hand.stroke(wave(100, 100, 300));
    await page.waitForFunction(() => /Event to draw, median \/ 99th\d.*Strokes1/.test(document.getElementById('meter').textContent));
    const figures = await page.$$eval('#meter dd', (all) => all.map((one) => one.textContent));
    const [median, high] = figures[0].match(/[\d.]+/g).map(Number);
    assert.ok(median > 0 && high >= median, figures[0]);
  });

  for (const [width, height] of [[320, 568], [360, 740], [740, 360], [1440, 900]]) {
    for (const colorScheme of ['light', 'dark']) {
      test(`fit a window of ${width} by ${height}, ${colorScheme}`, async (t) => {
        const deviceScaleFactor = width < 1000 ? 2 : 1;
        const page = await opened(t, {size: [width, height], colorScheme, hasTouch: width < 1000, deviceScaleFactor});
        assert.equal(await page.evaluate(() => document.getElementById('paper').width), width * deviceScaleFactor);
        for (let i = 0; i < 4; ++i) {
          await page.hand.stroke(wave(width * 0.25, 60 + height / 7 * i, width * 0.6, 30, (share) => ({tiltX: Math.round(12 * i * share)})));
        }
        const shot = (name) => page.screenshot({path: `${outFolder}/${width}-${colorScheme}-${name}.png`});
        await shot('page');
        for (const [key, panel] of [['b', 'pencil'], ['o', 'files'], ['m', 'more'], ['?', 'help']]) {
          await page.keyboard.press(key);
          await page.waitForTimeout(250);
          await shot(panel);
          const wrong = await page.evaluate((id) => {
            const tell = ({id: own, outerHTML}) => own || outerHTML.slice(0, 60);
            const inWindow = (box) => box.left >= 0 && box.top >= 0 && box.right <= innerWidth && box.bottom <= innerHeight;
            const wrong = [document.getElementById('tools'), document.getElementById(`${id}-panel`)]
              .filter((one) => !inWindow(one.getBoundingClientRect()) || one.scrollWidth > one.clientWidth).map(tell);
            for (const one of document.querySelectorAll(`#tools button, #${id}-panel :is(button, input, select, label)`)) {
              const box = (one.closest('label') ?? one).getBoundingClientRect();
              if (box.width > 0 && (box.width < 44 || box.height < 43.9)) wrong.push(`${tell(one)} ${box.width} x ${box.height}`);
            }
            return wrong;
          }, panel);
          assert.deepEqual(wrong, []);
          await page.keyboard.press('Escape');
        }
        assert.deepEqual(page.errors, []);
      });
    }
  }
});

test('a browser without WebGL 2 gets one clear sentence', async (t) => {
  const browser = await launch('swiftshader', ['--disable-3d-apis']);
  t.after(() => browser.close());
  const page = await browser.newPage();
  await page.goto(pageUrl);
  await page.waitForSelector('#sorry');
  assert.equal((await page.textContent('body')).trim(), 'This browser cannot draw here: it offers no WebGL 2.');
});
