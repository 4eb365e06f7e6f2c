'use strict';
// The editor page. It holds the user's choices (effect, parameters, selection, history) and
// draws; the worker (worker.js) holds the pictures and runs the library. Every edit is a step
// in the command-line tool's chain syntax, so the history can be pasted after `photofx apply`.

const $ = (id) => document.getElementById(id);

// The largest picture the page opens: what the library addresses and, far below that, what a
// browser tab's memory holds several copies of.
const kMaxMegapixels = 50;
const kMaxFileBytes = 256 * 1024 * 1024;

// ---- The worker ---------------------------------------------------------------------------------

const worker = new Worker('worker.js');
const waiting = new Map();
let nextId = 1;

worker.onmessage = (e) => {
  const p = waiting.get(e.data.id);
  waiting.delete(e.data.id);
  if (e.data.ok) p.resolve(e.data);
  else p.reject(new Error(e.data.error));
  showBusy();
};

// A drawn result's buffer, going back to the worker with the next message for its next result.
let spare = null;

function ask(op, args = {}, transfer = []) {
  return new Promise((resolve, reject) => {
    const id = nextId++;
    waiting.set(id, { resolve, reject });
    if (spare) {
      args = { ...args, spare };
      transfer = [...transfer, spare];
      spare = null;
    }
    worker.postMessage({ id, op, ...args }, transfer);
    showBusy();
  });
}

// ---- State --------------------------------------------------------------------------------------

const ed = {
  effects: [], // the catalogue's entries, ranges resolved for the current picture
  previewScale: 1, // the working copy the worker previews on is this many times smaller
  name: 'photo', // the opened file's name, without its extension
  current: null, // {pixels, width, height}: the picture at history position `pos`
  steps: [], // {text, mask, maskName}
  pos: 0, // steps applied
  effect: null, // the effect being edited, or null
  values: {},
  tool: 'none',
  rect: null, // {x, y, w, h}
  ellipse: null, // {cx, cy, rx, ry}
  mask: null, // the brush's selection: one byte per pixel, 1 where painted
  previewPending: false,
  previewing: false,
};

function showBusy() {
  const busy = waiting.size > 0 || ed.previewPending;
  document.body.dataset.busy = busy ? '1' : '0';
  // For scripts that time the page: the work asked for is done (drawn once this task ends).
  if (!busy && !ed.previewing) document.dispatchEvent(new Event('photofx-idle'));
  $('status').textContent = busy ? 'working…' : ed.current ? `${ed.current.width} × ${ed.current.height}` : '';
}

function say(text) {
  const m = $('message');
  m.textContent = text;
  m.hidden = false;
  clearTimeout(say.timer);
  say.timer = setTimeout(() => (m.hidden = true), 8000);
}

// ---- Pixels on canvases -------------------------------------------------------------------------

// 0xAARRGGBB words and canvas RGBA bytes differ by the places of red and blue.
function swapRedBlue(from, to) {
  for (let i = 0; i < from.length; ++i) {
    const p = from[i];
    to[i] = (p & 0xff00ff00) | ((p >>> 16) & 0xff) | ((p & 0xff) << 16);
  }
}

// A result in the canvas's byte order (`canvas`) is drawn from its own bytes, uncopied.
function toImageData(r) {
  if (r.canvas) return new ImageData(new Uint8ClampedArray(r.pixels, 0, r.width * r.height * 4), r.width, r.height);
  const img = new ImageData(r.width, r.height);
  swapRedBlue(new Uint32Array(r.pixels), new Uint32Array(img.data.buffer));
  return img;
}

function setSize(width, height) {
  for (const c of [$('view'), $('overlay')]) {
    if (c.width !== width || c.height !== height) {
      c.width = width;
      c.height = height;
    }
  }
}

