#include "imaging/vector_dispatch.h"

#include <atomic>

namespace quillane {
namespace {

std::atomic<bool> avx2Allowed{true};

bool ProcessorHasAvx2() {
#if defined(__x86_64__) && defined(__GNUC__)
  static const bool has = __builtin_cpu_supports("avx2");
  return has;
#else
  return false;
#endif
}

}  // namespace

bool UseAvx2() {
  return avx2Allowed.load(std::memory_order_relaxed) && ProcessorHasAvx2();
}

void SetAvx2Allowed(bool allowed) {
  avx2Allowed = allowed;
}

}  // namespace quillane
