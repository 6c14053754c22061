// Every example scene, and a scene of clips, rendered in the page against `veltrane render` of
// the same frames. On llvmpipe the page's WebGL 2 rasterises as the command line's GL does, to
// within 1 in a channel; SwiftShader (VELTRANE_WEBGL=swiftshader) rounds texture coordinates and
// edge coverage slightly differently, which shows where a picture is turned or scaled (its
// texels' edges) and along the border's anti-aliased edge. Clips go through the browser's
// decoders, whose YUV conversion filters luma edges otherwise than FFmpeg's (by up to 42 along
// sharp edges, in 0.6 % of the pixels beyond 16), where a neighbouring frame or a picture
// turned the wrong way differs in 1.5 % or more.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, readdirSync, rmSync, writeFileSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { basename, join } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage, webGlBackend } from '../../web/headless.mjs';
import { difference, pageFrame, pngPixels } from './page_frames.mjs';

// How far a frame may differ: `share` of the pixels by more than `channel`, none by more than
// `largest`.
const kRenderTolerance = {
  llvmpipe: { channel: 1, share: 0, largest: 1 },
  swiftshader: { channel: 2, share: 0.02, largest: 16 },
}[webGlBackend];
const kClipTolerance = { channel: 16, share: 0.01, largest: 255 };

const examples = new URL('../../docs/examples', import.meta.url).pathname;
const cli = process.env.VELTRANE_CLI;
// The demo moves a cut over time and shows the counter one second ahead: three frames of it.
const scenes = [
  { file: join(examples, 'demo.json'), frames: [0, 40, 74] },
  ...readdirSync(join(examples, 'presets'))
    .filter((name) => name.endsWith('.json'))
    .map((name) => ({ file: join(examples, 'presets', name), frames: [0] })),
];

// Two grey clips (their colours the same under any YUV matrix): the own source stored on its
// side with a display rotation, and a layer at twice the frame's size, half a second ahead.
function writeClipScene(folder) {
  const ffmpeg = (...args) => execFileSync('ffmpeg', ['-v', 'error', '-y', ...args]);
  const grey = ['-vf', 'hue=s=0', '-c:v', 'libx264', '-qp', '0', '-pix_fmt', 'yuv420p'];
  ffmpeg('-f', 'lavfi', '-i', 'testsrc2=size=320x240:rate=25:duration=2', ...grey, join(folder, 'stored.mp4'));
  ffmpeg('-i', join(folder, 'stored.mp4'), '-c', 'copy', '-metadata:s:v:0', 'rotate=90', join(folder, 'turned.mp4'));
  ffmpeg('-f', 'lavfi', '-i', 'testsrc=size=480x640:rate=25:duration=2', ...grey, join(folder, 'tall.mp4'));
  const guid = 'c11b0000-0000-4000-8000-000000000001';
  const scene = {
    width: 240,
    height: 320,
    fps: 25,
    duration: 50,
    source: { file: 'turned.mp4' },
    layers: [{ guid, name: 'Tall', source: { file: 'tall.mp4' } }],
    params: { numberOfCuts: 1, cutPosition_0: [0, 0], cutDirection_0: 30, inputLayer1: guid, inputFrameShift1: 12 },
  };
  writeFileSync(join(folder, 'clips.json'), JSON.stringify(scene));
  return ['clips.json', 'turned.mp4', 'tall.mp4'].map((name) => join(folder, name));
}

let browser;
let scratch;
before(async () => {
  assert.ok(cli, 'VELTRANE_CLI must name the veltrane command line (CTest sets it)');
  scratch = mkdtempSync(join(tmpdir(), 'veltrane-web-render-'));
  browser = await openPage();
});
after(async () => {
  await browser?.close();
  if (scratch) rmSync(scratch, { recursive: true, force: true });
});

// The page's frames of the scene open in it against the command line's renders of `file`.
async function expectFramesAlike(file, frames, tolerance) {
  for (const frame of frames) {
    const png = join(scratch, `${basename(file, '.json')}-${frame}.png`);
    execFileSync(cli, ['render', file, '-o', png, '--frame', String(frame)]);
    const native = pngPixels(png);
    const inPage = await pageFrame(browser.page, frame);
    assert.equal(inPage.data.length, native.length, `frame ${frame}: size`);
    const { largest, share } = difference(inPage.data, native, tolerance.channel);
    const beyond = `${(share * 100).toFixed(2)} % of pixels differ by more than ${tolerance.channel}`;
    console.log(`${basename(file)} frame ${frame}: largest ${largest}, ${beyond}`);
    assert.ok(largest <= tolerance.largest, `frame ${frame}: a channel differs by ${largest}`);
    assert.ok(share <= tolerance.share, `frame ${frame}: ${beyond} (largest ${largest})`);
  }
  assert.deepEqual(browser.problems, []);
}

for (const { file, frames } of scenes) {
  test(`${basename(file)} renders in the page as veltrane render does`, async () => {
    await browser.page.evaluate((text) => window.veltrane.open(text), readFileSync(file, 'utf8'));
    await expectFramesAlike(file, frames, kRenderTolerance);
  });
}

test('clips show the frames veltrane render shows, upright and stretched alike', async () => {
  const files = writeClipScene(scratch);
  await (await browser.page.$('#open-scene')).uploadFile(...files);
  await browser.page.waitForFunction(() => window.veltrane.info()?.layers.some((l) => l.name === 'Tall'), { timeout: 30000 });
  await expectFramesAlike(files[0], [0, 13, 37], kClipTolerance);
});
