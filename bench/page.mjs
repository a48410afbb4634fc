// How fast the page's engine is in headless Chromium. Prints a table of what was measured beside what is aimed at, and
// writes all of it to out/web/bench.json. Times depend on the machine and on what else it does; nothing fails here.
// Where others use the machine, most of a long time is the wait for a processor. So beside the time that passed there
// stands the processor time of the page's main thread, as Linux counts it, a third of a millisecond of asking included.
// The software renderer is such a neighbour: whenever the page hands it work, its threads may take the page's
// processor for some milliseconds. So the page's process is given a processor of its own, as it has one where a GPU
// draws; the first events are measured without that, too.
//
//   node bench/page.mjs [swiftshader|llvmpipe] [strokes, default 10000]

import {execFileSync} from 'node:child_process';
import {mkdirSync, readFileSync, statSync, writeFileSync} from 'node:fs';
import {createServer} from 'node:http';
import {availableParallelism, loadavg} from 'node:os';
import {join} from 'node:path';
import {Tab, bareEnginePage, files, openBrowser, processesOf, scratch} from '../tests/web/engine-page.mjs';

const renderer = process.argv[2] ?? 'llvmpipe';
const most = Number(process.argv[3] ?? 10_000);
const kStrokesSeconds = 180;

// An isolated page has a clock of 5 microseconds; one from a file has a clock of 100.
const html = readFileSync(bareEnginePage(scratch()));
const server = createServer((request, response) => {
  response.writeHead(200, {'Content-Type': 'text/html', 'Cross-Origin-Opener-Policy': 'same-origin',
                           'Cross-Origin-Embedder-Policy': 'require-corp'}).end(html);
});
await new Promise((resolve) => server.listen(0, '127.0.0.1', resolve));
const address = `http://127.0.0.1:${server.address().port}/`;

const profile = scratch();
const context = await openBrowser(renderer, {width: 1280, height: 800, profile});
const firstStroke = () => opened.then(() => {
  drawWave(20, 60, {samples: 5});
  engine.present();
  return performance.now();
});
const openings = [];
let tab;
for (let i = 0; i < 4; ++i) {
  if (tab) await tab.page.close();
  tab = await Tab.open(context, address);
  openings.push(await tab.run(firstStroke));
}

await tab.run(() => {
  const at = (values, share) => values.sort((a, b) => a - b)[Math.min(Math.floor(values.length * share), values.length - 1)];
  window.spread = (values) => ({median: at(values, 0.5), p99: at(values, 0.99), longest: at(values, 1), count: values.length});
  window.timed = (call) => {
    const start = performance.now();
    call();
    return performance.now() - start;
  };
  let seed = 1;
  window.random = () => (seed = (seed * 48271) % 2147483647) / 2147483647;
  window.anywhere = () => [random() * 1050, 40 + random() * 720];
  engine.resize(1280, 800);
  engine.clear();

  // Strokes of 40 samples as a hand draws them: one move event of four samples a frame, shown within its handler.
  window.drawByFrames = async (strokes) => {
    const moves = [], presents = [], begins = [], ends = [];
    for (let s = 0; s < strokes; ++s) {
      const [x, y] = anywhere();
      await nextFrame();
      begins.push(timed(() => { engine.begin(style(), wave(x, y, 0)); engine.present(); }));
      for (let i = 1; i + 3 < 40; i += 4) {
        const rows = [0, 1, 2, 3].flatMap((k) => wave(x, y, i + k));
        await nextFrame();
        moves.push(timed(() => engine.move(rows)));
        presents.push(timed(() => engine.present()));
      }
      ends.push(timed(() => { engine.end(wave(x, y, 40)); engine.present(); }));
    }
    const events = moves.map((time, i) => time + presents[i]);
    return {event: spread(events), move: spread(moves), present: spread(presents), begin: spread(begins), end: spread(ends)};
  };
  window.drawMany = async (strokes, seconds) => {
    const stop = performance.now() + 1000 * seconds;
    for (let s = 0; s < strokes && performance.now() < stop; ++s) {
      drawWave(...anywhere());
      if (s % 5 === 0) {
        engine.present();
        await nextFrame();
      }
    }
    await shown();
  };
  window.undoAndRedo = async () => {
    const undos = [], redos = [];
    let instant = true;
    for (let i = 0; i < 10; ++i) {
      for (const [times, call] of [[undos, () => engine.undo()], [redos, () => engine.redo()]]) {
        await nextFrame();
        times.push(timed(() => { call(); engine.present(); }));
        instant &&= !engine.busy;
        await settle();
      }
    }
    return {undo: spread(undos), redo: spread(redos), instant};
  };
});

