#!/usr/bin/env node
// `nm -D --defined-only` for a wasm side module: its exports, one "address type name" line each
// (functions T, the rest D), as check_exports.cmake reads them. Left out: the linker's own
// __wasm_* hooks, and the library's C++ internals (namespace pfx, with the guard variables of
// its load-time tables), which wasm-ld exports from a position-independent module when one
// object file reaches them in another; they are not part of the C interface the list pins, and
// no host can call them by a C name.
import { readFileSync } from 'node:fs';

const module = new WebAssembly.Module(readFileSync(process.argv.at(-1)));
for (const e of WebAssembly.Module.exports(module)) {
  if (/^(__wasm_|_ZZ?N3pfx|_ZGVZ?N3pfx)/.test(e.name)) continue;
  console.log(`00000000 ${e.kind === 'function' ? 'T' : 'D'} ${e.name}`);
}
