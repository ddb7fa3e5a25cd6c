// The memory the process holds in RAM now, for the benchmarks that report what a user's machine
// must give the program.
#pragma once

#include <unistd.h>

#include <fstream>

namespace quillane {

inline double ResidentMegabytes() {
  std::ifstream statm("/proc/self/statm");
  long size = 0, resident = 0;
  statm >> size >> resident;
  return static_cast<double>(resident) * static_cast<double>(sysconf(_SC_PAGESIZE)) / 1e6;
}

}  // namespace quillane
