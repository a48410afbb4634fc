// The compiled engine alone, on a bare page, on both renderers that Chromium offers here.

import assert from 'node:assert/strict';
import {readFileSync} from 'node:fs';
import {join} from 'node:path';
import {after, before, describe, test} from 'node:test';
import {RENDERERS, Tab, bareEnginePage, drawnPicture, files, openBrowser, scratch} from './engine-page.mjs';

const folder = scratch();
const address = bareEnginePage(folder);
const sample = readFileSync(join(files.top, 'resources/sample.inkml'), 'utf8');

// One trace of a page, its points given as [x, y, pressure].
function straightInkml(look) {
  const brush = `<brush xml:id="b"><brushProperty name="width" value="6"/>
    <brushProperty name="color" value="#a03010"/><brushProperty name="renderingVersion" value="${look}"/></brush>`;
  const line = (y) => Array.from({length: 30}, (_, i) => `${10 + 7.3 * i} ${y + 1.7 * i} ${(i % 10) / 10 + 0.05}`);
  return `<ink xmlns="http://www.w3.org/2003/InkML"><traceFormat><channel name="X" type="decimal"/>
    <channel name="Y" type="decimal"/><channel name="F" type="decimal" min="0" max="1"/></traceFormat>${brush}
    <trace brushRef="#b">${line(20)}</trace><trace brushRef="#b">${line(70.5)}</trace></ink>`;
}

const withLook = (inkml, look) => inkml.replaceAll(
    '</brush>', `<brushProperty name="renderingVersion" value="${look}"/></brush>`);

