// The editor in a real browser: Debian's chromium, headless, driven through the page as a user
// would. After each step the canvas must hold the same pixels as the native tool's output for
// the chain the page's history shows, run on the same sample photograph.
//
//   node browser_test.mjs WEB_DIR PHOTOFX_TOOL
import { spawnSync } from 'node:child_process';
import { createHash } from 'node:crypto';
import { mkdtempSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import { createServer } from 'node:http';
import { tmpdir } from 'node:os';
import { extname, join, resolve } from 'node:path';
import { launchChromium } from './chromium.mjs';

const [webDir, tool] = process.argv.slice(2).map((p) => resolve(p));
const work = mkdtempSync(join(tmpdir(), 'photofx-browser-'));
const sample = join(webDir, 'coffee.png');
let failures = 0;
let passes = 0;

function check(what, actual, expected) {
  if (actual === expected) {
    passes += 1;
    console.log(`ok   ${what}`);
  } else {
    failures += 1;
    console.log(`FAIL ${what}\n     page:   ${actual}\n     native: ${expected}`);
  }
}

// SHA-256 of the RGBA bytes, with the size: what the canvas holds, computed natively.
function nativeHash(steps) {
  const out = join(work, 'out.png');
  const args = ['apply', ...steps.join(' , ').split(/\s+/), sample, out];
  const run = spawnSync(tool, args, { cwd: work, encoding: 'utf8' });
  if (run.status !== 0) return `photofx ${args.join(' ')} failed: ${run.stderr}`;
  const py = spawnSync('/usr/bin/python3', ['-c',
    'import hashlib,sys; from PIL import Image; im = Image.open(sys.argv[1]).convert("RGBA"); ' +
    'print("%dx%d %s" % (im.width, im.height, hashlib.sha256(im.tobytes()).hexdigest()))', out],
  { encoding: 'utf8' });
  return py.stdout.trim() || py.stderr;
}

const types = { '.html': 'text/html', '.js': 'text/javascript', '.css': 'text/css', '.wasm': 'application/wasm', '.png': 'image/png' };
const server = createServer((req, res) => {
  const path = new URL(req.url, 'http://x').pathname.replace(/^\/$/, '/index.html');
  try {
    const body = readFileSync(join(webDir, path.replace(/\.\.+/g, '')));
    res.writeHead(200, { 'Content-Type': types[extname(path)] || 'application/octet-stream' });
    res.end(body);
  } catch {
    res.writeHead(404).end();
  }
});
await new Promise((resolve) => server.listen(0, '127.0.0.1', resolve));

const browser = await launchChromium();
try {
  const page = await browser.newPage();
  page.setDefaultTimeout(60000);
  await page.setViewport({ width: 1400, height: 850 });
  page.on('pageerror', (e) => {
    failures += 1;
    console.log(`FAIL page error: ${e.message}`);
  });
  await page.goto(`http://127.0.0.1:${server.address().port}/`);
  const idle = () => page.waitForFunction(() => window.photofxEditor && photofxEditor.idle() && document.body.dataset.busy === '0');
  const canvasHash = () => page.evaluate(async () => {
    const c = document.getElementById('view');
    const d = c.getContext('2d').getImageData(0, 0, c.width, c.height).data;
    const h = new Uint8Array(await crypto.subtle.digest('SHA-256', d));
    return `${c.width}x${c.height} ${Array.from(h, (b) => b.toString(16).padStart(2, '0')).join('')}`;
  });
  const steps = () => page.evaluate(() => photofxEditor.steps());
  const apply = async () => {
    await page.click('#apply');
    await idle();
    const s = await steps();
    check(`after ${s.at(-1)}`, await canvasHash(), nativeHash(s));
  };
  await page.waitForFunction(() => document.getElementById('view').width === 600);
  await idle();

  // A slider set from the keyboard, then applied.
  await page.click('button[data-effect=contrast]');
  await page.focus('#params input[name=level]');
  for (let i = 0; i < 6; ++i) await page.keyboard.press('ArrowRight');
  await idle();
  await apply();

  // The blur family with its defaults.
  await page.click('button[data-effect=blur]');
  await idle();
  await apply();

  // A painted selection: a brush stroke, then a look on the painted pixels only.
  await page.click('input[name=tool][value=brush]');
  const v = await page.$eval('#overlay', (e) => e.getBoundingClientRect().toJSON());
  await page.mouse.move(v.x + v.width * 0.2, v.y + v.height * 0.3);
  await page.mouse.down();
  await page.mouse.move(v.x + v.width * 0.7, v.y + v.height * 0.6, { steps: 20 });
  await page.mouse.up();
  await page.click('button[data-effect=sepia]');
  await idle();
  const index = (await steps()).length;
  await page.click('#apply');
  await idle();
  const png = await page.evaluate((i) => photofxEditor.maskPng(i), index);
  writeFileSync(join(work, `selection-${index + 1}.png`), Buffer.from(png, 'base64'));
  let s = await steps();
  check(`after ${s.at(-1)}`, await canvasHash(), nativeHash(s));
  await page.click('#clear');

  // A slider dragged over the blur inside a rectangle: the previews of one drag share a
  // workspace, and a middle frame and the last must be the preview step's own pixels.
  await page.click('input[name=tool][value=rect]');
  await page.mouse.move(v.x + v.width * 0.25, v.y + v.height * 0.2);
  await page.mouse.down();
  await page.mouse.move(v.x + v.width * 0.6, v.y + v.height * 0.7, { steps: 4 });
  await page.mouse.up();
  await page.click('button[data-effect=blur]');
  await idle();
  const level = await page.$eval('#params input[name=level]', (e) => e.getBoundingClientRect().toJSON());
  await page.mouse.move(level.x + level.width * 0.5, level.y + level.height / 2);
  await page.mouse.down();
  for (const at of [0.3, 0.95]) {
    await page.mouse.move(level.x + level.width * at, level.y + level.height / 2, { steps: 4 });
    await idle();
    const step = await page.evaluate(() => photofxEditor.preview());
    check(`${step} while dragging`, await canvasHash(), nativeHash([...(await steps()), step]));
  }
  await page.mouse.up();
  await page.click('#clear');

  // A slider dragged on the whole picture: the warp's fast preview while the button is down,
  // the full warp on release; then undone.
  await page.click('input[name=tool][value=none]');
  await page.click('button[data-effect=twirl]');
  await idle();
  const b = await page.$eval('#params input[name=angle]', (e) => e.getBoundingClientRect().toJSON());
  await page.mouse.move(b.x + b.width * 0.5, b.y + b.height / 2);
  await page.mouse.down();
  await page.mouse.move(b.x + b.width * 0.8, b.y + b.height / 2, { steps: 5 });
  await idle();
  const angle = await page.$eval('#params input[name=angle]', (e) => e.value);
  const before = await steps();
  check(`preview of twirl --angle ${angle} while dragging`, await canvasHash(), nativeHash([...before, `twirl --angle ${angle} --fast on`]));
  await page.mouse.up();
  await idle();
  check(`twirl --angle ${angle} on release`, await canvasHash(), nativeHash([...before, `twirl --angle ${angle}`]));
  await apply();
  await page.click('#undo');
  await idle();
  s = await steps();
  check(`undo back to ${s.at(-1)}`, await canvasHash(), nativeHash(s));
  check('history as a command', await page.$eval('#chain', (e) => e.value), `photofx apply ${s.join(' , ')} coffee.png coffee-edited.png`);

  // A file that is not a picture is refused with a message, and the picture stays.
  const kept = await canvasHash();
  const junk = join(work, 'notes.txt');
  writeFileSync(junk, 'not a picture');
  await (await page.$('#file')).uploadFile(junk);
  await page.waitForSelector('#message:not([hidden])');
  check('a file that is not a picture', await page.$eval('#message', (e) => e.textContent.startsWith('notes.txt is not a picture')) && (await canvasHash()), kept);
} finally {
  await browser.closeAndClean();
  server.close();
  rmSync(work, { recursive: true, force: true });
}
console.log(`${passes} passed, ${failures} failed`);
process.exit(failures === 0 && passes > 0 ? 0 : 1);
