// The editor's slider preview in headless chromium, per effect: a 1080 x 720 picture is opened,
// each effect chosen, and its first slider moved a step at a time; the time from the move to
// the preview on the canvas is measured (the median of 7 moves). Effects without a slider are
// timed from the click that renders them. Prints "name<TAB>ms" lines.
//
//   node web-preview.mjs URL   (the page served from build/wasm/web; beside web/chromium.mjs)
import { launchChromium } from './chromium.mjs';

const browser = await launchChromium();
const page = await browser.newPage();
page.setDefaultTimeout(120000);
await page.setViewport({ width: 1600, height: 1000 });
await page.goto(process.argv[2]);
const idle = () => page.waitForFunction(() => window.photofxEditor && photofxEditor.idle());
await page.waitForFunction(() => document.getElementById('view').width === 600);
await idle();
// The sample, scaled to 1080 x 720, opened as a file.
await page.evaluate(async () => {
  const c = document.createElement('canvas');
  c.width = 1080;
  c.height = 720;
  c.getContext('2d').drawImage(document.getElementById('view'), 0, 0, 1080, 720);
  const blob = await new Promise((r) => c.toBlob(r, 'image/png'));
  const files = new DataTransfer();
  files.items.add(new File([blob], 'preview.png', { type: 'image/png' }));
  const input = document.getElementById('file');
  input.files = files.files;
  input.dispatchEvent(new Event('change'));
});
await page.waitForFunction(() => document.getElementById('view').width === 1080);
await idle();
const names = await page.$$eval('#effects button', (bs) => bs.map((b) => b.dataset.effect));
for (const name of names) {
  const ms = await page.evaluate(async (name) => {
    const done = () => new Promise((resolve) => {
      document.addEventListener('photofx-idle', () => setTimeout(resolve, 0), { once: true });
    });
    const times = [];
    const slider = () => document.querySelector('#params input[type=range]');
    for (let i = 0; i < 7; ++i) {
      let t0 = performance.now();
      let finished = done();
      document.querySelector(`#effects button[data-effect="${name}"]`).click();
      await finished;
      const s = slider();
      if (s) {
        t0 = performance.now();
        finished = done();
        s.value = Number(s.value) + (Number(s.value) < Number(s.max) ? 1 : -1);
        s.dispatchEvent(new Event('input'));
        await finished;
      }
      times.push(performance.now() - t0);
      document.getElementById('cancel').click();
    }
    times.sort((a, b) => a - b);
    return times[3];
  }, name);
  console.log(`${name}\t${ms.toFixed(1)}`);
}
await browser.closeAndClean();
