// Splitting row loops between threads. Each row's result depends only on inputs that no
// thread writes, so any split gives the same bytes as one thread.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <exception>
#include <thread>
#include <vector>

namespace quillane {

// Below this much work (in pixel-operations) a second thread costs more than it saves.
inline constexpr std::size_t kParallelThreshold = 1u << 18;

// How row passes split their work: into at most `threads` bands (0: one per processor), and
// into one band per `minimumWork` pixel-operations at most. The bytes never depend on it; the
// benchmarks pin one thread, and the tests force many bands onto small pictures.
struct RowSplit {
  int threads = 0;
  std::size_t minimumWork = kParallelThreshold;
};
namespace detail {
inline std::atomic<int> rowThreads{0};
inline std::atomic<std::size_t> rowMinimumWork{kParallelThreshold};
}  // namespace detail
inline void SetRowSplit(RowSplit split) {
  detail::rowThreads = split.threads;
  detail::rowMinimumWork = split.minimumWork;
}
inline RowSplit CurrentRowSplit() {
  return {detail::rowThreads.load(), detail::rowMinimumWork.load()};
}
// The number of bands a pass of rows rows at workPerRow each is split into.
inline int RowBands(int rows, std::size_t workPerRow) {
  if (rows <= 0) return 0;
  const RowSplit split = CurrentRowSplit();
  const unsigned threads = split.threads > 0 ? static_cast<unsigned>(split.threads)
                                             : std::max(1u, std::thread::hardware_concurrency());
  const std::size_t total = workPerRow * static_cast<std::size_t>(rows);
  const std::size_t byWork = split.minimumWork == 0 ? total + 1 : total / split.minimumWork + 1;
  return static_cast<int>(std::min<std::size_t>({threads, static_cast<std::size_t>(rows), byWork}));
}

namespace detail {
// Runs work(i) for i in 0 .. threads - 1, i = 0 on the calling thread. The first exception
// thrown by any of them is rethrown here after all have finished; failed is set as soon as one
// throws, for work that can stop early.
template <typename Work>
void OnThreads(int threads, std::atomic<bool>& failed, Work&& work) {
  std::vector<std::thread> pool;
  std::vector<std::exception_ptr> errors(static_cast<std::size_t>(threads));
  pool.reserve(static_cast<std::size_t>(threads - 1));
  const auto run = [&](int i) {
    try {
      work(i);
    } catch (...) {
      errors[static_cast<std::size_t>(i)] = std::current_exception();
      failed = true;
    }
  };
  for (int i = 1; i < threads; ++i) pool.emplace_back(run, i);
  run(0);
  for (auto& t : pool) t.join();
  for (auto& e : errors)
    if (e) std::rethrow_exception(e);
}
}  // namespace detail

// Calls body(y0, y1) over consecutive bands covering [begin, end). workPerRow estimates the
// cost of one row; small jobs run on the calling thread. The first exception thrown by any
// band is rethrown here after every band has finished.
template <typename Body>
void ParallelRows(int begin, int end, std::size_t workPerRow, Body&& body) {
  if (end <= begin) return;
  const int rows = end - begin;
  const int threads = RowBands(rows, workPerRow);
  if (threads <= 1) {
    body(begin, end);
    return;
  }
  std::atomic<bool> failed{false};
  detail::OnThreads(threads, failed, [&](int i) {
    const int y0 = begin + static_cast<int>(static_cast<long long>(rows) * i / threads);
    const int y1 = begin + static_cast<int>(static_cast<long long>(rows) * (i + 1) / threads);
    body(y0, y1);
  });
}

// Like ParallelRows for passes whose rows are independent of each other, but the threads take
// short runs of rows in turn instead of one fixed band each: on a machine that other programs
// keep busy, a thread that loses its processor for a while no longer holds up the whole pass
// while the others sit finished. body(y0, y1) is called for consecutive runs covering
// [begin, end), several times per thread, in no fixed order.
template <typename Body>
void ParallelRowRuns(int begin, int end, std::size_t workPerRow, Body&& body) {
  if (end <= begin) return;
  const int rows = end - begin;
  const int threads = RowBands(rows, workPerRow);
  if (threads <= 1) {
    body(begin, end);
    return;
  }
  // Each run is a share of the rows still untaken, so the runs shorten towards the end: a
  // thread that loses its processor in its last run then holds up the others for less. The
  // shortest are still long enough that taking one costs nothing.
  const int shortest = std::max(1, rows / (threads * 64));
  std::atomic<int> next{begin};
  std::atomic<bool> failed{false};
  const auto take = [&](int& y0, int& y1) {
    y0 = next.load(std::memory_order_relaxed);
    do {
      if (y0 >= end) return false;
      y1 = std::min(end, y0 + std::max(shortest, (end - y0) / (4 * threads)));
    } while (!next.compare_exchange_weak(y0, y1, std::memory_order_relaxed));
    return true;
  };
  detail::OnThreads(threads, failed, [&](int) {
    for (int y0, y1; !failed && take(y0, y1);) body(y0, y1);
  });
}

}  // namespace quillane
