// Pictures out of the page and out of the command line as RGBA bytes, top row first, and how far
// two of them differ.
import { execFileSync } from 'node:child_process';

// Composition frame n of the scene open in the page.
export async function pageFrame(page, n) {
  const { width, height, base64 } = await page.evaluate(async (frame) => {
    const { width, height, data } = await window.veltrane.frame(frame);
    let text = '';
    for (let i = 0; i < data.length; i += 0x8000) {
      text += String.fromCharCode(...data.subarray(i, i + 0x8000));
    }
    return { width, height, base64: btoa(text) };
  }, n);
  return { width, height, data: Buffer.from(base64, 'base64') };
}

// A PNG file's pixels, through FFmpeg.
export function pngPixels(path) {
  return execFileSync('ffmpeg', ['-v', 'error', '-i', path, '-f', 'rawvideo', '-pix_fmt', 'rgba', '-'], {
    maxBuffer: 1 << 28,
  });
}

// The largest channel difference, and the share of pixels where any channel differs by more
// than `allowed`.
export function difference(a, b, allowed) {
  let largest = 0;
  let beyond = 0;
  for (let i = 0; i < a.length; i += 4) {
    let pixel = 0;
    for (let c = 0; c < 4; ++c) pixel = Math.max(pixel, Math.abs(a[i + c] - b[i + c]));
    largest = Math.max(largest, pixel);
    if (pixel > allowed) ++beyond;
  }
  return { largest, share: beyond / (a.length / 4) };
}
