// Debian's Chromium, headless, driven through playwright-core, and the engine alone on a bare page in it.

import {execFileSync} from 'node:child_process';
import {existsSync, mkdirSync, mkdtempSync, readFileSync, readdirSync, rmSync, writeFileSync} from 'node:fs';
import {tmpdir} from 'node:os';
import {dirname, join} from 'node:path';
import {fileURLToPath, pathToFileURL} from 'node:url';
import {gzipSync} from 'node:zlib';
import {chromium} from 'playwright-core';

const top = join(dirname(fileURLToPath(import.meta.url)), '..', '..');

export const files = {
  top,
  out: join(top, 'out', 'web'),
  engine: process.env.QELT_ENGINE ?? join(top, 'build/web/apps/page/web/qelt.js'),
  engineModule: join(top, 'apps/page/site/engine.js'),
  page: process.env.QELT_PAGE ?? join(top, 'out/pencil.html'),
  sketch: process.env.QELT_SKETCH ?? join(top, 'build/release/apps/qelt-sketch/qelt-sketch'),
};

/** What Chromium offers without a GPU, and what each takes. llvmpipe is what `qelt-sketch` draws with too. */
export const RENDERERS = {
  llvmpipe: ['--use-gl=angle', '--use-angle=gl-egl', '--ignore-gpu-blocklist'],
  swiftshader: [],
};

/** A folder that goes when the process ends. */
export function scratch() {
  const folder = mkdtempSync(join(tmpdir(), 'qelt-web-'));
  process.on('exit', () => rmSync(folder, {recursive: true, force: true, maxRetries: 3}));
  return folder;
}

/** Opens a browser; the same `profile` folder again has what was stored before. */
export async function openBrowser(renderer, {profile = scratch(), width = 1000, height = 700, ...options} = {}) {
  const context = await chromium.launchPersistentContext(profile, {
    executablePath: process.env.QELT_CHROMIUM ?? '/usr/bin/chromium',
    headless: true,
    args: RENDERERS[renderer],
    env: {...process.env, EGL_PLATFORM: 'surfaceless'},
    viewport: {width, height},
    ...options,
  });
  context.setDefaultTimeout(60_000);
  return context;
}

/** The processes of the browser that has this `profile`, each with its command line; the browser's own is the first. */
export function processesOf(profile) {
  return readdirSync('/proc').filter((name) => /^\d+$/.test(name)).map(Number).sort((a, b) => a - b).flatMap((pid) => {
    try {
      const command = readFileSync(`/proc/${pid}/cmdline`, 'utf8');
      return command.includes(profile) ? [{pid, command}] : [];
    } catch {
      return [];  // it ended meanwhile
    }
  });
}

/** A tab, and the errors that its scripts made. */
export class Tab {
  static async open(context, address) {
    const tab = new Tab();
    tab.page = await context.newPage();
    tab.errors = [];
    tab.page.on('pageerror', (error) => tab.errors.push(String(error)));
    tab.page.on('console', (message) => {
      if (message.type() === 'error') tab.errors.push(message.text());
    });
    await tab.page.goto(address.includes('://') ? address : pathToFileURL(address).href);
    return tab;
  }

  run(script, argument) { return this.page.evaluate(script, argument); }
  async screenshot(name) {
    mkdirSync(files.out, {recursive: true});
    await this.page.screenshot({path: join(files.out, `${name}.png`)});
  }
}

/** A page with nothing but a canvas and the engine on it, as `engine`, beside a few helpers of tests. */
export function bareEnginePage(folder) {
  if (!existsSync(files.engine)) throw new Error(`${files.engine} is not built; ./sketch web builds it.`);
  const module = readFileSync(files.engineModule, 'utf8').replaceAll(/^export /gm, '');
  const code = gzipSync(readFileSync(files.engine.replace(/js$/, 'wasm'))).toString('base64');
  const path = join(folder, 'engine.html');
  writeFileSync(path, `<!doctype html><meta charset="utf-8"><link rel="icon" href="data:,">
<style>body { margin: 0 } canvas { display: block }</style><canvas id="ink" width="900" height="600"></canvas>
<script type="application/octet-stream" id="qelt-wasm">${code}</script>
<script>${readFileSync(files.engine, 'utf8')}</script>
<script type="module">
${module}
${readFileSync(new URL('./bare.js', import.meta.url), 'utf8')}
window.EngineError = EngineError;
window.opened = open();
</script>`);
  return path;
}

/** Runs `qelt-sketch`; on a refusal throws with what it said. */
export function sketch(...options) {
  execFileSync(files.sketch, options, {env: {...process.env, EGL_PLATFORM: 'surfaceless'}, stdio: 'pipe'});
}

/** What `qelt-sketch` draws of an InkML file from its recorded strokes, a PNG in base64. */
export function drawnPicture(folder, inkml, ...options) {
  const input = join(folder, 'page.inkml');
  const output = join(folder, 'page.png');
  writeFileSync(input, inkml);
  sketch('draw', input, '-o', output, '--mode', 'stroke', '--no-ink', ...options);
  return readFileSync(output).toString('base64');
}