const processorTime = (pid) => Number(readFileSync(`/proc/${pid}/task/${pid}/schedstat`, 'utf8').split(' ')[0]) / 1e6;
/** That of the browser's processes which a busy page makes busy. */
async function processOfPage() {
  const all = processesOf(profile).filter(({command}) => command.includes('--type=renderer')).map(({pid}) => pid);
  const before = all.map(processorTime);
  await tab.run(() => { for (const stop = performance.now() + 300; performance.now() < stop;); });
  const grown = all.map((pid, i) => processorTime(pid) - before[i]);
  return all[grown.indexOf(Math.max(...grown))];
}
/** Leaves one processor to a process of the browser, and the others to the browser's others. */
function setApart(own) {
  const count = availableParallelism();
  if (count < 2) return;
  for (const {pid} of processesOf(profile)) {
    const processors = pid === own ? '0' : `1-${count - 1}`;
    execFileSync('taskset', ['--all-tasks', '--cpu-list', '--pid', processors, String(pid)], {stdio: 'ignore'});
  }
}
/** Milliseconds that a call in the page takes by the clock, and of the main thread's processor. */
async function measured(call, argument) {
  const before = processorTime(pagePid);
  const wall = await tab.run(call, argument);
  return {wall, processor: processorTime(pagePid) - before};
}
const spreadOf = (values) => {
  const sorted = [...values].sort((a, b) => a - b);
  const at = (share) => sorted[Math.min(Math.floor(sorted.length * share), sorted.length - 1)];
  return {median: at(0.5), p99: at(0.99), longest: at(1), count: sorted.length};
};
const both = (all) => ({wall: spreadOf(all.map(({wall}) => wall)), processor: spreadOf(all.map(({processor}) => processor))});
async function zoomTo(view) {
  const setView = await tab.run((to) => timed(() => { engine.setView(to); engine.present(); }), view);
  const start = performance.now();
  const slices = [];
  do {
    const slice = await measured(() => timed(() => { window.more = engine.work(4); }));
    if (slice.wall > 0.1) slices.push(slice);  // else it waited for the GPU
  } while (await tab.run(() => more));
  return {setView, ...both(slices), seconds: (performance.now() - start) / 1000};
}
async function eventsOneByOne() {
  const events = [];
  for (let s = 0; s < 20; ++s) {
    await tab.run((y) => { window.row = y; engine.begin(style(), wave(100, y, 0)); engine.present(); }, 40 + 30 * s);
    for (let i = 1; i + 3 < 40; i += 4) {
      events.push(await measured((at) => {
        const rows = [0, 1, 2, 3].flatMap((k) => wave(100, row, at + k));
        return timed(() => { engine.move(rows); engine.present(); });
      }, i));
    }
    await tab.run(() => { engine.end(wave(100, row, 40)); engine.present(); });
  }
  return both(events);
}

const results = {renderer: await tab.run(() => engine.renderer), load: loadavg()[0], openings};
const say = (line) => console.log(line);
const ms = (value) => `${value.toFixed(3)} ms`;
const pair = ({median, p99}) => `${ms(median)}, ${ms(p99)}`;
say(`${results.renderer}; load ${results.load.toFixed(1)}`);
const size = statSync(files.engine).size;
results.engineBytes = size;
say(`compiled engine                     ${(size / 1024).toFixed(0)} KB`);
say(`opening to first stroke             ${openings.map((time) => time.toFixed(0)).join(', ')} ms (aim 500, warm)`);

await tab.run(async () => {
  await shown();
  await drawByFrames(5);  // to warm up
});
const pagePid = await processOfPage();
results.shared = await tab.run(() => drawByFrames(40));
setApart(pagePid);
results.first = await tab.run(() => drawByFrames(40));
results.undo = {};
const undo = async (strokes) => {
  const found = await tab.run(() => undoAndRedo());
  results.undo[strokes] = found;
  say(`undo, redo among ${String(strokes).padStart(5)} strokes     ${ms(found.undo.longest)}, ${ms(found.redo.longest)} at most` +
      `${found.instant ? '' : ', redrawn'} (aim 5)`);
};
say(`event of 4 samples, shared          ${pair(results.shared.event)} median, p99`);
say(`event of 4 samples, stroke 1        ${pair(results.first.event)} median, p99 (aim 0.3, 2)`);
say(`  of it: the pen                    ${pair(results.first.move)}`);
say(`  of it: showing it                 ${pair(results.first.present)}`);
say(`pen down; pen up                    ${pair(results.first.begin)}; ${pair(results.first.end)}`);
await undo(45);

results.heap = {};
const drawUpTo = async (strokes) => {
  const have = await tab.run(() => engine.stats().strokes);
  await tab.run(([more, seconds]) => drawMany(more, seconds), [strokes - have, kStrokesSeconds]);
  const stats = await tab.run(() => engine.stats());
  results.heap[stats.strokes] = stats;
  const mb = (bytes) => `${(bytes / 2 ** 20).toFixed(0)} MB`;
  say(`memory at ${String(stats.strokes).padStart(6)} strokes            ${mb(stats.heapBytes)}; vertices ${mb(stats.cachedBytes)}, ` +
      `pixels for undo ${mb(stats.backupBytes)}`);
  return stats.strokes;
};
await drawUpTo(500);
await undo(500);
await drawUpTo(1000);
await drawUpTo(2000);
await undo(2000);
results.late = await tab.run(() => drawByFrames(40));
results.ratio = results.late.event.median / results.first.event.median;
results.single = await eventsOneByOne();
say(`event of 4 samples, one by one      ${pair(results.single.wall)}; processor ${pair(results.single.processor)}`);
say(`event of 4 samples, stroke 2,000    ${pair(results.late.event)}; ${results.ratio.toFixed(2)} of stroke 1 (aim 1.2)`);
results.zoom = {};
for (const view of [{zoom: 1.7, x: -400, y: -200}, {zoom: 0.5, x: 300, y: 100}, {zoom: 1, x: 0, y: 0}]) {
  const found = await zoomTo(view);
  results.zoom[view.zoom] = found;
  say(`zoom to ${String(view.zoom).padEnd(4)} with 2,000 strokes     at once ${ms(found.setView)}; ${found.wall.count} slices in ` +
      `${found.seconds.toFixed(1)} s`);
  say(`  a slice by the clock              ${pair(found.wall)}, longest ${ms(found.wall.longest)}`);
  say(`  a slice's processor time          ${pair(found.processor)}, longest ${ms(found.processor.longest)} (aim 8)`);
}
await undo(2001);
if (most > 2040) await drawUpTo(most);

mkdirSync(files.out, {recursive: true});
writeFileSync(join(files.out, 'bench.json'), `${JSON.stringify(results, null, 2)}\n`);
await context.close();
server.close();
if (tab.errors.length) throw new Error(tab.errors.join('\n'));
