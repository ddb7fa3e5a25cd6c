// Splitting row loops between threads. Each row's result depends only on inputs that no
// thread writes, so any split gives the same bytes as one thread.
#pragma once

#include <algorithm>
#include <cstddef>
#include <exception>
#include <thread>
#include <vector>

namespace quillane {

// Below this much work (in pixel-operations) a second thread costs more than it saves.
inline constexpr std::size_t kParallelThreshold = 1u << 18;

// Calls body(y0, y1) over consecutive bands covering [begin, end). workPerRow estimates the
// cost of one row; small jobs run on the calling thread. The first exception thrown by any
// band is rethrown here after every band has finished.
template <typename Body>
void ParallelRows(int begin, int end, std::size_t workPerRow, Body&& body) {
  if (end <= begin) return;
  const int rows = end - begin;
  const unsigned hw = std::max(1u, std::thread::hardware_concurrency());
  const std::size_t total = workPerRow * static_cast<std::size_t>(rows);
  const int threads = static_cast<int>(
      std::min<std::size_t>({hw, static_cast<std::size_t>(rows), total / kParallelThreshold + 1}));
  if (threads <= 1) {
    body(begin, end);
    return;
  }
  std::vector<std::thread> pool;
  std::vector<std::exception_ptr> errors(static_cast<std::size_t>(threads));
  pool.reserve(static_cast<std::size_t>(threads - 1));
  const auto band = [&](int i) {
    const int y0 = begin + static_cast<int>(static_cast<long long>(rows) * i / threads);
    const int y1 = begin + static_cast<int>(static_cast<long long>(rows) * (i + 1) / threads);
    try {
      body(y0, y1);
    } catch (...) {
      errors[static_cast<std::size_t>(i)] = std::current_exception();
    }
  };
  for (int i = 1; i < threads; ++i) pool.emplace_back(band, i);
  band(0);
  for (auto& t : pool) t.join();
  for (auto& e : errors)
    if (e) std::rethrow_exception(e);
}

}  // namespace quillane
