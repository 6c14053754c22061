// The clips and photos a person gave the page, decoded by the browser and answered to the
// WebAssembly host by the names its scene gives them. What a file is comes from its content,
// never its name. Video frames are decoded ahead of a render (the host asks for them
// synchronously): a frame the render asked for and did not find is a miss, decoded before the
// render is done again. A decoded frame is kept as the host takes it, RGBA bytes as stored
// with the turn that shows it, converted once by the decoder's own copy (no canvas between).
import { ALL_FORMATS, AudioSampleSink, BlobSource, Input, VideoSampleSink } from '../vendor/mediabunny.js';

export const kVideoKind = 1;
const kStill = 2;
// Frames kept per clip beyond those the last render used.
const kKeptFrames = 48;

const timeKey = (seconds) => Math.round(seconds * 1e6);
// A frame whose time equals the time asked for is shown at it, whatever rounding the two
// computations of that time met: the decoder is asked a little after it.
const kSameTime = 1e-7;
const decoderTime = (entry, seconds) => entry.first + Math.max(seconds, 0) + kSameTime;

// A problem with a file, worded as the page shows it: the file's name, then what was expected.
export class MediaProblem extends Error {}

async function openVideo(name, blob) {
  let input;
  try {
    input = new Input({ source: new BlobSource(blob), formats: ALL_FORMATS });
    await input.getFormat();
  } catch {
    return null; // not a container the browser's demuxer knows: perhaps a photo
  }
  const video = await input.getPrimaryVideoTrack();
  if (!video) {
    throw new MediaProblem(`${name}: holds no video (expected a clip with a picture, or a photo)`);
  }
  if (!(await video.canDecode())) {
    const codec = (await video.getCodecParameterString()) || video.codec || 'unknown';
    throw new MediaProblem(
      `${name}: this browser cannot decode its video (${codec}); expected H.264, VP8, VP9 or AV1`,
    );
  }
  const first = await video.getFirstTimestamp();
  const stats = await video.computePacketStats(120);
  const end = await input.computeDuration();
  const audio = await input.getPrimaryAudioTrack();
  const hasAudio = !!audio && (await audio.canDecode());
  return {
    kind: kVideoKind,
    name,
    input,
    audio: hasAudio ? audio : null,
    first,
    // The picture as players show it: upright, at square pixels.
    width: video.displayWidth,
    height: video.displayHeight,
    frameRate: stats.averagePacketRate || 25,
    duration: Math.max(end - first, 0),
    sink: new VideoSampleSink(video),
    frames: new Map(), // time key -> picture
    last: null, // the picture decoded last, which the next time may show again
    used: new Set(),
    sequence: null,
  };
}

async function openStill(name, blob) {
  let bitmap;
  try {
    // Photos stand as cameras meant them: EXIF orientation applied.
    bitmap = await createImageBitmap(blob, { imageOrientation: 'from-image' });
  } catch {
    return null;
  }
  const canvas = new OffscreenCanvas(bitmap.width, bitmap.height);
  // Read back once: kept in the CPU's memory, not the GPU's.
  const context = canvas.getContext('2d', { willReadFrequently: true });
  context.drawImage(bitmap, 0, 0);
  const pixels = context.getImageData(0, 0, bitmap.width, bitmap.height).data;
  bitmap.close();
  return { kind: kStill, name, width: canvas.width, height: canvas.height, pixels };
}

export class MediaLibrary {
  constructor() {
    this.entries = new Map(); // path in the page's file system -> entry
    this.misses = [];
  }

  // Decodes enough of the file to know what it is; throws MediaProblem naming `name`.
  async add(path, blob, name) {
    const entry = (await openVideo(name, blob)) ?? (await openStill(name, blob));
    if (!entry) {
      throw new MediaProblem(
        `${name}: the browser cannot decode it (expected a video clip or a photo)`,
      );
    }
    this.entries.set(path, entry);
    return entry;
  }

  get(path) {
    return this.entries.get(path);
  }

  // ---- Answers to the WebAssembly host, synchronous -------------------------------------------
  describe(path) {
    const entry = this.entries.get(path);
    if (!entry) return { problem: 'the page was not given this file' };
    return {
      kind: entry.kind,
      width: entry.width,
      height: entry.height,
      frameRate: entry.kind === kVideoKind ? entry.frameRate : 0,
      duration: entry.kind === kVideoKind ? entry.duration : 0,
      hasAudio: entry.kind === kVideoKind && !!entry.audio,
    };
  }

