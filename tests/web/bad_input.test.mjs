// What the page says about input it cannot use: one line naming the file and what was
// expected, and the scene a person made stays as it was.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, rmSync, writeFileSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage } from '../../web/headless.mjs';

let browser;
let scratch;

before(async () => {
  scratch = mkdtempSync(join(tmpdir(), 'veltrane-web-bad-'));
  writeFileSync(join(scratch, 'noise.mp4'), Buffer.from(Array.from({ length: 4096 }, (_, i) => (i * 37) % 251)));
  execFileSync('ffmpeg', ['-v', 'error', '-y', '-f', 'lavfi', '-i', 'sine=duration=1', '-c:a', 'aac', join(scratch, 'tone.m4a')]);
  execFileSync('ffmpeg', ['-v', 'error', '-y', '-f', 'lavfi', '-i', 'testsrc2=size=64x64', '-frames:v', '1', join(scratch, 'still.png')]);
  writeFileSync(join(scratch, 'narrow.json'), JSON.stringify({ width: -5, height: 360, fps: 25, duration: 10, source: { pattern: 'bars' } }));
  writeFileSync(join(scratch, 'unknown.json'), JSON.stringify({ width: 64, height: 64, fps: 25, duration: 1, source: { pattern: 'bars' }, params: { borderWidth: 'wide' } }));
  browser = await openPage();
  // Something of the person's own: a drag-free edit the bad input must not take away.
  await browser.page.evaluate(() => window.veltrane.open({ width: 320, height: 180, fps: 25, duration: 10, source: { pattern: 'checker' } }));
});
after(async () => {
  await browser?.close();
  if (scratch) rmSync(scratch, { recursive: true, force: true });
});

const cases = [
  { files: ['noise.mp4'], says: /^noise\.mp4: the browser cannot decode it \(expected a video clip or a photo\)$/ },
  { files: ['tone.m4a'], says: /^tone\.m4a: holds no video \(expected a clip with a picture, or a photo\)$/ },
  { files: Array(10).fill('still.png'), says: /^10 files dropped: at most 9 clips or photos/ },
  { files: ['narrow.json'], says: /^narrow\.json: width: expected .*1.*16384/ },
  { files: ['unknown.json'], says: /^unknown\.json: params\.borderWidth: expected/ },
];

for (const { files, says } of cases) {
  test(`${files[0]}${files.length > 1 ? ` x${files.length}` : ''}: one line, the scene kept`, async () => {
    const before = await browser.page.evaluate(() => JSON.stringify([window.veltrane.info(), window.veltrane.state()]));
    const chooser = await browser.page.$(files[0].endsWith('.json') ? '#open-scene' : '#open-clips');
    await chooser.uploadFile(...files.map((file) => join(scratch, file)));
    await browser.page.waitForFunction(() => !document.getElementById('message').hidden, { timeout: 20000 });
    const message = await browser.page.$eval('#message', (node) => node.textContent);
    assert.match(message, says);
    assert.ok(!message.includes('\n'), 'one line');
    const afterwards = await browser.page.evaluate(() => JSON.stringify([window.veltrane.info(), window.veltrane.state()]));
    assert.equal(afterwards, before);
    await browser.page.evaluate(() => {
      document.getElementById('message').hidden = true;
      for (const input of document.querySelectorAll('input[type=file]')) input.value = '';
    });
  });
}
