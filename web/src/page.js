// The page's scene: the WebAssembly session in the canvas's context, the media the scene names,
// and the renders (decoding what a render missed and rendering again). Opening anything that
// fails leaves the open scene as it was and throws one line naming the file. Openings, renders
// and exports take turns on the session, so that none of them sees another's scene or picture.
import createVeltrane from '../veltrane.js';
import { installWebGlSeams } from './webgl_seams.js';
import { MediaLibrary, MediaProblem, kVideoKind } from './media.js';

export const kMostClips = 9;
// A render asks again after decoding what it missed; time-shifted inputs may each miss once.
const kMostRenderAttempts = 4;

// A problem the person should read: one line, naming the file and what was expected.
export class PageProblem extends Error {}

// Where a scene's file sources point, for each source the document names.
function fileSources(document) {
  const files = [];
  if (document && typeof document === 'object') {
    if (document.source?.file) files.push(document.source.file);
    for (const layer of Array.isArray(document.layers) ? document.layers : []) {
      if (layer?.source?.file) files.push(layer.source.file);
    }
  }
  return [...new Set(files.filter((file) => typeof file === 'string'))];
}

function baseName(name) {
  return name.split(/[\\/]/).pop() || name;
}

export class Page {
  static async load(canvas) {
    const wasm = await createVeltrane();
    const media = new MediaLibrary();
    wasm.veltraneMedia = media;
    wasm.attachCanvas(`#${canvas.id}`);
    installWebGlSeams(wasm.GL.currentContext.GLctx);
    return new Page(wasm, media, canvas);
  }

  constructor(wasm, media, canvas) {
    this.wasm = wasm;
    this.media = media;
    this.canvas = canvas;
    this.session = new wasm.PageSession();
    this.info = null;
    this.sceneName = 'scene.json';
    this.folder = null;
    this.opened = 0;
    this.sourcePath = null; // the effect's own source, when it is a file: the sound of exports
    this.turns = Promise.resolve(); // settles when the last task given a turn has ended
  }