  // The picture shown `seconds` into the clip ({width, height, rotation, flip, pixels}), or
  // null before any of the clip is decoded.
  videoFrame(path, seconds) {
    const entry = this.entries.get(path);
    const key = timeKey(seconds);
    let picture = entry.frames.get(key);
    if (!picture) {
      this.misses.push({ path, seconds });
      picture = nearestFrame(entry, key);
    }
    entry.used.add(key);
    return picture;
  }

  imagePixels(path) {
    return this.entries.get(path).pixels;
  }

  // ---- Before and after a render ---------------------------------------------------------------
  beginRender() {
    this.misses = [];
    for (const entry of this.videos()) entry.used.clear();
  }

  // The frames the render asked for and did not find.
  takeMisses() {
    const misses = this.misses;
    this.misses = [];
    return misses;
  }

  // Decodes the frames missed, each the latest at or before its time (the first before the
  // first).
  async prepare(misses) {
    for (const { path, seconds } of misses) {
      const entry = this.entries.get(path);
      const key = timeKey(seconds);
      if (entry.frames.has(key)) continue;
      const sample =
        (await entry.sink.getSample(decoderTime(entry, seconds))) ?? (await entry.sink.getSample(entry.first));
      if (sample) entry.frames.set(key, await pictureOf(entry, sample));
    }
    this.forgetUnused();
  }

  // Frames a render going forward will ask for: every clip's frames at `times` (seconds) are
  // decoded in order, each packet once, and taken one time after another by advance().
  startSequence(times) {
    for (const entry of this.videos()) {
      entry.sequence = {
        times,
        next: 0,
        iterator: entry.sink.samplesAtTimestamps(times.map((t) => decoderTime(entry, t))),
      };
    }
  }

  async advance() {
    for (const entry of this.videos()) {
      const sequence = entry.sequence;
      if (!sequence || sequence.next >= sequence.times.length) continue;
      const { value } = await sequence.iterator.next();
      const key = timeKey(sequence.times[sequence.next++]);
      if (value) entry.frames.set(key, await pictureOf(entry, value));
    }
    this.forgetUnused();
  }

  async stopSequence() {
    for (const entry of this.videos()) {
      if (entry.sequence) await entry.sequence.iterator.return();
      entry.sequence = null;
    }
  }

  // A clip's sound as decoded samples for its first `seconds`, or nothing.
  audioSamples(path, seconds) {
    const entry = this.entries.get(path);
    if (!entry || !entry.audio) return null;
    return new AudioSampleSink(entry.audio).samples(entry.first, entry.first + seconds);
  }

  *videos() {
    for (const entry of this.entries.values()) if (entry.kind === kVideoKind) yield entry;
  }

  forgetUnused() {
    for (const entry of this.videos()) {
      const surplus = entry.frames.size - entry.used.size - kKeptFrames;
      if (surplus <= 0) continue;
      let dropped = 0;
      for (const key of entry.frames.keys()) {
        if (dropped >= surplus) break;
        if (entry.used.has(key)) continue;
        entry.frames.delete(key);
        ++dropped;
      }
    }
  }
}

// The sample's pixels as RGBA bytes in sRGB, converted from the decoder's own format with the
// stream's colour description; the sample is closed. A time that shows the same frame as the
// one before shares its picture.
async function pictureOf(entry, sample) {
  try {
    if (entry.last?.timestamp === sample.timestamp) return entry.last;
    const width = sample.codedWidth;
    const height = sample.codedHeight;
    const pixels = new Uint8Array(width * height * 4);
    await sample.copyTo(pixels, { format: 'RGBA', colorSpace: 'srgb' });
    entry.last = { timestamp: sample.timestamp, width, height, rotation: sample.rotation, flip: sample.flip, pixels };
    return entry.last;
  } finally {
    sample.close();
  }
}

// Until the frame is decoded, the one nearest in time stands in for it.
function nearestFrame(entry, key) {
  let best = null;
  let distance = Infinity;
  for (const [at, picture] of entry.frames) {
    if (Math.abs(at - key) < distance) {
      distance = Math.abs(at - key);
      best = picture;
    }
  }
  return best;
}
