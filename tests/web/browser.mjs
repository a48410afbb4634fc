// What the tests share: the packed page in headless Chromium, opened from a file as a double click would, and a hand.

import {existsSync, mkdirSync} from 'node:fs';
import {pathToFileURL} from 'node:url';
import {chromium} from 'playwright-core';
import {files, RENDERERS} from './engine-page.mjs';

export {RENDERERS};
export const outFolder = files.out;
mkdirSync(outFolder, {recursive: true});
if (!existsSync(files.page)) throw new Error(`${files.page} is not built; ./sketch web builds it.`);
export const pageUrl = pathToFileURL(files.page).href;

export const launch = (renderer = 'swiftshader', more = []) => chromium.launch({
  executablePath: process.env.QELT_CHROMIUM ?? '/usr/bin/chromium', headless: true,
  env: {...process.env, EGL_PLATFORM: 'surfaceless'}, args: [...RENDERERS[renderer], ...more],
});

/** A page of its own with nothing stored, ready to draw; what it logs as an error ends up in `errors`. */
export async function openPage(browser, {size = [800, 600], hash = '', prepare = null, context = null, ...options} = {}) {
  const [width, height] = size;
  context ??= await browser.newContext({viewport: {width, height}, ...options});
  const page = await context.newPage();
  page.errors = [];
  page.on('pageerror', (error) => page.errors.push(String(error)));
  page.on('console', (message) => message.type() === 'error' && page.errors.push(message.text().slice(0, 400)));
  if (prepare) await page.addInitScript(prepare);
  await page.goto(pageUrl + hash);
  await page.waitForSelector('html[data-ready]', {timeout: 30_000});
  page.hand = new Hand(page, await context.newCDPSession(page));
  return page;
}

/** The same for one test, after which it is closed. */
export async function openFor(t, browser, options) {
  const page = await openPage(browser, options);
  t.after(() => page.context().close());
  return page;
}

/** Dispatches trusted pointer events through the DevTools protocol, evenly apart by their own clock. */
export class Hand {
  pace = 0.004;  // seconds
  #page;
  #cdp;
  #seconds = null;

  constructor(page, cdp) {
    this.#page = page;
    this.#cdp = cdp;
  }

  async #time() {
    this.#seconds ??= await this.#page.evaluate(() => (performance.timeOrigin + performance.now()) / 1000);
    return (this.#seconds += this.pace);
  }
  async mouse(type, x, y, more = {}) {
    const isDown = type !== 'mouseReleased';
    await this.#cdp.send('Input.dispatchMouseEvent', {
      type, x, y, button: 'left', buttons: isDown ? 1 : 0, clickCount: 1, timestamp: await this.#time(), ...more,
    });
  }
  pen(type, x, y, more = {}) {
    return this.mouse(type, x, y, {pointerType: 'pen', force: type === 'mouseReleased' ? 0 : 0.6, ...more});
  }
  /** Fingers that are down, each [id, x, y]. */
  async touch(type, ...fingers) {
    await this.#cdp.send('Input.dispatchTouchEvent', {
      type, touchPoints: fingers.map(([id, x, y]) => ({id, x, y, force: 0.5})), timestamp: await this.#time(),
    });
  }
  /** A stroke through points [x, y, more]. */
  async stroke(points, kind = 'pen') {
    const [[x, y, more], ...rest] = points;
    await this[kind]('mousePressed', x, y, more);
    for (const [toX, toY, with_] of rest) await this[kind]('mouseMoved', toX, toY, with_);
    const [endX, endY] = points[points.length - 1];
    await this[kind]('mouseReleased', endX, endY);
  }
}

/** A wavy line of `count` points, pressed and leant differently along its way. */
export const wave = (x, y, width, count = 24, more = (_) => ({})) => Array.from({length: count}, (_, i) => {
  const share = i / (count - 1);
  return [x + width * share, y + 24 * Math.sin(share * 9), {force: 0.3 + 0.6 * share, ...more(share)}];
});

/** The picture of the window without tools, as PNG bytes; waits until nothing is redrawn any more. */
export async function paper(page) {
  await settled(page);
  await page.addStyleTag({content: 'body.bare > :not(main), body.bare #hint { visibility: hidden !important }'});
  await page.evaluate(() => document.body.classList.add('bare'));
  const picture = await page.screenshot();
  await page.evaluate(() => document.body.classList.remove('bare'));
  return picture;
}
export async function settled(page) {
  await page.waitForFunction(() => !window.qeltPage.engine.busy, null, {timeout: 30_000, polling: 30});
  await page.evaluate(() => new Promise((resolve) => requestAnimationFrame(() => requestAnimationFrame(resolve))));
}
/** How many strokes are shown, and how many the browser holds for this page. */
export const strokes = (page) => page.evaluate(() => window.qeltPage.engine.strokes().length);
export const stored = (page) => page.evaluate(async () => (await window.qeltPage.store.pages())
  .find(({page: number}) => number === window.qeltPage.store.page)?.count ?? 0);
export const messages = (page) => page.$$eval('#messages p span', (spans) => spans.map((span) => span.textContent));
