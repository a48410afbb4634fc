// What is kept, whatever happens to the tab or to the storage.

import assert from 'node:assert/strict';
import {after, before, describe, test} from 'node:test';
import {launch, messages, openFor, openPage, paper, settled, stored, strokes, wave} from './browser.mjs';
import {openBrowser, processesOf, scratch} from './engine-page.mjs';

let browser;
before(async () => { browser = await launch(); });
after(() => browser.close());

const another = (page, options = {}) => openPage(browser, {context: page.context(), ...options});
const draw = (page, y, kind = 'pen') => page.hand.stroke(wave(150, y, 300), kind);
const opened = (t, options) => openFor(t, browser, options);
const reload = async (page) => {
  await page.reload();
  await page.waitForSelector('html[data-ready]');
  await settled(page);
};

describe('a page', () => {
  test('comes back as it was after a reload: strokes, their order and looks, view, settings', async (t) => {
    const page = await opened(t);
    await page.keyboard.press('3');
    await draw(page, 100);
    await page.keyboard.press('8');
    await page.keyboard.press(']');
    await draw(page, 110);
    await draw(page, 300);
    await page.keyboard.press('Control+z');
    await page.keyboard.press('e');
    await page.hand.stroke([[300, 60], [300, 180]]);
    await page.keyboard.press('Control+z');
    await page.keyboard.press('b');
    await page.mouse.move(300, 300);
    await page.mouse.wheel(0, 40);
    await page.waitForTimeout(600);
    const before = await paper(page), records = (one) => one.evaluate(() => {
      const {engine} = window.qeltPage;
      return engine.strokes().map((id) => [...engine.record(id)].join());
    });
    const was = await records(page);
    assert.equal(was.length, 2);
    const size = await page.evaluate(() => window.qeltPage.settings.get('size'));
    await reload(page);
    assert.deepEqual(await records(page), was);
    assert.deepEqual(await paper(page), before);
    assert.equal(await page.evaluate(() => window.qeltPage.settings.get('size')), size);
    assert.deepEqual(page.errors, []);
  });

  test('loses at most the stroke under the pen when its tab is killed', async (t) => {
    const page = await opened(t);
    for (const y of [100, 200, 300]) await draw(page, y);
    await page.hand.pen('mousePressed', 100, 400);
    await page.hand.pen('mouseMoved', 300, 400);
    const killed = page.waitForEvent('crash');
    (await page.context().newCDPSession(page)).send('Page.crash').catch(() => {});
    await killed;
    const next = await another(page);
    assert.equal(await strokes(next), 3);
    assert.deepEqual(await messages(next), []);
  });

  test('loses at most the stroke under the pen when the whole browser is killed', async (t) => {
    const profile = scratch();
    const open = async () => openPage(null, {context: await openBrowser('swiftshader', {profile})});
    const page = await open();
    for (const y of [100, 200, 300]) await draw(page, y);
    assert.equal(await stored(page), 3);
    await page.hand.pen('mousePressed', 100, 400);
    await page.hand.pen('mouseMoved', 300, 400);
    const closed = page.context().waitForEvent('close');
    for (const {pid} of processesOf(profile)) process.kill(pid, 'SIGKILL');
    await closed;
    const next = await open();
    t.after(() => next.context().close());
    assert.equal(await strokes(next), 3);
    assert.deepEqual(await messages(next), []);
  });

  test('keeps undo, redo, erasing and clearing too', async (t) => {
    const page = await opened(t);
    const both = async (count) => {
      assert.equal(await strokes(page), count);
      await page.waitForFunction(async (wanted) => {
        const {store} = window.qeltPage;
        return ((await store.pages()).find((one) => one.page === store.page)?.count ?? 0) === wanted;
      }, count);
    };
    for (const y of [100, 200, 300]) await draw(page, y);
    await both(3);
    const all = await paper(page);
    for (const [key, count] of [['z', 2], ['z', 1], ['y', 2], ['y', 3], ['Backspace', 0], ['z', 3]]) {
      await page.keyboard.press(`Control+${key}`);
      await both(count);
    }
    assert.deepEqual(await paper(page), all);
    await page.keyboard.press('Control+z');
    await both(2);
    await reload(page);
    await both(2);
  });

  test('belongs to one tab; another tab has another, and both come back', async (t) => {
    const one = await opened(t);
    await draw(one, 100);
    const two = await another(one);
    assert.equal(await strokes(two), 0);
    await draw(two, 200);
    await draw(two, 300);
    await draw(one, 150);
    await one.keyboard.press('Control+z');
    await reload(one);
    await reload(two);
    assert.deepEqual([await strokes(one), await strokes(two)], [1, 2]);

    // The list shows both, follows what other tabs do, and leads to a page that no other tab has.
    await one.getByRole('button', {name: 'Files and pages'}).click();
    assert.ok(await one.getByRole('button', {name: 'Page 2 open in another tab'}).isDisabled());
    await two.close();
    await one.getByRole('button', {name: /^Page 2 2 strokes/}).click();
    await one.waitForFunction(() => window.qeltPage?.store.page === 2 && 'ready' in document.documentElement.dataset);
    assert.equal(await strokes(one), 2);
    // A new tab comes to the page drawn on last that is free.
    const three = await another(one);
    assert.equal(await strokes(three), 1);
  });
});

