// The editor's pixel work, off the page's thread: the wasm module, the picture at every step of
// the history, and the runs of steps the page asks for.
//
// Messages in: {id, op, ...}; each is answered once with {id, ok, ...} (ok false: `error` says
// why). Pixels travel as ArrayBuffers of 0xAARRGGBB words, transferred, never shared; the results
// of `render` come in the canvas's byte order instead (`canvas` true), ready to be drawn. A
// message may bring back such a buffer the page has drawn (`spare`) for the next one to reuse.
/* global importScripts, createPhotofx */
importScripts('photofx.js');

let fx = null; // the wasm module
let ready = null; // resolves when fx is there
// The slider drag the module holds (see previewOn), or null.
let drag = null;

function start() {
  drag = null;
  ready = createPhotofx().then((m) => {
    fx = m;
  });
}
start();

// states[i]: the picture after the first i steps; states[0] is the opened picture. A state
// whose pixels were dropped to save memory is rebuilt from the nearest earlier one that kept
// them, by replaying the steps in between.
let states = [];
let current = 0;
// Above this many bytes of kept pictures, the oldest intermediate ones are dropped.
const kKeepBytes = 768 * 1024 * 1024;

// Working copy for previews of large pictures: the picture reduced by `scale` (1: none).
let work = null;
let workOf = -1; // the state it was made from
const kWorkPixels = 1600 * 1200;

function bytesKept() {
  return states.reduce((n, s) => n + (s.pixels ? s.pixels.byteLength : 0), 0);
}

function trim() {
  for (let i = 1; i < states.length - 1 && bytesKept() > kKeepBytes; ++i) {
    if (i !== current) states[i].pixels = null;
  }
}

// Copies bytes into the module's heap; the caller frees the pointer.
function toHeap(bytes) {
  const p = fx._malloc(bytes.byteLength);
  if (p === 0) throw new Error('out of memory');
  fx.HEAPU8.set(bytes, p);
  return p;
}

function textToHeap(text) {
  return toHeap(new TextEncoder().encode(text + '\0'));
}

// A drawn result the page gave back: the next one of its size is copied into it rather than
// into a new buffer (a fresh 3 MB buffer per slider move costs more than copying into it).
let spare = null;

// The module's answer to a run: the result's pixels, or its reason for refusing. `canvas`: in
// the canvas's byte order, for drawing.
function takeOut(ok, canvas = false) {
  if (!ok) throw new Error(fx.UTF8ToString(fx._pfxw_error()));
  const w = fx._pfxw_out_width();
  const h = fx._pfxw_out_height();
  const out = canvas ? fx._pfxw_out_canvas() : fx._pfxw_out_pixels();
  const bytes = fx.HEAPU8.subarray(out, out + w * h * 4);
  let pixels;
  // (A larger spare serves too: the page reads the first width x height x 4 bytes.)
  if (canvas && spare && spare.byteLength >= bytes.length) {
    new Uint8Array(spare).set(bytes);
    pixels = spare;
    spare = null;
  } else {
    pixels = bytes.slice().buffer;
  }
  fx._pfxw_release();
  return { pixels, width: w, height: h, canvas };
}

// Runs `text` (steps in the chain syntax) on pixels; `mask` null or one byte per pixel.
function run(text, pixels, width, height, mask, canvas = false) {
  const src = toHeap(new Uint8Array(pixels));
  const m = mask ? toHeap(mask) : 0;
  const t = textToHeap(text);
  try {
    return takeOut(fx._pfxw_run(t, src, width, height, m), canvas);
  } finally {
    fx._free(t);
    if (m) fx._free(m);
    fx._free(src);
  }
}

function sameBytes(a, b) {
  if (!a || !b) return a === b;
  if (a.length !== b.length) return false;
  for (let i = 0; i < a.length; ++i) if (a[i] !== b[i]) return false;
  return true;
}

// A preview while a slider moves. The first one of a drag hands the module the working copy
// (and the brush's selection); the module keeps them, and the workspace of the blur and
// tilt-shift previews, until the drag ends: when anything but a preview is asked of the worker
// (the slider let go, another effect or picture), or the picture or selection changes.
function previewOn(text, w, mask) {
  if (!drag || drag.work !== w || !sameBytes(drag.mask, mask)) {
    endDrag();
    const src = toHeap(new Uint8Array(w.pixels));
    const m = mask ? toHeap(mask) : 0;
    try {
      if (!fx._pfxw_drag_begin(src, w.width, w.height, m)) {
        throw new Error(fx.UTF8ToString(fx._pfxw_error()));
      }
    } finally {
      if (m) fx._free(m);
      fx._free(src);
    }
    drag = { work: w, mask };
  }
  const t = textToHeap(text);
  try {
    return takeOut(fx._pfxw_drag_preview(t), true);
  } finally {
    fx._free(t);
  }
}

function endDrag() {
  if (drag) fx._pfxw_drag_end();
  drag = null;
}

function catalogue(width, height) {
  return JSON.parse(fx.UTF8ToString(fx._pfxw_catalogue(width, height)));
}

