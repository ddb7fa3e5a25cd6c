// Wall-clock timing for the benchmark programs that time what a user waits for (a window action
// until its paint, a whole command-line run), where Google Benchmark's loop does not fit.
#pragma once

#include <algorithm>
#include <chrono>
#include <functional>
#include <vector>

namespace quillane {

using Clock = std::chrono::steady_clock;

inline double Milliseconds(Clock::time_point since) {
  return std::chrono::duration<double, std::milli>(Clock::now() - since).count();
}

inline double Median(std::vector<double> times) {
  std::sort(times.begin(), times.end());
  return times[times.size() / 2];
}

// The median time of runs runs of work, in milliseconds.
inline double MedianOf(int runs, const std::function<void()>& work) {
  std::vector<double> times;
  for (int i = 0; i < runs; ++i) {
    const auto start = Clock::now();
    work();
    times.push_back(Milliseconds(start));
  }
  return Median(std::move(times));
}

}  // namespace quillane
