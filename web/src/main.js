// The page's controls: dropping and opening clips and scenes, the layout menu, the panel, the
// picture's mouse and keys (delivered to the module as its viewer events), the timeline, undo,
// export, and the automation API on window.veltrane.
import { exportVideo } from './exporter.js';
import { installApi } from './api.js';
import { Page, PageProblem } from './page.js';
import { ParameterPanel } from './panel.js';

const $ = (id) => document.getElementById(id);

// The scene the page opens with: two generated pictures along the diagonal.
const kStartScene = {
  description: 'Colour bars and a gradient, split along the diagonal',
  width: 1280,
  height: 720,
  fps: 25,
  duration: 250,
  source: { pattern: 'bars' },
  layers: [{ guid: '5b1170e0-0000-4000-8000-000000000001', name: 'Gradient', source: { pattern: 'gradient' } }],
};

// X11 keysyms, as the module's viewer events number keys.
const kKeysyms = { Shift: 65505, Escape: 65307 };
// The module's cursor numbers as the browser draws them (rotation and diagonal resizing have no
// cursor of their own: the crosshair says "drag in any direction").
function cssCursor(shape) {
  if (shape === 3) return 'move';
  if (shape === 6) return 'ns-resize';
  if (shape === 8) return 'ew-resize';
  if (shape === 7 || shape === 9 || (shape >= 10 && shape <= 17)) return 'crosshair';
  if (shape === 19) return 'text';
  return 'default';
}

class Controller {
  constructor(page) {
    this.page = page;
    this.shownKey = null; // what the picture on the canvas shows
    this.busy = false;
    this.again = false;
    this.playing = false;
    this.dragging = false;
    this.panel = new ParameterPanel($('panel'), {
      onEdit: (id, value) => this.act(() => page.edit(id, value)),
      onEditEnd: () => page.session.finishEdit(),
      onKey: (id) => this.act(() => page.session.toggleKey(id)),
    });
  }

  // ---- Messages --------------------------------------------------------------------------------
  say(text, note = false) {
    const message = $('message');
    message.textContent = text;
    message.classList.toggle('note', note);
    message.hidden = !text;
  }

  // Runs a change, shows its problem (if any) in one line, and brings the page up to date.
  async act(change) {
    try {
      await change();
      this.say('');
    } catch (error) {
      if (!(error instanceof PageProblem)) console.error(error);
      this.say(error.message);
    }
    this.refresh();
  }

  // ---- Scenes ------------------------------------------------------------------------------------
  opened() {
    const { info } = this.page;
    this.panel.build(info);
    const layout = $('layout');
    layout.replaceChildren(new Option('Choose…', ''));
    info.layouts.forEach((entry, i) => layout.append(new Option(entry.menuName, i)));
    $('frame').max = info.duration - 1;
    $('frame').value = 0;
    this.shownKey = null;
    this.refresh();
  }

  async openFiles(files) {
    const list = [...files];
    if (list.length === 0) return;
    const scene = list.find((file) => file.name.toLowerCase().endsWith('.json'));
    await this.act(async () => {
      if (scene) {
        const media = new Map(list.filter((f) => f !== scene).map((f) => [f.name, f]));
        await this.page.openScene(await scene.text(), { name: scene.name, files: media });
      } else {
        await this.page.openClips(list);
      }
      this.opened();
    });
  }

  saveScene() {
    this.act(() => {
      const text = this.page.saveScene();
      download(new Blob([text], { type: 'application/json' }), this.page.sceneName);
    });
  }

  // ---- Showing -----------------------------------------------------------------------------------
  refresh() {
    const state = this.page.state();
    this.panel.show(state);
    $('frame').value = state.frame;
    $('time').textContent = `${state.frame} / ${this.page.info.duration - 1}`;
    $('undo').disabled = state.undo.length === 0;
    $('redo').disabled = state.redo.length === 0;
    $('undo').title = state.undo.length ? `Undo ${state.undo.at(-1)} (Ctrl+Z)` : 'Nothing to undo';
    $('redo').title = state.redo.length ? `Redo ${state.redo.at(-1)} (Ctrl+Shift+Z)` : 'Nothing to redo';
    $('history').textContent = state.undo.length ? `Last: ${state.undo.at(-1)}` : '';
    this.wanted = JSON.stringify([state.frame, state.values]);
    this.update();
  }

  // Renders when the frame or a value changed since the picture shown; draws the overlay anew
  // either way. One update at a time; a request during one runs once more after it.
  async update() {
    if (this.busy) {
      this.again = true;
      return;
    }
    this.busy = true;
    try {
      do {
        this.again = false;
        if (this.wanted !== this.shownKey) {
          const key = this.wanted;
          await this.page.render(this.page.session.frame(), this.dragging ? 2 : 1);
          this.shownKey = key;
        }
        this.page.present();
      } while (this.again);
    } catch (error) {
      this.say(error.message);
    } finally {
      this.busy = false;
    }
  }

  setFrame(frame) {
    const last = this.page.info.duration - 1;
    this.page.session.setFrame(Math.min(Math.max(frame, 0), last));
    this.refresh();
  }

  async play() {
    this.playing = !this.playing;
    $('play').textContent = this.playing ? 'Pause' : 'Play';
    const fps = this.page.info.fps;
    const start = performance.now() - (this.page.session.frame() / fps) * 1000;
    while (this.playing) {
      const due = Math.floor(((performance.now() - start) / 1000) * fps) % this.page.info.duration;
      this.setFrame(due);
      await new Promise((resolve) => requestAnimationFrame(resolve));
      while (this.busy) await new Promise((resolve) => setTimeout(resolve, 1));
    }
  }

