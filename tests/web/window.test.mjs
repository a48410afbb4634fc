// The page in windows of all kinds: what it shows, whatever happens to the window, and pictures of it to look at.

import assert from 'node:assert/strict';
import {execFileSync} from 'node:child_process';
import {readFileSync} from 'node:fs';
import {join} from 'node:path';
import {after, before, describe, test} from 'node:test';
import {pathToFileURL} from 'node:url';
import {launch, messages, openPage, outFolder, pageFile, paper, RENDERERS, settled, strokes, wave} from './browser.mjs';
import {files, scratch} from './engine-page.mjs';

const press = async (page, ...keys) => { for (const key of keys) await page.keyboard.press(key); };
const draw = (page, y, x = 150) => page.hand.stroke(wave(x, y, 240));
const same = async (page, picture, what) => assert.ok(picture.equals(await paper(page)), what);

for (const renderer of Object.keys(RENDERERS)) {
  describe(`on ${renderer}`, () => {
    let browser;
    before(async () => { browser = await launch(renderer); });
    after(() => browser.close());
    const opened = async (t, options) => {
      const page = await openPage(browser, options);
      t.after(async () => {
        assert.deepEqual(page.errors, []);
        await page.context().close();
      });
      return page;
    };

    test('a lost context comes back by itself, with what was drawn meanwhile', async (t) => {
      const page = await opened(t);
      const lose = () => page.evaluate(() => new Promise((resolve) => {
        const canvas = document.getElementById('paper');
        window.handle ??= canvas.getContext('webgl2').getExtension('WEBGL_lose_context');
        canvas.addEventListener('webglcontextlost', () => setTimeout(resolve), {once: true});
        window.handle.loseContext();
      }));
      const restore = async () => {
        await page.evaluate(() => new Promise((resolve) => {
          document.getElementById('paper').addEventListener('webglcontextrestored', () => setTimeout(resolve), {once: true});
          window.handle.restoreContext();
        }));
        await settled(page);
      };
      await draw(page, 100);
      await press(page, '2');
      await draw(page, 130);
      const two = await paper(page);
      await lose();
      await restore();
      await same(page, two, 'after the loss');

      await page.hand.pen('mousePressed', 80, 300);
      await page.hand.pen('mouseMoved', 200, 320);
      await lose();
      await page.hand.pen('mouseMoved', 300, 280);
      await page.hand.pen('mouseReleased', 300, 280);
      await draw(page, 400);
      await press(page, 'Control+z', '+', 'm', 'Escape');
      await restore();
      assert.equal(await strokes(page), 3);
      await press(page, '0');
      const three = await paper(page);
      assert.ok(!three.equals(two));
      await press(page, 'Control+z');
      await same(page, two, 'undone after the loss');
      await press(page, 'Control+y');
      await same(page, three, 'done again');
      assert.deepEqual(await messages(page).then((all) => all.filter((text) => !/pen draws/.test(text))), []);
    });

    test('zooming, another size and a replay leave the page as it was', async (t) => {
      const page = await opened(t);
      for (const y of [100, 200, 330]) await draw(page, y);
      const all = await paper(page);
      await press(page, '+', '+', 'ArrowLeft');
      assert.ok(!all.equals(await paper(page)), 'zoomed in');
      await press(page, 'ArrowRight', '-', '-');
      await same(page, all, 'zoomed and back');
      await page.setViewportSize({width: 500, height: 900});
      await paper(page);
      await page.setViewportSize({width: 800, height: 600});
      await same(page, all, 'another size and back');
      await press(page, 'r');
      const during = await page.screenshot();
      await page.waitForTimeout(150);
      await press(page, 'x');
      await same(page, all, 'replayed');
      assert.ok(!all.equals(during), 'the replay begins with an empty page');
      assert.equal(await strokes(page), 3);
      await draw(page, 450);
      assert.equal(await strokes(page), 4);
    });

    test('a saved picture is what qelt-sketch draws from it', async (t) => {
      const page = await opened(t);
      for (let look = 1; look <= 8; ++look) {
        await press(page, String(look));
        await draw(page, 60 * look, look % 2 ? 150 : 450);
      }
      assert.equal(await strokes(page), 8);
      const [download] = await Promise.all([page.waitForEvent('download'), press(page, 'Control+Shift+S')]);
      const folder = scratch();
      const saved = join(folder, 'saved.png'), again = join(folder, 'again.png');
      await download.saveAs(saved);
      execFileSync(files.sketch, ['draw', saved, '-o', again], {env: {...process.env, EGL_PLATFORM: 'surfaceless'}, stdio: 'pipe'});
      const [differing, bytes] = await page.evaluate(async (pictures) => {
        const pixels = await Promise.all(pictures.map(async (base64) => {
          const picture = await createImageBitmap(new Blob([Uint8Array.from(atob(base64), (c) => c.charCodeAt(0))]), {colorSpaceConversion: 'none'});
          const copy = new OffscreenCanvas(picture.width, picture.height).getContext('2d');
          copy.drawImage(picture, 0, 0);
          return copy.getImageData(0, 0, picture.width, picture.height).data;
        }));
        if (pixels[0].length !== pixels[1].length) throw new Error('pictures of different sizes');
        return [pixels[0].reduce((sum, value, i) => sum + (value !== pixels[1][i]), 0), pixels[0].length];
      }, [saved, again].map((path) => readFileSync(path).toString('base64')));
      // The renderers draw the edges of stamps differently; see engine.test.mjs.
      if (renderer === 'llvmpipe') assert.equal(differing, 0);
      else assert.ok(differing < 0.15 * bytes, `${differing} of ${bytes} bytes differ`);
    });
  });
}

