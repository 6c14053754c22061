// Every example scene rendered in the page against `veltrane render` of the same frames. The
// page's WebGL 2 runs on SwiftShader, the command line's GL on llvmpipe: both rasterise the same
// triangles and sample the same textures, but round sample positions and the border's
// anti-aliased edge slightly differently. So a channel may differ by at most 2 anywhere except
// along the cuts, and the pixels beyond that (edge pixels covered differently) stay under 1 %.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, readdirSync, rmSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { basename, join, resolve } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage } from '../../web/headless.mjs';
import { difference, pageFrame, pngPixels } from './page_frames.mjs';

const kAllowedChannelDifference = 2;
const kAllowedShareBeyond = 0.01;

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
      assert.ok(
        share <= kAllowedShareBeyond,
        `frame ${frame}: ${(share * 100).toFixed(2)} % of pixels differ by more than ${kAllowedChannelDifference} (largest ${largest})`,
      );
    }
    assert.deepEqual(browser.problems, []);
  });
}
