// Clips opened in the page as a person opens them (the file chooser) and exported in both
// containers: FFmpeg's probe reads back the size, frame count, rate and the first clip's sound.
// The export is asked for in the step that gives the clips and starts playing: it must export
// the clips' scene, not the one open before, while the preview keeps asking for renders.
// Nothing is fetched from anywhere while the page works.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { basename, join } from 'node:path';
import { after, before, test } from 'node:test';
import { openPage } from '../../web/headless.mjs';

let browser;
let scratch;
const clips = [];

function ffmpeg(...args) {
  execFileSync('ffmpeg', ['-v', 'error', '-y', ...args]);
}

function probe(file) {
  const text = execFileSync('ffprobe', [
    '-v', 'error', '-count_frames', '-show_entries',
    'stream=codec_type,codec_name,width,height,r_frame_rate,nb_read_frames', '-of', 'json', file,
  ]);
  return JSON.parse(text).streams;
}

before(async () => {
  scratch = mkdtempSync(join(tmpdir(), 'veltrane-web-export-'));
  // Two seconds at 25 frames a second: a test card with a tone, and bars without sound.
  clips.push(join(scratch, 'card.mp4'), join(scratch, 'bars.mp4'));
  ffmpeg('-f', 'lavfi', '-i', 'testsrc2=size=320x240:rate=25:duration=2', '-f', 'lavfi', '-i',
    'sine=frequency=440:duration=2', '-c:v', 'libx264', '-pix_fmt', 'yuv420p', '-c:a', 'aac', '-shortest', clips[0]);
  ffmpeg('-f', 'lavfi', '-i', 'smptebars=size=256x256:rate=30:duration=3', '-c:v', 'libx264', '-pix_fmt', 'yuv420p', clips[1]);
  browser = await openPage();
});
after(async () => {
  await browser?.close();
  if (scratch) rmSync(scratch, { recursive: true, force: true });
});

const containers = [
  { container: 'mp4', video: 'h264' },
  { container: 'webm', video: 'vp9' },
];

for (const { container, video } of containers) {
  test(`two clips exported as ${container} as they open: the first one's size, length, rate and sound`, async () => {
    // A scene of another size and length open before, which an export that did not wait for
    // the clips would write.
    await browser.page.evaluate(() =>
      window.veltrane.open({ width: 64, height: 36, fps: 25, duration: 5, source: { pattern: 'bars' } }),
    );
    const loadedRequests = browser.requests.length;
    const files = clips.map((file) => ({ name: basename(file), base64: readFileSync(file).toString('base64') }));
    const base64 = await browser.page.evaluate(async (format, files) => {
      const chooser = document.getElementById('open-clips');
      const transfer = new DataTransfer();
      for (const { name, base64 } of files) {
        transfer.items.add(new File([Uint8Array.from(atob(base64), (c) => c.charCodeAt(0))], name));
      }
      chooser.files = transfer.files;
      document.getElementById('play').click();
      chooser.dispatchEvent(new Event('change'));
      try {
        const blob = await window.veltrane.export({ container: format });
        const bytes = new Uint8Array(await blob.arrayBuffer());
        let text = '';
        for (let i = 0; i < bytes.length; i += 0x8000) text += String.fromCharCode(...bytes.subarray(i, i + 0x8000));
        return btoa(text);
      } finally {
        document.getElementById('play').click();
      }
    }, container, files);
    const file = join(scratch, `split.${container}`);
    writeFileSync(file, Buffer.from(base64, 'base64'));
    const streams = probe(file);
    const picture = streams.find((s) => s.codec_type === 'video');
    const sound = streams.find((s) => s.codec_type === 'audio');
    assert.deepEqual(
      [picture.codec_name, picture.width, picture.height, picture.r_frame_rate, Number(picture.nb_read_frames)],
      [video, 320, 240, '25/1', 50],
    );
    assert.equal(sound?.codec_name, 'opus');
    assert.deepEqual(browser.requests.slice(loadedRequests).filter((url) => !url.startsWith('blob:')), []);
    assert.deepEqual(browser.problems, []);
  });
}