describe('the tools', () => {
  let browser;
  before(async () => { browser = await launch('llvmpipe'); });
  after(() => browser.close());

  const windows = {
    phone: {size: [360, 740], deviceScaleFactor: 3, hasTouch: true, isMobile: true},
    'phone-lying': {size: [740, 360], deviceScaleFactor: 2, hasTouch: true, isMobile: true},
    tablet: {size: [820, 1180], deviceScaleFactor: 2, hasTouch: true},
    desktop: {size: [1280, 800]},
  };
  for (const [name, {size, ...options}] of Object.entries(windows)) {
    test(`fit a ${name}, light and dark`, async () => {
      for (const colorScheme of ['light', 'dark']) {
        const page = await openPage(browser, {size, colorScheme, ...options});
        const [width, height] = size;
        for (let look = 8; look > 4; --look) {
          await press(page, String(look));
          await page.hand.stroke(wave(0.1 * width, 0.15 * height * (9 - look), 0.7 * width));
        }
        await settled(page);
        await page.waitForTimeout(300);
        await page.screenshot({path: join(outFolder, `${name}-${colorScheme}.png`)});
        for (const [key, panel] of [['b', 'pencil'], ['o', 'files'], ['m', 'more'], ['?', 'help']]) {
          await press(page, key);
          await page.waitForTimeout(250);
          await page.screenshot({path: join(outFolder, `${name}-${colorScheme}-${panel}.png`)});
          const wrong = await page.evaluate((panel) => {
            const box = document.getElementById(`${panel}-panel`);
            const wrong = box.hidden ? ['the panel is closed'] : [];
            const inWindow = (element) => {
              const {left, top, right, bottom} = element.getBoundingClientRect();
              return left >= -0.5 && top >= -0.5 && right <= innerWidth + 0.5 && bottom <= innerHeight + 0.5;
            };
            if (!inWindow(box)) wrong.push(`${panel} reaches out of the window`);
            if (box.scrollWidth > box.clientWidth + 1) wrong.push(`${panel} is wider than its box`);
            if (document.documentElement.scrollWidth > innerWidth || document.documentElement.scrollHeight > innerHeight) wrong.push('the page scrolls');
            const all = [...document.querySelectorAll(`#tools button, #${panel}-panel :is(button, input, select)`)];
            for (const control of all.filter((one) => one.checkVisibility())) {
              const called = `${control.id || control.dataset.command || control.value}`;
              const label = control.getAttribute('aria-label') || control.textContent.trim() || control.labels?.[0]?.textContent.trim() ||
                control.labels?.[0]?.getAttribute('aria-label') || control.labels?.[0]?.title;
              if (!label) wrong.push(`${called} has no label`);
              const area = (control.labels?.[0] ?? control).getBoundingClientRect();
              if (Math.min(area.width, area.height) < 24) wrong.push(`${called} is ${area.width} x ${area.height} pixels`);
              if (control.closest('#tools') && !inWindow(control)) wrong.push(`${called} is out of the window`);
              control.focus();
              if (document.activeElement !== control && !control.disabled) wrong.push(`${called} takes no focus`);
            }
            return wrong;
          }, panel);
          assert.deepEqual(wrong, [], `${name} ${colorScheme} ${panel}`);
          await press(page, 'Escape');
        }
        assert.deepEqual(page.errors, []);
        await page.context().close();
      }
    });
  }

  test('a browser without WebGL 2 is told in one sentence', async () => {
    const context = await browser.newContext();
    await context.addInitScript(() => {
      const real = HTMLCanvasElement.prototype.getContext;
      HTMLCanvasElement.prototype.getContext = function (kind, ...rest) { return kind === 'webgl2' ? null : real.call(this, kind, ...rest); };
    });
    const page = await context.newPage();
    await page.goto(pathToFileURL(pageFile).href);
    assert.equal(await page.getByRole('alert').textContent(), 'This browser cannot draw here: it offers no WebGL 2.');
    assert.equal((await page.evaluate(() => document.body.innerText)).trim(), 'This browser cannot draw here: it offers no WebGL 2.');
    await context.close();
  });
});