// Draws a result: the picture's own size straight, a working copy's stretched over it.
function draw(r) {
  const view = $('view');
  if (r.width === view.width && r.height === view.height) {
    view.getContext('2d').putImageData(toImageData(r), 0, 0);
  } else {
    // One canvas for results of another size, kept: making one per slider move costs more
    // than the move's own work.
    const small = (draw.small ||= document.createElement('canvas'));
    if (small.width !== r.width || small.height !== r.height) {
      small.width = r.width;
      small.height = r.height;
    }
    small.getContext('2d').putImageData(toImageData(r), 0, 0);
    view.getContext('2d').drawImage(small, 0, 0, view.width, view.height);
  }
  // The canvas holds its own copy now: a result made for drawing can take the next one.
  if (r.canvas) spare = r.pixels;
}

function showCurrent() {
  setSize(ed.current.width, ed.current.height);
  draw(ed.current);
  drawOverlay();
}

// ---- Steps as text ------------------------------------------------------------------------------

function findEffect(name) {
  return ed.effects.find((e) => e.name === name);
}

function extentOf(p, width, height) {
  return { width, height, longer: Math.max(width, height) }[p.extent];
}

// The step for the values and selection as they stand. `scale` > 1 writes it for the worker's
// working copy: positions and lengths divided, kept inside the smaller picture's ranges.
function stepText(effect, values, scale = 1) {
  const words = [effect.name];
  const { width, height } = ed.current;
  for (const p of effect.params) {
    let v = values[p.name];
    if (v === p.def) continue;
    if (scale > 1 && p.extent !== 'none') {
      const full = extentOf(p, width, height);
      const small = extentOf(p, Math.floor(width / scale), Math.floor(height / scale));
      v = Math.max(p.min, Math.min(Math.floor(v / scale), small + (p.max - full)));
    }
    words.push(`--${p.name}`, String(v));
  }
  if (effect.selects !== 'nothing') {
    const d = (v) => Math.floor(v / scale);
    const at = (v) => Math.max(1, Math.floor(v / scale));
    if (ed.rect) words.push('--rect', [d(ed.rect.x), d(ed.rect.y), at(ed.rect.w), at(ed.rect.h)].join(','));
    if (ed.ellipse) {
      const e = ed.ellipse;
      words.push('--ellipse', [d(e.cx), d(e.cy), at(e.rx), at(e.ry)].join(','));
    }
    if (ed.mask && ed.mask.includes(1)) words.push('--mask', `selection-${ed.pos + 1}.png`);
  }
  return words.join(' ');
}

function brushMask(effect) {
  return effect.selects !== 'nothing' && ed.mask && ed.mask.includes(1) ? ed.mask : null;
}

// ---- Running the effect being edited ------------------------------------------------------------

// While a slider moves: the effect's preview variant on the working copy. At most one preview
// is with the worker; moves meanwhile are folded into the next one.
function schedulePreview() {
  ed.previewPending = true;
  showBusy();
  pumpPreview();
}

// The step a slider's move runs on the working copy: the catalogue's preview ("blur-preview",
// "twirl --fast on", or "" for the effect itself) with the values as they stand.
function previewText() {
  const [name, ...set] = ed.effect.preview ? ed.effect.preview.split(' ') : [ed.effect.name];
  const values = { ...ed.values };
  for (let i = 0; i + 1 < set.length; i += 2) values[set[i].replace(/^--/, '')] = set[i + 1];
  return stepText(findEffect(name), values, ed.previewScale);
}

async function pumpPreview() {
  if (ed.previewing || !ed.previewPending || !ed.effect) return;
  ed.previewPending = false;
  ed.previewing = true;
  const effect = ed.effect;
  try {
    draw(await ask('render', { preview: previewText(), mask: brushMask(effect) }));
  } catch (err) {
    say(err.message);
  }
  ed.previewing = false;
  showBusy();
  pumpPreview();
}

// When a slider is let go, a choice made, a selection changed: the full-quality result.
async function renderFull() {
  if (!ed.effect) return;
  ed.previewPending = false;
  try {
    const r = await ask('render', { step: stepText(ed.effect, ed.values), mask: brushMask(ed.effect) });
    if (ed.effect) draw(r);
  } catch (err) {
    say(err.message);
    if (ed.current) draw(ed.current);
  }
}

