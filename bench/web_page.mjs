// The page's costs in headless Chromium (software WebGL 2): milliseconds per frame of the
// module's render at 640x360 and 1280x720 for 1, 4 and 8 Local cuts on the scene `veltrane
// bench` renders (colour bars, nine layers, cut i at the same place), and frames per second of
// a 2-clip 720p MP4 export. scripts/bench-web prints them beside the native figures.
//
//   node bench/web_page.mjs CLIP1 CLIP2        (the page built by scripts/web)
import { openPage } from '../web/headless.mjs';

const kSizes = [
  [640, 360],
  [1280, 720],
];
const kCuts = [1, 4, 8];
const kRepeats = 15;

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

const browser = await openPage();
const { page } = browser;
console.log('size        cuts   page ms/frame');
for (const [width, height] of kSizes) {
  for (const cuts of kCuts) {
    const milliseconds = await page.evaluate(
      async (scene, repeats) => {
        await window.veltrane.open(scene);
        return window.veltrane.benchmark(0, repeats);
      },
      benchScene(width, height, cuts),
      kRepeats,
    );
    console.log(`${`${width}x${height}`.padEnd(11)} ${String(cuts).padStart(4)} ${milliseconds.toFixed(2).padStart(15)}`);
  }
}

const clips = process.argv.slice(2);
if (clips.length === 2) {
  const chooser = await page.$('#open-clips');
  await chooser.uploadFile(...clips);
  await page.waitForFunction(() => window.veltrane.info()?.layers.length === 3, { timeout: 60000 });
  const { frames, seconds } = await page.evaluate(async () => {
    const started = performance.now();
    await window.veltrane.export({ container: 'mp4' });
    return { frames: window.veltrane.info().duration, seconds: (performance.now() - started) / 1000 };
  });
  console.log(`export of ${clips.length} clips, ${frames} frames: ${(frames / seconds).toFixed(1)} frames/s in the page`);
}
await browser.close();
