// The page against the command line, run back to back on this machine: milliseconds per frame
// of the module's render at 640x360 and 1280x720 for 1, 4 and 8 Local cuts on the scene
// `veltrane bench` renders (colour bars, nine layers, cut i at the same place), and frames per
// second of a 2-clip 720p job (`veltrane split` against the page's MP4 export). Each round runs
// the native side, then the page; the figures are medians over the rounds, so that a machine
// busy with other work disturbs both alike. CPU milliseconds (every thread of the command line;
// every process of Chromium) are printed beside the wall times: they move less with the load.
//
//   node bench/web_page.mjs VELTRANE CLIP1 CLIP2 [ROUNDS]   (the page built by scripts/web)
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, readdirSync, rmSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join } from 'node:path';
import { openPage } from '../web/headless.mjs';

const kSizes = ['640x360', '1280x720'];
const kCuts = [1, 4, 8];
const kRepeats = 15;
const [cli, ...rest] = process.argv.slice(2);
const clips = rest.filter((arg) => !/^\d+$/.test(arg));
const rounds = Number(rest.find((arg) => /^\d+$/.test(arg)) ?? 3);
if (!cli || clips.length !== 2) {
  console.error('usage: node bench/web_page.mjs VELTRANE CLIP1 CLIP2 [ROUNDS]');
  process.exit(2);
}

// veltrane bench's scene: bars for the own source, nine layers of checker, gradient and colour,
// Local cut i at ((i + 1) / 9 - 0.5) x 0.8 of the width and +-0.2 of the height, turned 10 + 37i
// degrees, a 4-pixel border, every input the own source.
function benchScene(width, height, cuts) {
  const guid = (i) => `be4c0000-0000-4000-8000-${String(i + 1).padStart(12, '0')}`;
  const sources = [{ pattern: 'checker' }, { pattern: 'gradient' }];
  const layers = Array.from({ length: 9 }, (_, i) => ({
    guid: guid(i),
    name: `Input ${i}`,
    source: i % 3 < 2 ? sources[i % 3] : { color: [0.1 * i, 0.5, 0.3, 1] },
  }));
  const params = { numberOfCuts: cuts, cutType: 'Local', borderWidth: 4 };
  for (let i = 0; i < 8; ++i) {
    params[`cutPosition_${i}`] = [((i + 1) / 9 - 0.5) * width * 0.8, (i % 2 ? 0.2 : -0.2) * height];
    params[`cutDirection_${i}`] = 10 + 37 * i;
  }
  return { width, height, fps: 25, duration: 1, source: { pattern: 'bars' }, layers, params };
}

// CPU milliseconds used so far by the process `root` and everything it started (Linux).
function treeCpuMilliseconds(root) {
  const children = new Map();
  const times = new Map();
  for (const name of readdirSync('/proc')) {
    if (!/^\d+$/.test(name)) continue;
    try {
      const stat = readFileSync(`/proc/${name}/stat`, 'utf8');
      const fields = stat.slice(stat.lastIndexOf(')') + 2).split(' ');
      const parent = Number(fields[1]);
      if (!children.has(parent)) children.set(parent, []);
      children.get(parent).push(Number(name));
      times.set(Number(name), Number(fields[11]) + Number(fields[12]));
    } catch {
      // the process ended meanwhile
    }
  }
  let ticks = 0;
  for (const pending = [root]; pending.length; ) {
    const pid = pending.pop();
    ticks += times.get(pid) ?? 0;
    pending.push(...(children.get(pid) ?? []));
  }
  return ticks * 10; // USER_HZ is 100 on Linux
}

const median = (values) => [...values].sort((a, b) => a - b)[Math.floor(values.length / 2)];
const key = (size, cuts) => `${size} ${cuts}`;
const samples = new Map(); // case -> {native: [], nativeCpu: [], page: [], pageCpu: []}
const jobs = { native: [], page: [] };
const scratch = mkdtempSync(join(tmpdir(), 'veltrane-bench-web-'));
const browser = await openPage();
const { page } = browser;
console.log(`the page's WebGL 2: ${browser.renderer}`);

for (let round = 0; round < rounds; ++round) {
  const native = JSON.parse(
    execFileSync(cli, ['bench', '--sizes', kSizes.join(','), '--cuts', kCuts.join(','), '--inputs', 'own',
      '--repeat', String(kRepeats), '--json']),
  );
  for (const row of native.results) {
    const entry = samples.get(key(`${row.width}x${row.height}`, row.cuts)) ?? { native: [], nativeCpu: [], page: [], pageCpu: [] };
    entry.native.push(row.renderMs + row.uploadMs);
    entry.nativeCpu.push(row.renderCpuMs);
    samples.set(key(`${row.width}x${row.height}`, row.cuts), entry);
  }
  for (const size of kSizes) {
    const [width, height] = size.split('x').map(Number);
    for (const cuts of kCuts) {
      await page.evaluate((scene) => window.veltrane.open(scene), benchScene(width, height, cuts));
      const cpuBefore = treeCpuMilliseconds(browser.pid);
      const milliseconds = await page.evaluate((repeats) => window.veltrane.benchmark(0, repeats), kRepeats);
      const entry = samples.get(key(size, cuts));
      entry.page.push(milliseconds);
      entry.pageCpu.push((treeCpuMilliseconds(browser.pid) - cpuBefore) / kRepeats);
    }
  }

  const output = join(scratch, 'split.mp4');
  rmSync(output, { force: true });
  const started = performance.now();
  execFileSync(cli, ['split', ...clips, '-o', output], { stdio: ['ignore', 'ignore', 'pipe'] });
  const seconds = (performance.now() - started) / 1000;
  const frames = Number(execFileSync('ffprobe', ['-v', 'error', '-count_packets', '-select_streams', 'v:0',
    '-show_entries', 'stream=nb_read_packets', '-of', 'csv=p=0', output]));
  jobs.native.push(frames / seconds);
  // The clips dropped again: the bench scenes replaced them.
  await page.$eval('#open-clips', (input) => {
    input.value = '';
  });
  await (await page.$('#open-clips')).uploadFile(...clips);
  await page.waitForFunction(() => window.veltrane.info()?.layers.length === 3, { timeout: 60000 });
  jobs.page.push(
    await page.evaluate(async () => {
      const begun = performance.now();
      await window.veltrane.export({ container: 'mp4' });
      return window.veltrane.info().duration / ((performance.now() - begun) / 1000);
    }),
  );
}

console.log(`\nmedians of ${rounds} rounds, each the median of ${kRepeats} renders of frame 0`);
console.log('size        cuts  native ms  page ms  page/native  native cpu ms  page cpu ms');
for (const [name, entry] of samples) {
  const [size, cuts] = name.split(' ');
  const native = median(entry.native);
  const inPage = median(entry.page);
  console.log(
    `${size.padEnd(11)} ${cuts.padStart(4)} ${native.toFixed(1).padStart(10)} ${inPage.toFixed(1).padStart(8)}` +
      ` ${(inPage / native).toFixed(2).padStart(12)} ${median(entry.nativeCpu).toFixed(1).padStart(14)}` +
      ` ${median(entry.pageCpu).toFixed(1).padStart(12)}`,
  );
}
console.log(`\n2-clip job: veltrane split ${median(jobs.native).toFixed(1)} frames/s, ` +
  `the page's MP4 export ${median(jobs.page).toFixed(1)} frames/s`);
await browser.close();
rmSync(scratch, { recursive: true, force: true });