function editEffect(effect) {
  ed.effect = effect;
  ed.values = {};
  for (const p of effect.params) ed.values[p.name] = p.def;
  for (const b of document.querySelectorAll('#effects button')) {
    b.classList.toggle('active', b.dataset.effect === effect.name);
  }
  $('controls').hidden = false;
  $('effect-name').textContent = effect.name;
  $('effect-summary').textContent = effect.summary;
  $('effect-note').textContent =
    effect.selects === 'nothing' ? 'Changes the picture’s size: applies to the whole picture.' : '';
  buildParams();
  renderFull();
}

function buildParams() {
  const form = $('params');
  form.textContent = '';
  for (const p of ed.effect.params) {
    const label = document.createElement('label');
    label.title = `${p.help} (${p.describe})`;
    label.append(p.name);
    let input;
    const out = document.createElement('output');
    if (p.kind === 'choice') {
      input = document.createElement('select');
      for (const c of p.choices) input.add(new Option(c, c, false, c === ed.values[p.name]));
      input.onchange = () => {
        ed.values[p.name] = input.value;
        renderFull();
      };
    } else {
      input = document.createElement('input');
      input.type = 'range';
      input.min = p.min;
      input.max = p.max;
      input.step = p.kind === 'real' ? (p.max - p.min) / 200 : 1;
      input.value = ed.values[p.name];
      out.textContent = input.value;
      input.oninput = () => {
        ed.values[p.name] = Number(input.value);
        out.textContent = input.value;
        schedulePreview();
      };
      input.onchange = renderFull;
    }
    input.name = p.name;
    label.append(input, out);
    form.append(label);
  }
}

function stopEditing() {
  ed.effect = null;
  ed.previewPending = false;
  $('controls').hidden = true;
  for (const b of document.querySelectorAll('#effects button')) b.classList.remove('active');
  if (ed.current) draw(ed.current);
  showBusy();
}

async function applyEffect() {
  if (!ed.effect) return;
  const text = stepText(ed.effect, ed.values);
  const mask = brushMask(ed.effect);
  try {
    const r = await ask('commit', { step: text, mask });
    ed.steps.length = ed.pos;
    ed.steps.push({ text, mask: mask ? mask.slice(0) : null, maskName: mask ? `selection-${ed.pos + 1}.png` : null });
    ed.pos += 1;
    await arrive(r);
  } catch (err) {
    say(err.message);
  }
}

// A picture from the worker becomes the current one (after a step, an undo, a redo).
async function arrive(r) {
  const resized = !ed.current || r.width !== ed.current.width || r.height !== ed.current.height;
  ed.current = { pixels: r.pixels, width: r.width, height: r.height };
  ed.previewScale = r.previewScale;
  if (resized) {
    ed.effects = (await ask('catalogue', { width: r.width, height: r.height })).catalogue.effects;
    clearSelection();
  }
  stopEditing();
  showCurrent();
  showHistory();
}

async function go(pos) {
  if (pos < 0 || pos > ed.steps.length || pos === ed.pos) return;
  try {
    const r = await ask('go', { index: pos });
    ed.pos = pos;
    await arrive(r);
  } catch (err) {
    say(err.message);
  }
}

// ---- History ------------------------------------------------------------------------------------

function chainText() {
  const steps = ed.steps.slice(0, ed.pos).map((s) => s.text);
  if (steps.length === 0) return '';
  return `photofx apply ${steps.join(' , ')} ${ed.name}.png ${ed.name}-edited.png`;
}

function showHistory() {
  const list = $('history');
  list.textContent = '';
  const items = [{ text: `open ${ed.name}` }, ...ed.steps];
  items.forEach((s, i) => {
    const li = document.createElement('li');
    li.textContent = s.text;
    li.className = i === ed.pos ? 'current' : i > ed.pos ? 'future' : '';
    li.onclick = () => go(i);
    list.append(li);
  });
  $('chain').value = chainText();
  const masks = $('masks');
  masks.textContent = '';
  for (const s of ed.steps.slice(0, ed.pos)) {
    if (!s.mask) continue;
    const a = document.createElement('a');
    a.href = '#';
    a.textContent = `download ${s.maskName} (the painted selection)`;
    a.onclick = async (e) => {
      e.preventDefault();
      download(await maskBlob(s.mask), s.maskName);
    };
    masks.append(a);
  }
  $('undo').disabled = ed.pos === 0;
  $('redo').disabled = ed.pos === ed.steps.length;
}

