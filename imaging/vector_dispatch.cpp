#include "imaging/vector_dispatch.h"

#include <atomic>
#include <fstream>
#include <string>

namespace quillane {
namespace {

std::atomic<VectorWidth> widestAllowed{VectorWidth::Avx512};
std::atomic<bool> gathersAllowed{true};

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

// Gathers run at full speed on processors that gather data sampling does not touch, and where
// the kernel reports the flaw left open; its microcode mitigation, or no report at all, is
// taken to mean slow gathers.
bool GathersAtFullSpeed() {
  static const bool fast = [] {
    std::ifstream status("/sys/devices/system/cpu/vulnerabilities/gather_data_sampling");
    std::string line;
    if (!std::getline(status, line)) return false;
    return line.rfind("Not affected", 0) == 0 || line.rfind("Vulnerable", 0) == 0;
  }();
  return fast;
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

bool UseAvx512Gathers() {
  return gathersAllowed.load(std::memory_order_relaxed) && UseAvx512() && GathersAtFullSpeed();
}

void SetGathersAllowed(bool allowed) {
  gathersAllowed = allowed;
}

}  // namespace quillane