  // ---- Turns -----------------------------------------------------------------------------------
  // Runs `task` once every task given a turn before it has ended, and gives the next its turn
  // when it ends. A render awaits its clips' decoding, and an export awaits its encoder between
  // renders: the other work of the page (the preview, playing, a scene opening) waits meanwhile,
  // so a picture is read from the render that made it, of the scene the task started with.
  // `task(render)` renders with `render(n, divisor, read)` in its own turn.
  exclusive(task) {
    const turn = this.turns.then(() => task((n, divisor, read) => this.#render(n, divisor, read)));
    this.turns = turn.catch(() => {});
    return turn;
  }

  // ---- Opening ---------------------------------------------------------------------------------
  // A scene document (object or text) named `name`; its file sources come from `files` (name ->
  // Blob) or, failing that, are fetched relative to `baseUrl`.
  openScene(scene, options) {
    return this.exclusive(() => this.#openScene(scene, options));
  }

  async #openScene(scene, { name = 'scene.json', files = new Map(), baseUrl = null } = {}) {
    const text = typeof scene === 'string' ? scene : JSON.stringify(scene, null, 2);
    let document = null;
    try {
      document = JSON.parse(text);
    } catch {
      // The scene reader words it, naming the file.
    }
    const folder = `/scenes/${++this.opened}`;
    this.makeFolder(folder);
    for (const file of fileSources(document)) {
      const blob = files.get(file) ?? files.get(baseName(file)) ?? (await this.fetchFile(file, baseUrl));
      if (!blob) continue; // the scene reader reports the file as missing
      const path = `${folder}/${file}`;
      this.makeFolder(path.slice(0, path.lastIndexOf('/')));
      this.wasm.FS.writeFile(path, new Uint8Array(0));
      try {
        await this.media.add(path, blob, file);
      } catch (error) {
        throw error instanceof MediaProblem ? new PageProblem(error.message) : error;
      }
    }
    const refusal = this.session.open(text, `${folder}/${name}`);
    if (refusal) throw new PageProblem(refusal.replace(`${folder}/`, ''));
    this.folder = folder;
    this.sceneName = name;
    this.info = JSON.parse(this.session.describe());
    this.sourcePath = document?.source?.file ? `${folder}/${document.source.file}` : null;
    this.resize();
    return this.info;
  }

  openUrl(url) {
    return this.exclusive(async () => {
      const response = await fetch(url);
      if (!response.ok) throw new PageProblem(`${url}: cannot be read (${response.status})`);
      const name = baseName(new URL(url, location.href).pathname) || 'scene.json';
      return this.#openScene(await response.text(), { name, baseUrl: new URL(url, location.href) });
    });
  }

  async fetchFile(file, baseUrl) {
    if (!baseUrl) return null;
    const response = await fetch(new URL(file, baseUrl));
    return response.ok ? response.blob() : null;
  }

  // Clips and photos dropped together (at most nine): the first is the effect's own source,
  // the others layers, the composition sized and timed as `veltrane split` makes it, each
  // picture kept at its proportions and framed on its region of the default layout.
  openClips(fileList) {
    return this.exclusive(() => this.#openClips([...fileList]));
  }

  async #openClips(clips) {
    if (clips.length > kMostClips) {
      throw new PageProblem(
        `${clips.length} files dropped: at most ${kMostClips} clips or photos (one for each input)`,
      );
    }
    const probe = new MediaLibrary();
    const facts = [];
    for (const clip of clips) {
      try {
        facts.push(await probe.add(clip.name, clip, clip.name));
      } catch (error) {
        throw error instanceof MediaProblem ? new PageProblem(error.message) : error;
      }
    }
    // The composition runs at the first video's rate (the first clip's when it is one), as
    // `veltrane split` chooses it, else at 25 frames a second.
    const first = facts[0];
    const video = facts.find((entry) => entry.kind === kVideoKind && entry.frameRate > 0);
    const rateText = video ? this.wasm.clipRateText(video.frameRate) : '25';
    const [numerator, denominator = 1] = rateText.split('/').map(Number);
    const rate = numerator / denominator;
    const framesOf = (entry) =>
      entry.kind === kVideoKind && entry.duration > 0 ? Math.max(1, Math.ceil(entry.duration * rate - 1e-6)) : 0;
    const longest = Math.max(0, ...facts.map(framesOf));
    const duration = Math.max(framesOf(first) || longest, 1);
    const even = (value) => Math.max(2, Math.round(value / 2) * 2);
    const names = clips.map((clip) => clip.name);
    const source = (i) => ({ file: names[i], fit: 'contain' });
    const layers = names.slice(1).map((name, i) => ({
      guid: `5b1170e0-0000-4000-8000-${String(i + 1).padStart(12, '0')}`,
      name,
      source: source(i + 1),
      frameCount: duration,
    }));
    const scene = {
      description: `split of ${clips.length} clip${clips.length === 1 ? '' : 's'}`,
      width: first.width > 0 ? even(first.width) : 1920,
      height: first.height > 0 ? even(first.height) : 1080,
      fps: denominator === 1 ? numerator : rateText,
      duration,
      source: source(0),
      layers,
      params: {},
    };
    const files = new Map(clips.map((clip) => [clip.name, clip]));
    await this.#openScene(scene, { name: 'split.json', files });
    this.applyLayout(this.info.layouts.findIndex((l) => l.name === this.info.defaultLayout));
    // Every layer input shows one clip: the layout chose which region shows which.
    return this.info;
  }

  makeFolder(path) {
    let at = '';
    for (const part of path.split('/').filter(Boolean)) {
      at += `/${part}`;
      if (!this.wasm.FS.analyzePath(at).exists) this.wasm.FS.mkdir(at);
    }
  }

  // ---- The scene in the session ----------------------------------------------------------------
  state() {
    return JSON.parse(this.session.state());
  }

  applyLayout(index) {
    const refusal = this.session.applyLayout(index);
    if (refusal) throw new PageProblem(refusal);
  }

  edit(id, value) {
    const refusal = this.session.edit(id, JSON.stringify(value));
    if (refusal) throw new PageProblem(refusal);
  }

  // The scene as `veltrane render` reads it, with the values as they are now.
  saveScene() {
    const path = `${this.folder}/${this.sceneName}`;
    const refusal = this.session.save(path);
    if (refusal) throw new PageProblem(refusal);
    return this.wasm.FS.readFile(path, { encoding: 'utf8' });
  }

  // ---- Showing ---------------------------------------------------------------------------------
  resize() {
    const density = window.devicePixelRatio || 1;
    const width = Math.max(1, Math.round(this.canvas.clientWidth * density));
    const height = Math.max(1, Math.round(this.canvas.clientHeight * density));
    if (this.canvas.width !== width) this.canvas.width = width;
    if (this.canvas.height !== height) this.canvas.height = height;
    this.session.setCanvasSize(width, height, density);
  }

  // Renders frame `n` at 1 / divisor of its size in a turn of its own; resolves to what
  // `read(picture)` makes of the picture, when given (see #render).
  render(n, divisor = 1, read = null) {
    return this.exclusive((render) => render(n, divisor, read));
  }

  // Renders frame `n` at 1 / divisor of its size, decoding what it missed and rendering again,
  // and returns `read({width, height, data})` when given (the picture is read back only then):
  // RGBA bytes, top row first, in a view of the WebAssembly's memory that is valid only while
  // `read` runs (the next call into the WebAssembly may move its memory).
  async #render(n, divisor, read) {
    let failure = '';
    for (let attempt = 0; attempt < kMostRenderAttempts; ++attempt) {
      // Set at each attempt: the timeline moves the frame while the clips are decoded.
      this.session.setFrame(n);
      this.media.beginRender();
      failure = this.session.render(divisor);
      const misses = this.media.takeMisses();
      if (misses.length === 0) break;
      await this.media.prepare(misses);
    }
    if (failure) throw new PageProblem(failure);
    return read ? read(this.#pictureView()) : undefined;
  }

  // Where composition frame `n` lies in seconds, exactly as the host computes it from the
  // composition's rate, so that the frames decoded for it are found under the same time.
  frameSeconds(n) {
    const [numerator, denominator] = this.info.rate;
    return (n * denominator) / numerator;
  }

  present() {
    this.session.present();
  }

  #pictureView() {
    const width = this.session.pictureWidth();
    const height = this.session.pictureHeight();
    return { width, height, data: this.session.readPicture() };
  }
}