// A painted selection as the tool reads --mask: white where selected, black elsewhere.
function maskBlob(mask) {
  const { width, height } = ed.current;
  const c = document.createElement('canvas');
  c.width = width;
  c.height = height;
  const img = new ImageData(width, height);
  const d = new Uint32Array(img.data.buffer);
  for (let i = 0; i < mask.length; ++i) d[i] = mask[i] ? 0xffffffff : 0xff000000;
  c.getContext('2d').putImageData(img, 0, 0);
  return new Promise((resolve) => c.toBlob(resolve, 'image/png'));
}

function download(blob, name) {
  const a = document.createElement('a');
  a.href = URL.createObjectURL(blob);
  a.download = name;
  a.click();
  setTimeout(() => URL.revokeObjectURL(a.href), 10000);
}

function save(type) {
  if (!ed.current) return;
  const c = document.createElement('canvas');
  c.width = ed.current.width;
  c.height = ed.current.height;
  c.getContext('2d').putImageData(toImageData(ed.current), 0, 0);
  const ext = type === 'image/png' ? 'png' : 'jpg';
  c.toBlob((b) => download(b, `${ed.name}-edited.${ext}`), type, 0.92);
}

// ---- Opening pictures ---------------------------------------------------------------------------

async function openBlob(blob, fileName) {
  const keep = 'The picture you were editing is still here.';
  if (blob.size > kMaxFileBytes) {
    say(`${fileName} is ${Math.round(blob.size / 1048576)} MB: too large to open. ${keep}`);
    return;
  }
  let bitmap;
  try {
    bitmap = await createImageBitmap(blob, { colorSpaceConversion: 'none', premultiplyAlpha: 'none' });
  } catch {
    say(`${fileName} is not a picture this browser can read (PNG, JPEG, WebP, GIF, BMP). ${keep}`);
    return;
  }
  const { width, height } = bitmap;
  if (width * height > kMaxMegapixels * 1e6) {
    bitmap.close();
    const mp = ((width * height) / 1e6).toFixed(1);
    say(`${fileName} is ${width} × ${height} pixels (${mp} megapixels); the editor opens up to ${kMaxMegapixels}. ${keep}`);
    return;
  }
  const c = document.createElement('canvas');
  c.width = width;
  c.height = height;
  const ctx = c.getContext('2d', { willReadFrequently: true });
  ctx.drawImage(bitmap, 0, 0);
  bitmap.close();
  const rgba = ctx.getImageData(0, 0, width, height);
  const pixels = new Uint32Array(width * height);
  swapRedBlue(new Uint32Array(rgba.data.buffer), pixels);
  const kept = pixels.slice(0);
  try {
    const r = await ask('open', { pixels: pixels.buffer, width, height }, [pixels.buffer]);
    ed.effects = r.catalogue.effects;
    ed.previewScale = r.previewScale;
  } catch (err) {
    say(`${fileName}: ${err.message}. ${keep}`);
    return;
  }
  ed.name = fileName.replace(/\.[^.]*$/, '') || 'photo';
  ed.current = { pixels: kept.buffer, width, height };
  ed.steps = [];
  ed.pos = 0;
  clearSelection();
  buildEffectList();
  stopEditing();
  showCurrent();
  showHistory();
  $('drop').hidden = true;
}

async function openSample() {
  const response = await fetch('coffee.png');
  await openBlob(await response.blob(), 'coffee.png');
}

function buildEffectList() {
  const nav = $('effects');
  if (nav.childElementCount > 0) return;
  const families = new Map();
  for (const e of ed.effects) {
    if (!families.has(e.family)) {
      const d = document.createElement('details');
      d.open = true;
      const s = document.createElement('summary');
      s.textContent = e.family;
      d.append(s);
      nav.append(d);
      families.set(e.family, d);
    }
    const b = document.createElement('button');
    b.type = 'button';
    b.textContent = e.name;
    b.title = e.summary;
    b.dataset.effect = e.name;
    b.onclick = () => ed.current && editEffect(findEffect(e.name));
    families.get(e.family).append(b);
  }
}

