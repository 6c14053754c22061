// Writing the composition as a video file in the browser: every frame rendered at full size,
// encoded with WebCodecs (H.264 in MP4 or VP9 in WebM) and muxed with the first clip's sound
// in Opus. Nothing leaves the machine; the result is a Blob.
import {
  AudioSampleSource,
  BufferTarget,
  Mp4OutputFormat,
  Output,
  QUALITY_HIGH,
  VideoSample,
  VideoSampleSource,
  WebMOutputFormat,
} from '../vendor/mediabunny.js';
import { PageProblem } from './page.js';

const kContainers = {
  mp4: { format: () => new Mp4OutputFormat({ fastStart: 'in-memory' }), codec: 'avc', type: 'video/mp4' },
  webm: { format: () => new WebMOutputFormat(), codec: 'vp9', type: 'video/webm' },
};

// Options: container "mp4" (default) or "webm", first and last frame (the whole composition by
// default), audio (default true). `onProgress({done, total, fps, secondsLeft})` is told after
// every frame; `signal` (an AbortSignal) cancels. The export has the page to itself from the
// moment it is asked for: it starts once the scene opening before it is open, and the page's
// preview waits until it ends, so every frame it reads is one it rendered itself.
export function exportVideo(page, options = {}, onProgress = () => {}, signal = null) {
  return page.exclusive((render) => encode(page, render, options, onProgress, signal));
}

async function encode(page, render, options, onProgress, signal) {
  const container = kContainers[options.container ?? 'mp4'];
  if (!container) throw new PageProblem(`export: container "${options.container}": expected "mp4" or "webm"`);
  const { width, height, fps, duration } = page.info;
  if (container.codec === 'avc' && (width % 2 || height % 2)) {
    throw new PageProblem(`export: H.264 needs an even frame size, the scene is ${width}x${height}`);
  }
  const first = Math.max(0, options.first ?? 0);
  const last = Math.min(duration - 1, options.last ?? duration - 1);
  const total = last - first + 1;
  const output = new Output({ format: container.format(), target: new BufferTarget() });
  const video = new VideoSampleSource({ codec: container.codec, bitrate: QUALITY_HIGH });
  output.addVideoTrack(video, { frameRate: fps });
  const sound = options.audio === false || !page.sourcePath ? null : page.media.audioSamples(page.sourcePath, page.frameSeconds(total));
  const audio = sound ? new AudioSampleSource({ codec: 'opus', bitrate: 128000 }) : null;
  if (audio) output.addAudioTrack(audio);
  await output.start();

  const times = Array.from({ length: total }, (_, i) => page.frameSeconds(first + i));
  page.media.startSequence(times);
  const started = performance.now();
  const shown = page.session.frame();
  try {
    for (let i = 0; i < total; ++i) {
      if (signal?.aborted) throw new DOMException('export cancelled', 'AbortError');
      await page.media.advance();
      // The frame copies the picture out of the WebAssembly's memory once; the sample wraps it.
      const frame = await render(
        first + i,
        1,
        ({ data }) => new VideoFrame(data, { format: 'RGBA', codedWidth: width, codedHeight: height, timestamp: 0 }),
      );
      const sample = new VideoSample(frame, { timestamp: page.frameSeconds(i), duration: page.frameSeconds(1) });
      await video.add(sample);
      sample.close();
      frame.close();
      const seconds = (performance.now() - started) / 1000;
      const rate = (i + 1) / Math.max(seconds, 1e-6);
      onProgress({ done: i + 1, total, fps: rate, secondsLeft: (total - i - 1) / rate });
    }
    if (audio) {
      for await (const sample of sound) {
        if (signal?.aborted) throw new DOMException('export cancelled', 'AbortError');
        await audio.add(sample);
        sample.close();
      }
    }
    await output.finalize();
  } catch (error) {
    await output.cancel();
    throw error;
  } finally {
    page.session.setFrame(shown);
    await page.media.stopSequence();
  }
  return new Blob([output.target.buffer], { type: container.type });
}
