// Embeds the sample photograph byte for byte; PHOTOFX_SAMPLE_PHOTO is its absolute path, set by
// the build.
#include "tools/sample.h"

#include <cstdint>

// clang-format off
asm(".pushsection .rodata.photofx_sample, \"a\"\n"
    ".balign 16\n"
    ".globl photofx_sample_begin\n"
    ".hidden photofx_sample_begin\n"
    "photofx_sample_begin:\n"
    ".incbin \"" PHOTOFX_SAMPLE_PHOTO "\"\n"
    ".globl photofx_sample_end\n"
    ".hidden photofx_sample_end\n"
    "photofx_sample_end:\n"
    ".popsection\n");
// clang-format on

extern "C" const unsigned char photofx_sample_begin[];
extern "C" const unsigned char photofx_sample_end[];

namespace fxtool {

const unsigned char* sample_photo_data() { return photofx_sample_begin; }

size_t sample_photo_size() {
  // Two labels of one block; compared as addresses, since the language relates pointers only
  // within one declared array.
  return reinterpret_cast<uintptr_t>(photofx_sample_end) -
         reinterpret_cast<uintptr_t>(photofx_sample_begin);
}

}  // namespace fxtool