// ---- Selections ---------------------------------------------------------------------------------

function clearSelection() {
  ed.rect = null;
  ed.ellipse = null;
  ed.mask = null;
  drawOverlay();
}

function drawOverlay() {
  const o = $('overlay');
  const ctx = o.getContext('2d');
  ctx.clearRect(0, 0, o.width, o.height);
  if (ed.mask) {
    const img = ctx.createImageData(o.width, o.height);
    const d = new Uint32Array(img.data.buffer);
    for (let i = 0; i < ed.mask.length; ++i) if (ed.mask[i]) d[i] = 0x603050ff; // red, see-through
    ctx.putImageData(img, 0, 0);
  }
  if (!ed.rect && !ed.ellipse) return;
  const shape = new Path2D();
  if (ed.rect) shape.rect(ed.rect.x, ed.rect.y, ed.rect.w, ed.rect.h);
  if (ed.ellipse) {
    const e = ed.ellipse;
    shape.moveTo(e.cx + e.rx, e.cy);
    shape.ellipse(e.cx, e.cy, e.rx, e.ry, 0, 0, 2 * Math.PI);
  }
  // A veil over what stays as it is, and a dashed edge round the selection.
  const veil = new Path2D();
  veil.rect(0, 0, o.width, o.height);
  veil.addPath(shape);
  ctx.fillStyle = 'rgba(0, 0, 0, 0.45)';
  ctx.fill(veil, 'evenodd');
  ctx.strokeStyle = '#f0a040';
  ctx.lineWidth = Math.max(1, o.width / 600);
  ctx.setLineDash([6 * ctx.lineWidth, 4 * ctx.lineWidth]);
  ctx.stroke(shape);
}

function imagePoint(e) {
  const o = $('overlay');
  const box = o.getBoundingClientRect();
  const x = Math.floor(((e.clientX - box.left) / box.width) * o.width);
  const y = Math.floor(((e.clientY - box.top) / box.height) * o.height);
  return { x: Math.max(0, Math.min(o.width - 1, x)), y: Math.max(0, Math.min(o.height - 1, y)) };
}

function paint(from, to) {
  const { width, height } = ed.current;
  if (!ed.mask) ed.mask = new Uint8Array(width * height);
  const r = Math.max(1, Math.round(Number($('brush').value) / 2));
  const steps = Math.max(1, Math.ceil(Math.hypot(to.x - from.x, to.y - from.y) / (r / 2)));
  for (let s = 0; s <= steps; ++s) {
    const cx = Math.round(from.x + ((to.x - from.x) * s) / steps);
    const cy = Math.round(from.y + ((to.y - from.y) * s) / steps);
    for (let y = Math.max(0, cy - r); y <= Math.min(height - 1, cy + r); ++y) {
      for (let x = Math.max(0, cx - r); x <= Math.min(width - 1, cx + r); ++x) {
        if ((x - cx) ** 2 + (y - cy) ** 2 <= r * r) ed.mask[y * width + x] = 1;
      }
    }
  }
}

// Clicking with no selection tool places an effect's centre (its first column and row).
function place(p) {
  if (!ed.effect) return;
  const col = ed.effect.params.find((q) => q.extent === 'width');
  const row = ed.effect.params.find((q) => q.extent === 'height' && q.max === ed.current.height - 1);
  if (!col || !row) return;
  ed.values[col.name] = p.x;
  ed.values[row.name] = p.y;
  for (const q of [col, row]) {
    const input = $('params').elements[q.name];
    input.value = ed.values[q.name];
    input.nextSibling.textContent = input.value;
  }
  renderFull();
}

