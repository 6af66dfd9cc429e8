// SPDX-License-Identifier: Apache-2.0
// A plugin of qemu-user 7 that counts what the guest executes between two system calls that do not
// exist, kBegin and kEnd. For each such stretch it writes a file PREFIX.NUMBER of these lines:
//
//   loaded BYTES
//   stored BYTES
//   block RUNS INSTRUCTION...     blocks that were executed, in no order: blocks 0, 1, ...
//   sequence BLOCK...             blocks in the order of execution; of long stretches evenly
//                                 spread pieces, one after the other
//
// The plugin's argument is out=PREFIX. Debian has no header of the plugin interface, so what is
// needed of it is declared here.
#include <stdint.h>
#include <string.h>

#include <fstream>
#include <memory>
#include <string>
#include <vector>

extern "C" {
using PluginId = uint64_t;
using MemoryInfo = uint32_t;
struct qemu_plugin_tb;
struct qemu_plugin_insn;
enum CallbackFlags { kNoRegisters };
enum MemoryAccess { kLoadsAndStores = 3 };

using BlockTranslated = void(PluginId, qemu_plugin_tb*);
using BlockExecuted = void(unsigned cpu, void* data);
using MemoryAccessed = void(unsigned cpu, MemoryInfo, uint64_t address, void* data);
using SystemCalled = void(PluginId, unsigned cpu, int64_t number, uint64_t, uint64_t, uint64_t,
                          uint64_t, uint64_t, uint64_t, uint64_t, uint64_t);

void qemu_plugin_register_vcpu_tb_trans_cb(PluginId, BlockTranslated*);
void qemu_plugin_register_vcpu_tb_exec_cb(qemu_plugin_tb*, BlockExecuted*, CallbackFlags, void*);
void qemu_plugin_register_vcpu_mem_cb(qemu_plugin_insn*, MemoryAccessed*, CallbackFlags,
                                      MemoryAccess, void*);
void qemu_plugin_register_vcpu_syscall_cb(PluginId, SystemCalled*);
size_t qemu_plugin_tb_n_insns(const qemu_plugin_tb*);
qemu_plugin_insn* qemu_plugin_tb_get_insn(const qemu_plugin_tb*, size_t);
const void* qemu_plugin_insn_data(const qemu_plugin_insn*);
unsigned qemu_plugin_mem_size_shift(MemoryInfo);
bool qemu_plugin_mem_is_store(MemoryInfo);

extern int qemu_plugin_version;
int qemu_plugin_install(PluginId, const void* info, int argc, char** argv);
}

namespace {

constexpr int64_t kBegin = 4242;
constexpr int64_t kEnd = 4243;

// A prime number of pieces, so that they begin in different places of a picture's rows.
constexpr uint64_t kPieces = 97;
constexpr uint64_t kPieceInstructions = 300;

struct Block {
    uint32_t number;
    uint64_t runs;
    std::vector<uint32_t> instructions;
};

std::string prefix = "count";
std::vector<std::unique_ptr<Block>> blocks;  // all that were ever translated
std::vector<uint32_t> executed;              // their numbers
bool counting = false;
uint64_t loaded = 0;
uint64_t stored = 0;

void block_executed(unsigned /*cpu*/, void* data) {
    if (!counting) return;
    auto* block = static_cast<Block*>(data);
    ++block->runs;
    executed.push_back(block->number);
}

void memory_accessed(unsigned /*cpu*/, MemoryInfo info, uint64_t /*address*/, void* /*data*/) {
    if (!counting) return;
    (qemu_plugin_mem_is_store(info) ? stored : loaded) += 1U << qemu_plugin_mem_size_shift(info);
}

void block_translated(PluginId /*id*/, qemu_plugin_tb* translated) {
    const auto number = static_cast<uint32_t>(blocks.size());
    blocks.push_back(std::make_unique<Block>(Block{number, 0, {}}));
    Block* block = blocks.back().get();
    block->instructions.resize(qemu_plugin_tb_n_insns(translated));
    for (size_t i = 0; i < block->instructions.size(); ++i) {
        qemu_plugin_insn* instruction = qemu_plugin_tb_get_insn(translated, i);
        memcpy(&block->instructions[i], qemu_plugin_insn_data(instruction), sizeof(uint32_t));
        qemu_plugin_register_vcpu_mem_cb(instruction, memory_accessed, kNoRegisters,
                                         kLoadsAndStores, nullptr);
    }
    qemu_plugin_register_vcpu_tb_exec_cb(translated, block_executed, kNoRegisters, block);
}

// Gives the blocks that were executed new numbers, in their order in the file.
void write_blocks(std::ofstream& file) {
    uint32_t number = 0;
    for (const auto& block : blocks) {
        if (block->runs == 0) continue;
        block->number = number++;
        file << "block " << block->runs << std::hex;
        for (const uint32_t instruction : block->instructions) file << ' ' << instruction;
        file << std::dec << '\n';
    }
}

void write_sequence(std::ofstream& file, const std::vector<const Block*>& sequence) {
    uint64_t total = 0;
    for (const Block* block : sequence) total += block->instructions.size();
    file << "sequence";
    uint64_t at = 0;
    uint64_t pieces = 0;
    uint64_t taken = 0;
    for (const Block* block : sequence) {
        if (at * kPieces >= pieces * total) {
            ++pieces;
            taken = 0;
        }
        at += block->instructions.size();
        if (taken >= kPieceInstructions) continue;
        taken += block->instructions.size();
        file << ' ' << block->number;
    }
    file << '\n';
}

void begin() {
    counting = true;
    loaded = stored = 0;
}

void end(uint64_t stretch) {
    counting = false;
    std::vector<const Block*> sequence;
    for (const uint32_t number : executed) sequence.push_back(blocks[number].get());
    executed.clear();
    std::ofstream file(prefix + '.' + std::to_string(stretch));
    file << "loaded " << loaded << "\nstored " << stored << '\n';
    write_blocks(file);
    write_sequence(file, sequence);
    for (size_t i = 0; i < blocks.size(); ++i) {
        blocks[i]->number = static_cast<uint32_t>(i);
        blocks[i]->runs = 0;
    }
}

void system_called(PluginId /*id*/, unsigned /*cpu*/, int64_t number, uint64_t first, uint64_t,
                   uint64_t, uint64_t, uint64_t, uint64_t, uint64_t, uint64_t) {
    if (number == kBegin) begin();
    if (number == kEnd && counting) end(first);
}

}  // namespace

int qemu_plugin_version = 1;

int qemu_plugin_install(PluginId id, const void* /*info*/, int argc, char** argv) {
    for (int i = 0; i < argc; ++i) {
        const std::string argument = argv[i];
        if (argument.rfind("out=", 0) == 0) prefix = argument.substr(4);
    }
    qemu_plugin_register_vcpu_tb_trans_cb(id, block_translated);
    qemu_plugin_register_vcpu_syscall_cb(id, system_called);
    return 0;
}