for (const renderer of Object.keys(RENDERERS)) {
  describe(renderer, () => {
    let context, tab;
    before(async () => { context = await openBrowser(renderer); });
    after(() => context?.close());

    // A test each on a fresh page that must end without an error.
    const onPage = (name, body) => test(name, {timeout: 300_000}, async () => {
      tab = await Tab.open(context, address);
      try {
        await tab.run(() => opened);
        await body();
        assert.deepEqual(tab.errors, []);
      } finally {
        await tab.page.close();
      }
    });

    // Whether a picture that the page made is the one `qelt-sketch` draws of the same InkML.
    //
    // On llvmpipe, which both draw with, all bytes are equal. Where ink is tilted, the two C libraries' sines and
    // cosines differ in the last bit of some stamps' directions; 3 of 9.7 million bytes were seen to differ, by 1.
    // SwiftShader draws the edge of every stamp otherwise: what is looked at there is how much of the ink's darkness
    // is missing, and how much lies elsewhere.
    async function compareWithSketch(what, inkml, zoom, isTilted) {
      const png = drawnPicture(folder, inkml, '--zoom', String(zoom));
      const apart = await tab.run(
          async ({png, zoom}) => compare(engine.picture({zoom}), await decode(png)), {png, zoom});
      const told = `${what}, zoom ${zoom}: ${JSON.stringify(apart)}`;
      if (process.env.QELT_VERBOSE) console.log(renderer, told);
      assert.ok(apart.inked > 1000, told);
      if (renderer === 'swiftshader') {
        assert.ok(Math.abs(apart.lighter) < 0.04 * apart.darkness && apart.apart < 0.25 * apart.darkness, told);
      } else if (isTilted) {
        assert.ok(apart.differing <= 1e-5 * apart.bytes && apart.most <= 2, told);
      } else {
        assert.equal(apart.differing, 0, told);
      }
    }

    onPage('draws recorded ink as qelt-sketch does', async () => {
      assert.match(await tab.run(() => engine.renderer), renderer === 'llvmpipe' ? /llvmpipe/ : /SwiftShader/);
      for (let look = 1; look <= 8; ++look) {
        const pages = [['straight', straightInkml(look), [1, 2]]];
        if (look === 8 || renderer === 'llvmpipe') {
          pages.push(['sample', withLook(sample, look), look % 4 === 0 ? [1, 2] : [1]]);
        }
        for (const [name, inkml, zooms] of pages) {
          await tab.run((text) => {
            engine.clear();
            engine.openInkml(new TextEncoder().encode(text), 'page.inkml');
          }, inkml);
          for (const zoom of zooms) {
            await compareWithSketch(`${name}, look ${look}`, inkml, zoom, name === 'sample');
          }
        }
      }
    });

    onPage('draws and saves live ink so that qelt-sketch draws it alike', async () => {
      const inkml = await tab.run(() => {
        for (let look = 1; look <= 8; ++look) {
          drawWave(20, 60 * look, {look, color: 0x30A0C0 + 0x1F000000 * look, smooth: look % 2 === 0});
          drawWave(300, 60 * look, {look, size: 3 * look, outline: look > 5 ? {size: 4, color: 0xFFE0D020} : null,
                                    tool: ['pen', 'touch', 'mouse'][look % 3]});
        }
        return engine.inkml();
      });
      for (const zoom of [0.37, 1, 2]) await compareWithSketch('live', inkml, zoom, false);
      await tab.run(() => { engine.clear(); drawWave(20, 60, {tilted: true, size: 9}); });
      await compareWithSketch('tilted', await tab.run(() => engine.inkml()), 1, true);
      await tab.run(() => shown());
      await tab.screenshot(`engine-${renderer}`);
    });

    onPage('shows the same page after undo, erasing, clearing, zooming and a new start', async () => {
      const found = await tab.run(async () => {
        const found = {};
        const shownAfter = [await shown()];
        const looks = [8, 3, 5, 1, 8];
        for (const [i, look] of looks.entries()) {
          drawWave(40 + 30 * i, 60 + 90 * i, {look, tilted: i === 1, color: i === 3 ? 0x80C02020 : 0xFF202020,
                                              outline: i === 2 ? {size: 5, color: 0xFF40C0F0} : null});
          shownAfter.push(await shown());
        }
        const all = shownAfter.at(-1);
        found.lastStroke = differing(all, shownAfter.at(-2)) > 1000;
        const check = async (name, expected) => { found[name] = differing(await shown(), expected); };
        for (let i = looks.length - 1; i >= 0; --i) {
          engine.undo();
          await check(`undo ${i}`, shownAfter[i]);
        }
        found.nothingToUndo = engine.undo();
        for (let i = 1; i <= looks.length; ++i) {
          engine.redo();
          await check(`redo ${i}`, shownAfter[i]);
        }
        const picture = engine.picture();
        found.erased = engine.erase(60, 0, 120, 280, 3);
        engine.erase(60, 280, 60, 280, 3);
        found.erasedStep = engine.eraseEnd();
        found.erasedShows = differing(await shown(), all) > 1000;
        engine.undo();
        await check('erase undone', all);
        engine.clear();
        await check('cleared', shownAfter[0]);
        engine.undo();
        await check('clear undone', all);
        for (const view of [{zoom: 3.3, x: -400, y: 77.5}, {zoom: 0.21, x: 5, y: 5}, {zoom: 1, x: 17, y: -40}]) {
          engine.setView(view);
          engine.present();
          await nextFrame();
          await shown();
          engine.setView({zoom: 1, x: 0, y: 0});
          await check(`back from zoom ${view.zoom}`, all);
        }
        for (let i = looks.length - 1; i >= 3; --i) engine.undo();
        await check('undo after zooming', shownAfter[3]);
        for (let i = 3; i < looks.length; ++i) engine.redo();
        engine.begin(style(), wave(10, 10, 0));
        engine.move([...wave(10, 10, 5), ...wave(10, 10, 9)], wave(10, 10, 14));
        engine.present();
        engine.cancel();
        await check('cancelled', all);
        engine.resize(500, 900);
        await shown();
        engine.resize(900, 600);
        await check('resized and back', all);
        engine.replayBegin();
        drawWave(200, 200);
        engine.present();
        engine.replayEnd();
        await check('replayed', all);
        found.picture = differing(engine.picture(), picture);

        const records = engine.strokes().map((id) => engine.record(id));
        engine.clear();
        for (const record of records) engine.addRecord(record);
        await check('from records', all);
        found.pictureFromRecords = differing(engine.picture(), picture);
        found.reopened = engine.openInkml(new TextEncoder().encode(engine.inkml()), 'own.inkml').shown.length;
        return found;
      });
      const {lastStroke, nothingToUndo, erased, erasedStep, erasedShows, reopened, ...differences} = found;
      assert.deepEqual({lastStroke, nothingToUndo, erasedShows, reopened},
                       {lastStroke: true, nothingToUndo: null, erasedShows: true, reopened: 5});
      assert.ok(erased > 0 && erasedStep.hidden.length >= erased, JSON.stringify({erased, erasedStep}));
      assert.deepEqual(Object.entries(differences).filter(([, count]) => count !== 0), []);
      assert.ok(Object.keys(differences).length > 20);
    });

    onPage('is back after a lost context, pixel for pixel', async () => {
      const found = await tab.run(async () => {
        for (let i = 0; i < 6; ++i) drawWave(40 + 60 * i, 60 + 80 * i, {look: i + 3, tilted: i % 2 === 1});
        const before = await shown();
        const picture = engine.picture();
        let restore = await loseContext();
        engine.present();
        await restore();
        const found = {shown: differing(await shown(), before), picture: differing(engine.picture(), picture)};

        // A stroke under way, strokes and undo while there is no context.
        engine.begin(style(), wave(30, 500, 0));
        engine.move(wave(30, 500, 1));
        restore = await loseContext();
        for (let i = 2; i < 41; ++i) engine.move(wave(30, 500, i));
        engine.end(wave(30, 500, 40));
        const last = drawWave(300, 500);
        engine.undo();
        engine.present();
        await restore();
        const after = await shown();
        found.drawnMeanwhile = differing(after, before) > 1000;
        found.strokes = engine.strokes().length;
        engine.redo();
        found.redone = engine.strokes().at(-1) === last;
        engine.undo();
        found.undone = differing(await shown(), after);

        // Lost again while the page is being redrawn.
        engine.setView({zoom: 2, x: 0, y: 0});
        engine.work(0);
        await (await loseContext())();
        engine.setView({zoom: 1, x: 0, y: 0});
        found.twice = differing(await shown(), after);
        return found;
      });
      assert.deepEqual(found, {shown: 0, picture: 0, drawnMeanwhile: true, strokes: 7, redone: true, undone: 0, twice: 0});
    });

    onPage('answers bad values with a sentence, and goes on', async () => {
      const {answers, alike} = await tab.run(async () => {
        const answers = [];
        const tryIt = (name, call) => {
          try {
            call();
            answers.push([name, 'taken']);
          } catch (error) {
            answers.push([name, error instanceof EngineError ? 'refused' : error.name, error.message]);
          }
          engine.cancel();
        };
        drawWave(50, 80);
        drawWave(50, 200, {look: 2});
        const before = await shown();
        const start = [10, 10, 0.5, 0, 0, 0];
        for (const value of [NaN, Infinity, -Infinity, 1e300]) {
          for (const [i, name] of ['x', 'y', 'pressure', 'tilt', 'orientation', 'time'].entries()) {
            tryIt(`begin at ${name} ${value}`, () => engine.begin(style(), start.with(i, value)));
            engine.begin(style(), start);
            tryIt(`move to ${name} ${value}`, () => engine.move([...start.with(i, value)], start.with(i, value)));
            engine.begin(style(), start);
            tryIt(`end at ${name} ${value}`, () => { engine.end(start.with(i, value)); engine.undo(); });
          }
          tryIt(`size ${value}`, () => engine.begin(style({size: value}), start));
          tryIt(`outline ${value}`, () => engine.begin(style({outline: {size: value, color: 0}}), start));
          tryIt(`zoom ${value}`, () => engine.setView({zoom: value, x: 0, y: 0}));
          tryIt(`shift ${value}`, () => engine.setView({zoom: 1, x: value, y: 0}));
          tryIt(`erase ${value}`, () => { engine.erase(value, 0, 0, 0, 5); engine.eraseEnd(); });
          tryIt(`eraser ${value}`, () => engine.erase(1e4, 1e4, 1e4, 1e4, value));
          tryIt(`picture ${value}`, () => engine.picture({zoom: value}));
          tryIt(`work ${value}`, () => engine.work(value));
          tryIt(`stroke ${value}`, () => engine.record(value));
          tryIt(`window ${value}`, () => engine.resize(value, value));
        }
        engine.resize(900, 600);
        for (const look of [99, 0, -1, 2 ** 31, NaN]) tryIt(`look ${look}`, () => engine.begin(style({look}), start));
        for (const size of [0, -1, 1001]) tryIt(`size ${size}`, () => engine.begin(style({size}), start));
        tryIt('preview 0 wide', () => engine.preview(0, 10, style()));
        tryIt('preview too wide', () => engine.preview(5000, 10, style()));
        tryIt('huge picture', () => engine.picture({zoom: 900}));
        tryIt('limits of look 9', () => engine.limits(9));
        tryIt('two strokes at once', () => { engine.begin(style(), start); engine.begin(style(), start); });
        tryIt('undo in a stroke', () => { engine.begin(style(), start); engine.undo(); });
        tryIt('replay in a stroke', () => { engine.begin(style(), start); engine.replayBegin(); });
        tryIt('half a sample', () => { engine.begin(style(), start); engine.move([1, 2, 3]); });
        engine.move(start);
        engine.end(start);

        const record = engine.record(engine.strokes()[0]);
        for (let size = 0; size < record.length; size += size < 64 ? 1 : 13) {
          tryIt(`record cut to ${size}`, () => engine.addRecord(record.slice(0, size)));
        }
        tryIt('record with more behind', () => engine.addRecord(new Uint8Array([...record, 0])));
        for (let i = 0; i < 60; ++i) {
          for (const bits of [0x80, 0xFF]) {
            const bad = record.slice();
            bad[i] ^= bits;
            tryIt(`flipped byte ${i}`, () => engine.addRecord(bad));
          }
        }
        await settle();
        const firstTwo = engine.strokes().slice(0, 2);
        const kept = firstTwo.map((id) => engine.record(id));
        engine.clear();
        for (const record of kept) engine.addRecord(record);
        return {answers, alike: differing(await shown(), before)};
      });
      assert.equal(alike, 0, 'the page does not draw as before');
      for (const [name, what, message] of answers) {
        assert.ok(what === 'taken' || what === 'refused', `${name}: ${what} ${message}`);
        if (what === 'refused') assert.match(message, /^[A-Za-z].{10,150}$/, name);
      }
      const refused = new Map(answers.map(([name, what]) => [name, what === 'refused']));
      for (const name of ['look 99', 'look 0', 'look NaN', 'size NaN', 'size Infinity', 'size 0', 'size 1001', 'outline NaN',
                          'begin at x NaN', 'begin at y Infinity', 'zoom NaN', 'zoom Infinity', 'shift NaN', 'erase NaN',
                          'eraser NaN', 'picture NaN', 'stroke NaN', 'window NaN', 'window 1e+300', 'preview 0 wide',
                          'preview too wide', 'huge picture', 'limits of look 9', 'two strokes at once',
                          'undo in a stroke', 'replay in a stroke', 'half a sample', 'record cut to 0',
                          'record cut to 63', 'record with more behind', 'flipped byte 0', 'flipped byte 4']) {
        assert.ok(refused.get(name), `${name} was taken`);
      }
      for (const [name, isRefused] of refused) {
        if (name.startsWith('move') || name.startsWith('end')) assert.ok(!isRefused, `${name} ended the stroke`);
        if (name.startsWith('record cut')) assert.ok(isRefused, `${name} was taken`);
      }
    });

    onPage('tells what is wrong with InkML by name and line, and opens none of it', async () => {
      const good = straightInkml(8);
      const messages = await tab.run((files) => {
        drawWave(50, 80);
        const before = engine.inkml();
        const messages = files.map(([name, text]) => {
          try {
            engine.openInkml(typeof text === 'string' ? new TextEncoder().encode(text) : new Uint8Array(text), name);
            return `${name} was opened`;
          } catch (error) {
            return error instanceof EngineError ? error.message : `${error.name}: ${error.message}`;
          }
        });
        if (engine.inkml() !== before) messages.push('the page changed');
        engine.undo();
        engine.redo();
        return messages;
      }, [
        ['cut.inkml', good.slice(0, good.length - 40)],
        ['number.inkml', good.replace('<trace brushRef="#b">10', '<trace brushRef="#b">ten')],
        ['far.inkml', good.replace('<trace brushRef="#b">10', '<trace brushRef="#b">1e9')],
        ['look.inkml', good.replace('value="8"/>', 'value="many"/>')],
        ['brush.inkml', good.replace('#b">10', '#c">10')],
        ['size.inkml', good.replace('value="6"', 'value="-6"')],
        ['binary.inkml', Array.from({length: 5000}, (_, i) => (i * 7919) % 256)],
        ['deep.inkml', `<ink>${'<traceGroup>'.repeat(5000)}`],
        ['nothing.inkml', ''],
        ['page.html', '<html>no ink</html>'],
      ]);
      if (process.env.QELT_VERBOSE) console.log(messages.join('\n'));
      assert.equal(messages.length, 10);
      for (const message of messages) assert.match(message, /^[a-z]+\.(inkml|html):(\d+:)? \S.{8,200}$/);
    });
  });
}
