/* A qemu TCG plugin (plugin API version 1, as qemu 7.2 loads it) that counts the guest
 * instructions a program executes and prints the total when it exits:
 *
 *   qemu-arm -plugin ./libinsn_count.so[,profile=FILE] -d plugin -D COUNT_FILE PROGRAM ...
 *
 * writes "insns N" through qemu's log. Each translated block adds its instruction count to one
 * counter, inline, when it runs, so the count is exact and costs little. With profile=FILE it also
 * writes, for every block start address, how often the block ran and how many instructions it
 * holds: a profile with no sampling error, which bench/arm-cost turns into per-symbol counts.
 *
 * Debian packages no plugin header, so the few declarations used are written out here; they are
 * the plugin ABI of qemu 7.2 (a C ABI, stable within version 1). */
#include <inttypes.h>
#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#define EXPORT __attribute__((visibility("default")))

typedef uint64_t qemu_plugin_id_t;
struct qemu_plugin_tb;
typedef struct {
  const char* target_name;
  struct {
    int min, cur;
  } version;
  bool system_emulation;
  union {
    struct {
      int smp_vcpus, max_vcpus;
    } system;
  };
} qemu_info_t;
enum qemu_plugin_op { QEMU_PLUGIN_INLINE_ADD_U64 };
typedef void (*tb_trans_cb)(qemu_plugin_id_t id, struct qemu_plugin_tb* tb);
typedef void (*udata_cb)(qemu_plugin_id_t id, void* userdata);

void qemu_plugin_register_vcpu_tb_trans_cb(qemu_plugin_id_t id, tb_trans_cb cb);
void qemu_plugin_register_vcpu_tb_exec_inline(struct qemu_plugin_tb* tb, enum qemu_plugin_op op,
                                              void* ptr, uint64_t imm);
size_t qemu_plugin_tb_n_insns(const struct qemu_plugin_tb* tb);
uint64_t qemu_plugin_tb_vaddr(const struct qemu_plugin_tb* tb);
void qemu_plugin_register_atexit_cb(qemu_plugin_id_t id, udata_cb cb, void* userdata);
void qemu_plugin_outs(const char* string);

EXPORT int qemu_plugin_version = 1;

static uint64_t g_insns;

/* Profile: one slot per (block address, length), open addressing; a block translated again
 * finds its slot. The guest is single-threaded, as the library is. */
struct block {
  uint64_t vaddr, runs;
  uint32_t n_insns;
};
enum { kSlots = 1 << 18 };
static struct block* g_blocks;
static const char* g_profile;

static struct block* slot(uint64_t vaddr, uint32_t n) {
  uint64_t h = (vaddr * 0x9E3779B97F4A7C15ull ^ n) >> 46;
  for (uint32_t probe = 0; probe < kSlots; ++probe) {
    struct block* b = &g_blocks[(h + probe) & (kSlots - 1)];
    if (b->n_insns == 0) {
      b->vaddr = vaddr;
      b->n_insns = n;
    }
    if (b->vaddr == vaddr && b->n_insns == n) return b;
  }
  return NULL; /* full: the block goes uncounted in the profile, never in the total */
}

static void on_translate(qemu_plugin_id_t id, struct qemu_plugin_tb* tb) {
  (void)id;
  const size_t n = qemu_plugin_tb_n_insns(tb);
  qemu_plugin_register_vcpu_tb_exec_inline(tb, QEMU_PLUGIN_INLINE_ADD_U64, &g_insns, n);
  if (g_blocks != NULL && n > 0) {
    struct block* b = slot(qemu_plugin_tb_vaddr(tb), (uint32_t)n);
    if (b != NULL)
      qemu_plugin_register_vcpu_tb_exec_inline(tb, QEMU_PLUGIN_INLINE_ADD_U64, &b->runs, 1);
  }
}

static void at_exit(qemu_plugin_id_t id, void* userdata) {
  (void)id;
  (void)userdata;
  char line[64];
  snprintf(line, sizeof line, "insns %" PRIu64 "\n", g_insns);
  qemu_plugin_outs(line);
  if (g_blocks == NULL) return;
  FILE* f = fopen(g_profile, "w");
  if (f == NULL) return;
  for (uint32_t i = 0; i < kSlots; ++i) {
    const struct block* b = &g_blocks[i];
    if (b->runs > 0) fprintf(f, "%" PRIx64 " %u %" PRIu64 "\n", b->vaddr, b->n_insns, b->runs);
  }
  fclose(f);
}

EXPORT int qemu_plugin_install(qemu_plugin_id_t id, const qemu_info_t* info, int argc,
                               char** argv) {
  (void)info;
  for (int i = 0; i < argc; ++i) {
    if (strncmp(argv[i], "profile=", 8) == 0) g_profile = argv[i] + 8;
  }
  if (g_profile != NULL) {
    g_blocks = calloc(kSlots, sizeof *g_blocks);
    if (g_blocks == NULL) return -1;
  }
  qemu_plugin_register_vcpu_tb_trans_cb(id, on_translate);
  qemu_plugin_register_atexit_cb(id, at_exit, NULL);
  return 0;
}