describe('storage', () => {
  const refusals = {
    'is refused altogether': () => { Object.defineProperty(window, 'indexedDB', {value: {open() { throw new DOMException('denied', 'SecurityError'); }}}); },
    'is full': () => {
      const put = IDBObjectStore.prototype.put;
      window.full = true;
      IDBObjectStore.prototype.put = function (...values) {
        if (!window.full) return put.apply(this, values);
        throw new DOMException('full', 'QuotaExceededError');
      };
    },
    'breaks while it writes': () => {
      const put = IDBObjectStore.prototype.put;
      IDBObjectStore.prototype.put = function (...values) {
        put.apply(this, values);
        this.transaction.abort();
      };
      IDBTransaction.prototype.commit = () => {};
    },
  };
  for (const [how, prepare] of Object.entries(refusals)) {
    test(`that ${how} is told once, and drawing goes on`, async (t) => {
      const page = await opened(t, {prepare});
      await page.mouse.click(400, 500);
      for (const y of [100, 200, 300]) await draw(page, y, 'mouse');
      await page.keyboard.press('Control+z');
      assert.equal(await strokes(page), 3);
      const told = await messages(page);
      assert.equal(told.length, 1);
      assert.match(told[0], /kept in this tab only: save it as a file\.$/);
      assert.deepEqual(page.errors, []);
      const asked = page.waitForEvent('dialog', {timeout: 5000});
      page.close({runBeforeUnload: true});
      const dialog = await asked;
      assert.equal(dialog.type(), 'beforeunload');
      await dialog.accept();
    });
  }

  test('that was full takes everything once there is room', async (t) => {
    const page = await opened(t, {prepare: `(${refusals['is full']})(); const later = setTimeout; window.setTimeout = (task, time, ...rest) => later(task, time === 15000 ? 200 : time, ...rest);`});
    for (const y of [100, 200]) await draw(page, y, 'mouse');
    await page.keyboard.press('Control+z');
    assert.equal(await stored(page), 0);
    await page.evaluate(() => { window.full = false; });
    await page.getByText('Everything is stored again.').waitFor();
    assert.equal(await stored(page), 1);
    await reload(page);
    assert.equal(await strokes(page), 1);
  });

  test('of a newer version is left alone', async (t) => {
    const page = await opened(t);
    await draw(page, 100);
    const other = await another(page);
    // The newer version comes while older tabs are open; they make way.
    const open = (version) => page.evaluate((wanted) => new Promise((resolve, reject) => {
      const request = indexedDB.open('qelt-pencil', wanted);
      request.onupgradeneeded = () => request.result.createObjectStore('newer').put('precious', 1);
      request.onerror = () => reject(request.error);
      request.onblocked = () => reject(new Error('blocked'));
      request.onsuccess = () => {
        const all = request.result.transaction(['newer', 'strokes']);
        const count = all.objectStore('strokes').count();
        all.objectStore('newer').get(1).onsuccess = ({target}) => {
          resolve([target.result, count.result]);
          request.result.close();
        };
      };
    }), version);
    assert.deepEqual(await open(2), ['precious', 1]);
    assert.match((await messages(other))[0], /newer version .* kept in this tab only/);
    await draw(other, 200);
    const third = await another(page);
    assert.match((await messages(third))[0], /^The pages in this browser are from a newer version, and are left as they are\./);
    await draw(third, 300);
    assert.equal(await strokes(third), 1);
    assert.deepEqual(await open(2), ['precious', 1]);
  });

  test('that holds strokes which lie shows the others, and settings which lie are as on the first visit', async (t) => {
    const page = await opened(t);
    for (const y of [100, 200]) await draw(page, y);
    await page.evaluate(() => new Promise((resolve) => {
      localStorage.setItem('qelt-pencil', '{"look":99,"size":"wide","color":"red","views":{"1":{"scale":"x"}},"paper":null}');
      indexedDB.open('qelt-pencil').onsuccess = ({target}) => {
        const write = target.result.transaction('strokes', 'readwrite');
        write.objectStore('strokes').put(new Uint8Array(1000), [1, 1]);
        write.objectStore('strokes').put({not: 'bytes'}, [1, 2]);
        write.objectStore('strokes').put('text', [1, 'three']);
        write.oncomplete = () => { target.result.close(); resolve(); };
      };
    }));
    await reload(page);
    assert.equal(await strokes(page), 2);
    assert.match((await messages(page))[0], /^3 of the page's 5 stored strokes could not be read/);
    assert.equal(await page.evaluate(() => window.qeltPage.settings.get('look')), 8);
    await draw(page, 300);
    await reload(page);
    assert.equal(await strokes(page), 3);
  });
});