function setupPointer() {
  const o = $('overlay');
  let start = null;
  let last = null;
  o.onpointerdown = (e) => {
    if (!ed.current) return;
    o.setPointerCapture(e.pointerId);
    start = last = imagePoint(e);
    if (ed.tool === 'brush') {
      paint(start, start);
      drawOverlay();
    } else if (ed.tool === 'none') {
      place(start);
      start = null;
    }
  };
  o.onpointermove = (e) => {
    if (!start) return;
    const p = imagePoint(e);
    if (ed.tool === 'brush') {
      paint(last, p);
    } else if (ed.tool === 'rect') {
      ed.rect = { x: Math.min(start.x, p.x), y: Math.min(start.y, p.y), w: Math.abs(p.x - start.x) + 1, h: Math.abs(p.y - start.y) + 1 };
    } else if (ed.tool === 'ellipse') {
      ed.ellipse = { cx: start.x, cy: start.y, rx: Math.max(1, Math.abs(p.x - start.x)), ry: Math.max(1, Math.abs(p.y - start.y)) };
    }
    last = p;
    drawOverlay();
  };
  o.onpointerup = () => {
    if (!start) return;
    start = null;
    renderFull();
  };
}

function setTool(tool) {
  ed.tool = tool;
  // One kind of selection at a time: a new shape replaces the old one.
  if (tool === 'rect' || tool === 'ellipse' || tool === 'brush') {
    ed.rect = tool === 'rect' ? ed.rect : null;
    ed.ellipse = tool === 'ellipse' ? ed.ellipse : null;
    ed.mask = tool === 'brush' ? ed.mask : null;
  }
  drawOverlay();
}

// ---- Wiring -------------------------------------------------------------------------------------

function setup() {
  $('file').onchange = (e) => e.target.files[0] && openBlob(e.target.files[0], e.target.files[0].name);
  $('sample').onclick = openSample;
  $('undo').onclick = () => go(ed.pos - 1);
  $('redo').onclick = () => go(ed.pos + 1);
  $('apply').onclick = applyEffect;
  $('cancel').onclick = stopEditing;
  $('png').onclick = () => save('image/png');
  $('jpeg').onclick = () => save('image/jpeg');
  $('copy').onclick = () => navigator.clipboard.writeText($('chain').value);
  $('clear').onclick = () => {
    clearSelection();
    renderFull();
  };
  for (const r of document.querySelectorAll('input[name=tool]')) r.onchange = () => setTool(r.value);

  // Before/after: the opened picture while the button is held.
  const compare = $('compare');
  compare.onpointerdown = async () => {
    if (!ed.current) return;
    compare.classList.add('active');
    const r = await ask('peek', { index: 0 });
    if (compare.classList.contains('active')) {
      setSize(r.width, r.height);
      draw(r);
    }
  };
  compare.onpointerup = compare.onpointerleave = () => {
    if (!compare.classList.contains('active')) return;
    compare.classList.remove('active');
    showCurrent();
    renderFull();
  };

  const stage = $('stage');
  stage.ondragover = (e) => {
    e.preventDefault();
    stage.classList.add('dragging');
  };
  stage.ondragleave = () => stage.classList.remove('dragging');
  stage.ondrop = (e) => {
    e.preventDefault();
    stage.classList.remove('dragging');
    const f = e.dataTransfer.files[0];
    if (f) openBlob(f, f.name);
  };
  document.onkeydown = (e) => {
    if (!(e.ctrlKey || e.metaKey)) return;
    const k = e.key.toLowerCase();
    if (k === 'z' && !e.shiftKey) go(ed.pos - 1);
    else if ((k === 'z' && e.shiftKey) || k === 'y') go(ed.pos + 1);
    else return;
    e.preventDefault();
  };
  setupPointer();
  showBusy();
  openSample();
}

// For scripts driving the page (the browser test): whether all work is done, and the history.
window.photofxEditor = {
  idle: () => waiting.size === 0 && !ed.previewPending && !ed.previewing,
  chain: chainText,
  steps: () => ed.steps.slice(0, ed.pos).map((s) => s.text),
  preview: () => ed.effect && previewText(),
  maskPng: async (i) => {
    const b = await maskBlob(ed.steps[i].mask);
    let text = '';
    for (const byte of new Uint8Array(await b.arrayBuffer())) text += String.fromCharCode(byte);
    return btoa(text);
  },
};

setup();
