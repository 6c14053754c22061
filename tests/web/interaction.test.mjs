// Drags on the page's picture with real mouse events against `veltrane interact` with the same
// viewer events: the same parameter values and the same undo steps. The picture is shown at
// one frame pixel per canvas pixel, so canvas pixel (x, y) is corner-space point (x, H - y).
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join, resolve } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage } from '../../web/headless.mjs';

const scene = new URL('../../docs/examples/demo.json', import.meta.url).pathname;
const cli = process.env.VELTRANE_CLI;
const kWidth = 640;
const kHeight = 360;
// What the page hands the module at one frame pixel per screen pixel on a screen of density 1
// (the viewer's handle scale: grabbable handles beside a cut's 15-pixel band).
const kUiScale = 1.9;

// Corner-space points of each gesture: hover, press, moves, release.
const gestures = {
  // Onto cut 2's line at its position point (150, 40), dragged sideways.
  cutLine: [[470, 220], [476, 200], [482, 180]],
  // A picture well away from every cut, dragged by (30, -20).
  picture: [[100, 300], [115, 290], [130, 280]],
};

function events(points) {
  const [first, ...rest] = points;
  const last = points[points.length - 1];
  return [{ move: first }, { press: first }, ...rest.map((p) => ({ move: p })), { release: last }];
}

let browser;
let scratch;
before(async () => {
  assert.ok(cli, 'VELTRANE_CLI must name the veltrane command line (CTest sets it)');
  scratch = mkdtempSync(join(tmpdir(), 'veltrane-web-interact-'));
  browser = await openPage();
  await browser.page.addStyleTag({ content: `#view { flex: none; width: ${kWidth}px; height: ${kHeight}px; }` });
  await browser.page.evaluate((text) => window.veltrane.open(text), readFileSync(scene, 'utf8'));
});
after(async () => {
  await browser?.close();
  if (scratch) rmSync(scratch, { recursive: true, force: true });
});

async function drag(points) {
  const box = await (await browser.page.$('#view')).boundingBox();
  const at = ([x, y]) => [box.x + x, box.y + (kHeight - y)];
  await browser.page.mouse.move(...at(points[0]));
  await browser.page.mouse.down();
  for (const point of points.slice(1)) await browser.page.mouse.move(...at(point));
  await browser.page.mouse.up();
}

let replays = 0;
function interact(script) {
  const eventsFile = join(scratch, `events-${++replays}.json`);
  const resultFile = join(scratch, `result-${replays}.json`);
  writeFileSync(eventsFile, JSON.stringify({ viewScale: [1, 1], uiScale: kUiScale, time: 0, events: script }));
  execFileSync(cli, ['interact', scene, '--events', eventsFile, '-o', resultFile]);
  return JSON.parse(readFileSync(resultFile, 'utf8'));
}

// Every parameter that is not animated, as the page shows it and as interact reports it.
function assertSameValues(state, result) {
  for (const [id, expected] of Object.entries(result.params)) {
    if (state.keys[id] !== 'static') continue;
    const actual = state.values[id];
    if (typeof expected === 'number') assert.ok(Math.abs(actual - expected) < 1e-3, `${id}: ${actual} != ${expected}`);
    else assert.deepEqual(actual, expected, id);
  }
}

test('drags on a cut line and on a picture give the values and undo steps interact gives', async () => {
  const script = [...events(gestures.cutLine), ...events(gestures.picture)];
  await drag(gestures.cutLine);
  await drag(gestures.picture);
  const state = await browser.page.evaluate(() => window.veltrane.state());
  const result = interact(script);
  assert.deepEqual(state.undo, result.undoSteps);
  assert.equal(state.undo.length, 2, 'one undo step per drag');
  assertSameValues(state, result);

  // Ctrl+Z takes the whole picture drag back, as the host's undo does.
  await browser.page.keyboard.down('Control');
  await browser.page.keyboard.press('z');
  await browser.page.keyboard.up('Control');
  const undone = await browser.page.evaluate(() => window.veltrane.state());
  const undoneResult = interact([...script, { undo: 1 }]);
  assert.deepEqual(undone.redo, undoneResult.redoSteps);
  assertSameValues(undone, undoneResult);

  // Saved, the scene holds the values the page shows, as the command line's scene writer keeps
  // them (every value that differs from its default).
  const saved = JSON.parse(await browser.page.evaluate(() => window.veltrane.save()));
  for (const [id, value] of Object.entries(saved.params)) {
    if (undone.keys[id] === 'static') assert.deepEqual(value, undone.values[id], id);
  }
  assert.deepEqual(browser.problems, []);
});
