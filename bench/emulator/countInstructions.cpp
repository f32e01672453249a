// A plugin for qemu's user mode that prints the instructions which the program
// executes between two marks.
//
// Debian has the header of this interface only in qemu's source package; these are
// the few declarations that are needed, of version 1.

#include "mark.h"

#include <cinttypes>
#include <cstdint>
#include <cstdio>

struct qemu_plugin_tb; // a block of instructions that is translated as a whole
struct qemu_info_t;

extern "C" {

using qemu_plugin_id_t = uint64_t;
constexpr int kAddU64 = 0;

void qemu_plugin_register_vcpu_tb_trans_cb(qemu_plugin_id_t id,
                                           void (*call)(qemu_plugin_id_t, qemu_plugin_tb *));
size_t qemu_plugin_tb_n_insns(const qemu_plugin_tb *block);
void qemu_plugin_register_vcpu_tb_exec_inline(qemu_plugin_tb *block, int operation, void *to,
                                              uint64_t value);
void qemu_plugin_register_vcpu_syscall_cb(qemu_plugin_id_t id,
                                          void (*call)(qemu_plugin_id_t, unsigned cpu,
                                                       int64_t number, uint64_t, uint64_t, uint64_t,
                                                       uint64_t, uint64_t, uint64_t, uint64_t,
                                                       uint64_t));

__attribute__((visibility("default"))) int qemu_plugin_version = 1;
__attribute__((visibility("default"))) int
qemu_plugin_install(qemu_plugin_id_t id, const qemu_info_t *info, int argc, char **argv);

} // extern "C"

namespace {

uint64_t executed, executedBefore;

void onTranslation(qemu_plugin_id_t /*id*/, qemu_plugin_tb *block) {
    qemu_plugin_register_vcpu_tb_exec_inline(block, kAddU64, &executed,
                                             qemu_plugin_tb_n_insns(block));
}

void onSystemCall(qemu_plugin_id_t /*id*/, unsigned /*cpu*/, int64_t number, uint64_t mark,
                  uint64_t, uint64_t, uint64_t, uint64_t, uint64_t, uint64_t, uint64_t) {
    if (number != kMarkCall)
        return;
    if (mark == kMarkEnd) {
        std::printf("%" PRIu64 "\n", executed - executedBefore);
        std::fflush(stdout);
    }
    executedBefore = executed;
}

} // namespace

int qemu_plugin_install(qemu_plugin_id_t id, const qemu_info_t * /*info*/, int /*argc*/,
                        char ** /*argv*/) {
    qemu_plugin_register_vcpu_tb_trans_cb(id, onTranslation);
    qemu_plugin_register_vcpu_syscall_cb(id, onSystemCall);
    return 0;
}
