// window.veltrane: the page driven by a script, as tests and automation drive it.
//
//   await veltrane.open(scene)      a scene object, its JSON text, or a URL; clips it names are
//                                   fetched relative to the scene's URL (the page's for objects)
//   await veltrane.frame(n)         {width, height, data}: composition frame n at full size,
//                                   RGBA bytes, top row first
//   await veltrane.export(options)  a Blob: {container: "mp4" | "webm", first, last, audio}
//   veltrane.save()                 the scene as `veltrane render` reads it, values as they are
//   veltrane.state()                frame, parameter values, undo and redo step names
//   await veltrane.benchmark(n, k)  median milliseconds of k renders of frame n at full size,
//                                   each until WebGL has finished it
import { exportVideo } from './exporter.js';

export function installApi(page, controller) {
  const api = {
    async open(scene) {
      let info;
      if (typeof scene === 'string' && !scene.trimStart().startsWith('{')) {
        info = await page.openUrl(scene);
      } else {
        info = await page.openScene(scene, { name: 'scene.json', baseUrl: new URL(location.href) });
      }
      controller.opened();
      return info;
    },
    async frame(n) {
      const copy = ({ width, height, data }) => ({ width, height, data: new Uint8Array(data) });
      const picture = await page.render(n, 1, copy);
      controller.shownKey = null;
      controller.refresh();
      return picture;
    },
    async export(options = {}) {
      try {
        return await exportVideo(page, options);
      } finally {
        controller.shownKey = null;
        controller.refresh();
      }
    },
    async benchmark(n, repeats = 10) {
      const gl = page.wasm.GL.currentContext.GLctx;
      const pixel = new Uint8Array(4);
      // The renders in one turn, so that the page's preview renders nothing between them.
      const times = await page.exclusive(async (render) => {
        const measured = [];
        for (let i = 0; i < repeats; ++i) {
          const started = performance.now();
          await render(n, 1);
          // Reading a pixel waits for every command before it.
          gl.readPixels(0, 0, 1, 1, gl.RGBA, gl.UNSIGNED_BYTE, pixel);
          measured.push(performance.now() - started);
        }
        return measured;
      });
      times.sort((a, b) => a - b);
      controller.shownKey = null;
      controller.refresh();
      return times[Math.floor(times.length / 2)];
    },
    save: () => page.saveScene(),
    state: () => page.state(),
    info: () => page.info,
  };
  window.veltrane = api;
  document.documentElement.dataset.ready = 'true';
  return api;
}
