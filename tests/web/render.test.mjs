// Every example scene rendered in the page against `veltrane render` of the same frames. The
// page's WebGL 2 runs on SwiftShader, the command line's GL on llvmpipe: both rasterise the same
// triangles and sample the same textures, but round texture coordinates and edge coverage
// slightly differently, which shows where a picture is turned or scaled (its texels' edges) and
// along the border's anti-aliased edge. So at most 2 % of the pixels may differ by more than 2 in
// a channel, and none by more than 16: a wrong region, input or frame differs by far more.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, readdirSync, rmSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { basename, join, resolve } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage } from '../../web/headless.mjs';
import { difference, pageFrame, pngPixels } from './page_frames.mjs';

const kAllowedChannelDifference = 2;
const kAllowedShareBeyond = 0.02;
const kLargestAllowed = 16;

const examples = new URL('../../docs/examples', import.meta.url).pathname;
const cli = process.env.VELTRANE_CLI;
// The demo moves a cut over time and shows the counter one second ahead: three frames of it.
const scenes = [
  { file: join(examples, 'demo.json'), frames: [0, 40, 74] },
  ...readdirSync(join(examples, 'presets'))
    .filter((name) => name.endsWith('.json'))
    .map((name) => ({ file: join(examples, 'presets', name), frames: [0] })),
];

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

for (const { file, frames } of scenes) {
  test(`${basename(file)} renders in the page as veltrane render does`, async () => {
    await browser.page.evaluate((text) => window.veltrane.open(text), readFileSync(file, 'utf8'));
    for (const frame of frames) {
      const png = join(scratch, `${basename(file, '.json')}-${frame}.png`);
      execFileSync(cli, ['render', file, '-o', png, '--frame', String(frame)]);
      const native = pngPixels(png);
      const inPage = await pageFrame(browser.page, frame);
      assert.equal(inPage.data.length, native.length, `frame ${frame}: size`);
      const { largest, share } = difference(inPage.data, native, kAllowedChannelDifference);
      console.log(`${basename(file)} frame ${frame}: largest ${largest}, ${(share * 100).toFixed(2)} % beyond ${kAllowedChannelDifference}`);
      assert.ok(largest <= kLargestAllowed, `frame ${frame}: a channel differs by ${largest}`);
      assert.ok(
        share <= kAllowedShareBeyond,
        `frame ${frame}: ${(share * 100).toFixed(2)} % of pixels differ by more than ${kAllowedChannelDifference} (largest ${largest})`,
      );
    }
    assert.deepEqual(browser.problems, []);
  });
}
