// The README's picture of the page: four generated pictures in a 2x2 grid with a border, the
// second picture selected (its rectangle and rotation handle on the frame), taken in headless
// Chromium at 1400x860.
//
//   node web/screenshot.mjs OUT.png       (the page built by scripts/web)
import { openPage } from './headless.mjs';

const out = process.argv[2] ?? 'docs/images/web.png';
const browser = await openPage({ width: 1400, height: 860 });
try {
  const { page } = browser;
  await page.evaluate(async () => {
    const layer = (n, name, pattern) => ({
      guid: `5b1170e0-0000-4000-8000-00000000000${n}`,
      name,
      source: { pattern },
    });
    await window.veltrane.open({
      description: 'Four generated pictures',
      width: 1280,
      height: 720,
      fps: 25,
      duration: 250,
      source: { pattern: 'counter' },
      layers: [layer(1, 'Bars', 'bars'), layer(2, 'Checker', 'checker'), layer(3, 'Gradient', 'gradient')],
    });
  });
  const layout = await page.evaluate(() => window.veltrane.info().layouts.findIndex((l) => l.name === 'slanted-4'));
  await page.select('#layout', String(layout));
  const border = await page.$('.param[data-id=borderWidth] input[type=number]');
  await border.evaluate((field) => field.select());
  await border.type('6');
  await page.keyboard.press('Tab');
  await page.evaluate(() => (document.getElementById('panel').scrollTop = 0));
  const box = await (await page.$('#view')).boundingBox();
  // A press on the second picture selects it; the pointer then rests over it.
  await page.mouse.click(box.x + box.width * 0.4, box.y + box.height * 0.3);
  await page.mouse.move(box.x + box.width * 0.42, box.y + box.height * 0.32);
  await page.waitForFunction(() => document.getElementById('message').hidden);
  await new Promise((resolve) => setTimeout(resolve, 500));
  await page.screenshot({ path: out });
  if (browser.problems.length) throw new Error(browser.problems.join('\n'));
  console.log(`wrote ${out}`);
} finally {
  await browser.close();
}
