// The compiled engine alone, on a bare page, on both renderers that Chromium offers here.

import assert from 'node:assert/strict';
import {readFileSync} from 'node:fs';
import {join} from 'node:path';
import {after, before, describe, test} from 'node:test';
import {RENDERERS, Tab, bareEnginePage, drawnPicture, files, openBrowser, scratch} from './browser.mjs';

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

    onPage('draws recorded ink as qelt-sketch does', async () => {
      const name = await tab.run(() => engine.renderer);
      assert.match(name, renderer === 'llvmpipe' ? /llvmpipe/ : /SwiftShader/);
      for (const [kind, inkmlOf] of [['straight', straightInkml], ['sample', (look) => withLook(sample, look)]]) {
        for (let look = 1; look <= 8; ++look) {
          const inkml = inkmlOf(look);
          await tab.run((text) => {
            engine.clear();
            engine.openInkml(new TextEncoder().encode(text), 'page.inkml');
          }, inkml);
          for (const zoom of [1, 2]) {
            const png = drawnPicture(folder, inkml, '--zoom', String(zoom));
            const apart = await tab.run(async ({png, zoom}) =>
                compare(engine.picture({zoom}), await decode(png)), {png, zoom});
            const what = `${kind}, look ${look}, zoom ${zoom}: ${JSON.stringify(apart)}`;
            if (process.env.QELT_VERBOSE) console.log(renderer, what);
            assert.ok(apart.inked > 1000, what);
            if (renderer === 'llvmpipe') assert.equal(apart.differing, 0, what);
          }
        }
      }
    });
  });
}
