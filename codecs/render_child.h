// What the metafile renderers (quillane-wmf-render, quillane-emf-render) share: limiting
// themselves before they read a byte, reading the file from standard input and answering on the
// reply channel (metafile_render.h).
#pragma once

#include <sys/resource.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "codecs/metafile_render.h"

namespace quillane::codecs::render_child {

// Never above a limit the program was started with: only lowering is allowed.
bool SetLimit(int resource, rlim_t soft, rlim_t hard);

// Has the kernel kill this process when the process that started it ends (a renderer killed
// with its parent would otherwise draw on until its CPU limit), and checks that the starter,
// named by RunHelper in the environment, has not ended already before that took effect. False
// when it has or the request failed. Called by LimitSelf.
bool DieWithParent();

// Dies with the parent (above), no core dumps, no files written, cpuSoft then cpuHard seconds of
// CPU time (SIGXCPU, then SIGKILL), and at most addressSpace bytes of memory. AddressSanitizer
// reserves terabytes of address space for its shadow memory at start-up, so a sanitizer build
// relies on the CPU limit and the sanitizer's own allocation checks only.
bool LimitSelf(rlim_t cpuSoft, rlim_t cpuHard, std::uint64_t addressSpace);

// Moves the reply channel off standard output, which then goes to /dev/null, so that a library
// printing there cannot corrupt the reply. False when that fails.
bool KeepReplyPrivate();

bool WriteAll(const void* data, std::size_t size);
// Writes the reply header; 0 when it went out, the program's exit code.
int Answer(metafile_render::Reply reply, std::uint32_t width = 0, std::uint32_t height = 0);
// Fills bytes from standard input; false when the input ends first.
bool ReadAll(std::vector<std::uint8_t>& bytes);
// A decimal number of at most most.
bool ParseCount(const char* text, std::uint64_t most, std::uint64_t& value);

}  // namespace quillane::codecs::render_child