// The pixels of state i, replaying steps where they were dropped.
function pixelsOf(i) {
  let k = i;
  while (!states[k].pixels) --k;
  for (; k < i; ++k) {
    const s = states[k];
    const next = states[k + 1];
    const r = run(next.step, s.pixels, s.width, s.height, next.mask);
    next.pixels = r.pixels;
  }
  return states[i].pixels;
}

// How many times smaller than the picture its working copy is.
function scaleFor(width, height) {
  return Math.max(1, Math.ceil(Math.sqrt((width * height) / kWorkPixels)));
}

// A box-filtered copy of the picture, small enough for previews at slider speed.
function reduce(pixels, width, height) {
  const scale = scaleFor(width, height);
  if (scale === 1) return { pixels, width, height, scale };
  const w = Math.floor(width / scale);
  const h = Math.floor(height / scale);
  const src = new Uint32Array(pixels);
  const out = new Uint32Array(w * h);
  const n = scale * scale;
  for (let y = 0; y < h; ++y) {
    for (let x = 0; x < w; ++x) {
      let a = 0;
      let r = 0;
      let g = 0;
      let b = 0;
      for (let dy = 0; dy < scale; ++dy) {
        let i = (y * scale + dy) * width + x * scale;
        for (let dx = 0; dx < scale; ++dx, ++i) {
          const p = src[i];
          a += p >>> 24;
          r += (p >>> 16) & 255;
          g += (p >>> 8) & 255;
          b += p & 255;
        }
      }
      out[y * w + x] =
        (((a / n) << 24) | ((r / n) << 16) | ((g / n) << 8) | (b / n)) >>> 0;
    }
  }
  return { pixels: out.buffer, width: w, height: h, scale };
}

function reduceMask(mask, width, w, h, scale) {
  if (!mask || scale === 1) return mask;
  const out = new Uint8Array(w * h);
  for (let y = 0; y < h; ++y) {
    for (let x = 0; x < w; ++x) out[y * w + x] = mask[y * scale * width + x * scale];
  }
  return out;
}

function workingCopy() {
  if (workOf !== current) {
    const s = states[current];
    work = reduce(pixelsOf(current), s.width, s.height);
    workOf = current;
  }
  return work;
}

function answer(s) {
  const previewScale = scaleFor(s.width, s.height);
  return { pixels: s.pixels.slice(0), width: s.width, height: s.height, previewScale };
}

const ops = {
  // A new picture: the history starts again from it.
  open({ pixels, width, height }) {
    if (width * height * 4 !== pixels.byteLength) throw new Error('the pixels do not fit the size');
    states = [{ pixels, width, height, step: null, mask: null }];
    current = 0;
    workOf = -1;
    return { catalogue: catalogue(width, height), previewScale: scaleFor(width, height) };
  },
  // The catalogue for a picture of this size (the page asks after a step changes the size).
  catalogue({ width, height }) {
    return { catalogue: catalogue(width, height) };
  },
  // Runs a step on the current picture without keeping it: on the working copy for a
  // preview (`preview` is the step for the working copy), on the picture itself otherwise. The
  // result is only drawn, so it comes in the canvas's byte order.
  render({ step, mask, preview }) {
    if (preview !== undefined) {
      const w = workingCopy();
      const s = states[current];
      return previewOn(preview, w, reduceMask(mask, s.width, w.width, w.height, w.scale));
    }
    const s = states[current];
    return run(step, pixelsOf(current), s.width, s.height, mask, true);
  },
  // Runs a step and makes its result the next state of the history (dropping any redo).
  commit({ step, mask }) {
    const s = states[current];
    const r = run(step, pixelsOf(current), s.width, s.height, mask);
    states.length = current + 1;
    states.push({ pixels: r.pixels, width: r.width, height: r.height, step, mask });
    current += 1;
    trim();
    return answer(states[current]);
  },
  // Moves to state `index` (undo, redo, a click in the history).
  go({ index }) {
    if (index < 0 || index >= states.length) throw new Error('no such step');
    current = index;
    pixelsOf(current);
    trim();
    return answer(states[current]);
  },
  // The picture at state `index`, without moving there (the before/after comparison).
  peek({ index }) {
    pixelsOf(index);
    return answer(states[index]);
  },
  // A mask as it stands, for the page to offer as a file (--mask NAME).
  mask({ index }) {
    return { mask: states[index].mask ? states[index].mask.slice(0) : null };
  },
};

onmessage = async (e) => {
  const { id, op } = e.data;
  if (e.data.spare) spare = e.data.spare;
  try {
    await ready;
    // One message at a time, and a drag's previews only between its begin and end: the
    // module's workspace is module-wide.
    if (op !== 'render' || e.data.preview === undefined) endDrag();
    const result = ops[op](e.data);
    const transfer = result && result.pixels ? [result.pixels] : [];
    postMessage({ id, ok: true, ...result }, transfer);
  } catch (err) {
    let error = err && err.message ? err.message : String(err);
    // An abort (out of memory, most likely) leaves the module unusable: start a new one. The
    // states are plain JavaScript buffers and survive it.
    if (err instanceof WebAssembly.RuntimeError || /abort/i.test(error)) {
      error = 'the picture is too large for the memory the browser gives this page';
      start();
    }
    postMessage({ id, ok: false, error });
  }
};
