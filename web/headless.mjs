// The built page in Debian's Chromium, headless, served from this machine: what the page's
// tests, its screenshot and its benchmark drive. Fails with the reason when the page is not
// built or Chromium cannot start; never skips.
import { existsSync, mkdtempSync, rmSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join, resolve } from 'node:path';
import { createRequire } from 'node:module';
import { serve } from './serve.mjs';

const require = createRequire(import.meta.url);
const root = resolve(new URL('.', import.meta.url).pathname, '..');
export const pageDir = resolve(process.env.VELTRANE_WEB_DIR ?? join(root, 'build/web'));
const chromium = process.env.VELTRANE_CHROMIUM ?? '/usr/bin/chromium';

// Chromium as this machine runs it: no sandbox (root) and none of its background connections,
// which the closed network refuses.
const kChromiumFlags = [
  '--headless',
  '--no-sandbox',
  '--disable-quic',
  '--no-first-run',
  '--disable-background-networking',
  '--disable-component-update',
  '--disable-sync',
];
// Where WebGL 2 runs. By default ANGLE over the machine's own GL through EGL: without a GPU,
// Mesa's llvmpipe, the rasteriser the command line renders with, three to five times faster
// than SwiftShader (Chromium's GPU blocklist would otherwise refuse a software renderer).
// VELTRANE_WEBGL=swiftshader takes Chromium's own SwiftShader (ANGLE on its Vulkan) instead.
const kWebGlFlags = {
  llvmpipe: ['--use-angle=gl-egl', '--ignore-gpu-blocklist'],
  swiftshader: ['--disable-gpu', '--use-angle=swiftshader', '--enable-unsafe-swiftshader'],
};
export const webGlBackend = process.env.VELTRANE_WEBGL ?? 'llvmpipe';

export async function openPage({ width = 1400, height = 860, served = [] } = {}) {
  if (!existsSync(join(pageDir, 'index.html')) || !existsSync(join(pageDir, 'veltrane.wasm'))) {
    throw new Error(`the page is not built in ${pageDir}: run scripts/web`);
  }
  const webGlFlags = kWebGlFlags[webGlBackend];
  if (!webGlFlags) {
    throw new Error(`VELTRANE_WEBGL=${webGlBackend}: expected ${Object.keys(kWebGlFlags).join(' or ')}`);
  }
  if (!existsSync(chromium)) throw new Error(`${chromium} is missing: run scripts/deps (Debian's chromium)`);
  let puppeteer;
  try {
    puppeteer = require(join(root, 'web/node_modules/puppeteer-core'));
  } catch (error) {
    throw new Error(`puppeteer-core is not installed in web/node_modules: run scripts/web (${error.message})`);
  }
  const server = await serve(pageDir, 0);
  const profile = mkdtempSync(join(tmpdir(), 'veltrane-chromium-'));
  let browser;
  try {
    browser = await puppeteer.launch({
      executablePath: chromium,
      headless: true,
      args: [...kChromiumFlags, ...webGlFlags, `--user-data-dir=${profile}`],
    });
  } catch (error) {
    server.close();
    removeProfile(profile);
    throw new Error(`Chromium did not start: ${error.message}`);
  }
  // Whatever fails from here on closes the browser first, so that the error is the page's and
  // no Chromium is left running.
  const close = async () => {
    await browser.close().catch(() => {});
    server.close();
    removeProfile(profile);
  };
  try {
    return await openedPage(browser, server, close, { width, height });
  } catch (error) {
    await close();
    throw error;
  }
}

// Chromium's last writes into its profile can come after its process has gone: a few tries.
function removeProfile(profile) {
  try {
    rmSync(profile, { recursive: true, force: true, maxRetries: 5, retryDelay: 100 });
  } catch {
    // A profile left in the temporary folder is no reason to fail what ran.
  }
}

async function openedPage(browser, server, close, { width, height }) {
  const page = await browser.newPage();
  await page.setViewport({ width, height });
  const problems = [];
  page.on('pageerror', (error) => problems.push(error.message));
  page.on('console', (message) => {
    if (message.type() === 'error') problems.push(message.text());
  });
  const origin = `http://127.0.0.1:${server.address().port}`;
  const requests = [];
  page.on('request', (request) => requests.push(request.url()));
  await page.goto(`${origin}/`, { waitUntil: 'load' });
  await page.waitForFunction(() => document.documentElement.dataset.ready === 'true', { timeout: 60000 });
  // What draws the page's WebGL 2, as the context names it (benchmarks print it).
  const renderer = await page.evaluate(() => {
    const gl = document.createElement('canvas').getContext('webgl2');
    const named = gl?.getExtension('WEBGL_debug_renderer_info');
    return gl ? gl.getParameter(named ? named.UNMASKED_RENDERER_WEBGL : gl.RENDERER) : 'no WebGL 2';
  });
  return {
    page,
    renderer,
    pid: browser.process().pid,
    origin,
    problems,
    requests,
    close,
  };
}