  // ---- The picture's mouse and keys ------------------------------------------------------------
  pointer(kind, event) {
    const density = window.devicePixelRatio || 1;
    const held = kind === 1 || (kind === 0 && (event.buttons & 1) !== 0);
    const cursor = this.page.session.pointer(kind, event.offsetX * density, event.offsetY * density, held);
    $('view').style.cursor = cssCursor(cursor);
    this.refresh();
  }

  key(event, down) {
    // An export renders the values as they were when it started: no undo or step meanwhile.
    if (this.exporting) return;
    const typing = ['INPUT', 'SELECT', 'TEXTAREA'].includes(document.activeElement?.tagName);
    if (down && (event.ctrlKey || event.metaKey) && event.key.toLowerCase() === 'z' && !typing) {
      event.preventDefault();
      this.act(() => (event.shiftKey ? this.page.session.redo() : this.page.session.undo()));
      return;
    }
    if (down && (event.ctrlKey || event.metaKey) && event.key.toLowerCase() === 'y' && !typing) {
      event.preventDefault();
      this.act(() => this.page.session.redo());
      return;
    }
    if (typing) return;
    const keysym = kKeysyms[event.key];
    if (keysym) {
      if (this.page.session.key(keysym, down)) event.preventDefault();
      this.refresh();
    } else if (down && event.key === ' ') {
      event.preventDefault();
      this.play();
    } else if (down && (event.key === 'ArrowLeft' || event.key === 'ArrowRight')) {
      this.setFrame(this.page.session.frame() + (event.key === 'ArrowLeft' ? -1 : 1));
    }
  }

  // ---- Export ------------------------------------------------------------------------------------
  async runExport() {
    const status = $('export-status');
    const progress = $('export-progress');
    const link = $('export-download');
    const controller = new AbortController();
    this.exporting = controller;
    if (this.playing) this.play(); // the export has the page to itself: playing would only wait
    $('export-start').disabled = true;
    link.hidden = true;
    const options = { container: $('export-container').value, audio: $('export-audio').checked };
    try {
      const blob = await exportVideo(
        this.page,
        options,
        ({ done, total, fps, secondsLeft }) => {
          progress.value = done / total;
          status.textContent = `Frame ${done} of ${total} · ${fps.toFixed(1)} frames/s · ${Math.ceil(secondsLeft)} s left`;
        },
        controller.signal,
      );
      link.href = URL.createObjectURL(blob);
      link.download = `split.${options.container}`;
      link.hidden = false;
      status.textContent = `Done: ${(blob.size / 1e6).toFixed(1)} MB`;
    } catch (error) {
      status.textContent = error.name === 'AbortError' ? 'Cancelled.' : error.message;
    } finally {
      this.exporting = null;
      $('export-start').disabled = false;
      this.shownKey = null;
      this.refresh();
    }
  }

  // ---- Wiring ------------------------------------------------------------------------------------
  wire() {
    const view = $('view');
    view.addEventListener('pointerdown', (event) => {
      if (event.button !== 0) return;
      view.focus();
      view.setPointerCapture(event.pointerId);
      this.dragging = true;
      this.pointer(1, event);
    });
    view.addEventListener('pointermove', (event) => this.pointer(0, event));
    view.addEventListener('pointerup', (event) => {
      if (event.button !== 0) return;
      this.dragging = false;
      this.pointer(2, event);
    });
    window.addEventListener('keydown', (event) => this.key(event, true));
    window.addEventListener('keyup', (event) => this.key(event, false));
    new ResizeObserver(() => {
      this.page.resize();
      this.update();
    }).observe(view);

    document.addEventListener('dragover', (event) => {
      event.preventDefault();
      $('stage').classList.add('dropping');
    });
    document.addEventListener('dragleave', () => $('stage').classList.remove('dropping'));
    document.addEventListener('drop', (event) => {
      event.preventDefault();
      $('stage').classList.remove('dropping');
      this.openFiles(event.dataTransfer.files);
    });
    $('open-clips').addEventListener('change', (event) => this.openFiles(event.target.files));
    $('open-scene').addEventListener('change', (event) => this.openFiles(event.target.files));
    $('save-scene').addEventListener('click', () => this.saveScene());
    $('layout').addEventListener('change', (event) => {
      if (event.target.value === '') return;
      this.act(() => this.page.applyLayout(Number(event.target.value)));
      event.target.value = '';
    });
    $('fit').addEventListener('click', () => this.act(() => this.page.session.fitPictures()));
    $('undo').addEventListener('click', () => this.act(() => this.page.session.undo()));
    $('redo').addEventListener('click', () => this.act(() => this.page.session.redo()));
    $('frame').addEventListener('input', (event) => this.setFrame(Number(event.target.value)));
    $('play').addEventListener('click', () => this.play());
    $('export').addEventListener('click', () => {
      $('export-download').hidden = true;
      $('export-progress').value = 0;
      $('export-dialog').showModal();
    });
    $('export-start').addEventListener('click', () => this.runExport());
    $('export-cancel').addEventListener('click', () => {
      if (this.exporting) this.exporting.abort();
      else $('export-dialog').close();
    });
  }
}

function download(blob, name) {
  const link = document.createElement('a');
  link.href = URL.createObjectURL(blob);
  link.download = name;
  link.click();
  setTimeout(() => URL.revokeObjectURL(link.href), 10000);
}

async function start() {
  let page;
  try {
    page = await Page.load($('view'));
  } catch (error) {
    $('message').textContent = `This browser cannot run the page: ${error.message}`;
    $('message').hidden = false;
    return;
  }
  const controller = new Controller(page);
  controller.wire();
  await page.openScene(kStartScene, { name: 'start.json' });
  page.applyLayout(page.info.layouts.findIndex((layout) => layout.name === 'diagonal-2'));
  controller.opened();
  installApi(page, controller);
}

start();
