// Compile-time lookup tables from a rule.
//
// The exported tables are plain C arrays, which cannot be initialised from a constexpr function
// returning std::array. These macros expand F(i) for a run of consecutive indices into an
// initialiser list instead, so a table reads as the rule that defines it:
//
//   extern "C" constinit const uint32_t LUT[256] = {PFX_TABLE_256(lut_entry, 0)};
//
// F must be a constexpr function (or function-like macro) of the index; the compiler evaluates
// every entry, and constinit makes sure none of them is left to run-time initialisation.
#pragma once

#define PFX_TABLE_1(F, n) F(n)
#define PFX_TABLE_2(F, n) PFX_TABLE_1(F, n), PFX_TABLE_1(F, (n) + 1)
#define PFX_TABLE_4(F, n) PFX_TABLE_2(F, n), PFX_TABLE_2(F, (n) + 2)
#define PFX_TABLE_8(F, n) PFX_TABLE_4(F, n), PFX_TABLE_4(F, (n) + 4)
#define PFX_TABLE_16(F, n) PFX_TABLE_8(F, n), PFX_TABLE_8(F, (n) + 8)
#define PFX_TABLE_32(F, n) PFX_TABLE_16(F, n), PFX_TABLE_16(F, (n) + 16)
#define PFX_TABLE_64(F, n) PFX_TABLE_32(F, n), PFX_TABLE_32(F, (n) + 32)
#define PFX_TABLE_128(F, n) PFX_TABLE_64(F, n), PFX_TABLE_64(F, (n) + 64)
#define PFX_TABLE_256(F, n) PFX_TABLE_128(F, n), PFX_TABLE_128(F, (n) + 128)
#define PFX_TABLE_512(F, n) PFX_TABLE_256(F, n), PFX_TABLE_256(F, (n) + 256)
#define PFX_TABLE_1024(F, n) PFX_TABLE_512(F, n), PFX_TABLE_512(F, (n) + 512)
#define PFX_TABLE_2048(F, n) PFX_TABLE_1024(F, n), PFX_TABLE_1024(F, (n) + 1024)
#define PFX_TABLE_4096(F, n) PFX_TABLE_2048(F, n), PFX_TABLE_2048(F, (n) + 2048)
#define PFX_TABLE_8192(F, n) PFX_TABLE_4096(F, n), PFX_TABLE_4096(F, (n) + 4096)
#define PFX_TABLE_16384(F, n) PFX_TABLE_8192(F, n), PFX_TABLE_8192(F, (n) + 8192)
#define PFX_TABLE_32768(F, n) PFX_TABLE_16384(F, n), PFX_TABLE_16384(F, (n) + 16384)
#define PFX_TABLE_65536(F, n) PFX_TABLE_32768(F, n), PFX_TABLE_32768(F, (n) + 32768)
