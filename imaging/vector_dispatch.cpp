#include "imaging/vector_dispatch.h"

#include <atomic>

namespace quillane {
namespace {

std::atomic<VectorWidth> widestAllowed{VectorWidth::Avx512};

VectorWidth ProcessorWidth() {
#if defined(__x86_64__) && defined(__GNUC__)
  static const VectorWidth width = [] {
    if (!__builtin_cpu_supports("avx2")) return VectorWidth::Plain;
    if (__builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512bw") &&
        __builtin_cpu_supports("avx512vl") && __builtin_cpu_supports("avx512dq"))
      return VectorWidth::Avx512;
    return VectorWidth::Avx2;
  }();
  return width;
#else
  return VectorWidth::Plain;
#endif
}

bool Use(VectorWidth width) {
  return widestAllowed.load(std::memory_order_relaxed) >= width && ProcessorWidth() >= width;
}

}  // namespace

bool UseAvx2() {
  return Use(VectorWidth::Avx2);
}

bool UseAvx512() {
  return Use(VectorWidth::Avx512);
}

void SetWidestVectors(VectorWidth widest) {
  widestAllowed = widest;
}

}  // namespace quillane
