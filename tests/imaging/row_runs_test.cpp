// Rows shared out in runs: each row of the range exactly once, whatever the split.
#include <gtest/gtest.h>

#include <atomic>
#include <vector>

#include "imaging/parallel.h"

namespace quillane {
namespace {

TEST(ParallelRowRuns, EveryRowOnceForAnySplit) {
  struct Case {
    int begin, end, threads;
  };
  const Case cases[] = {{0, 1, 4}, {0, 3, 7}, {5, 6, 2}, {2, 130, 3}, {0, 1000, 2}, {-4, 517, 5}};
  for (const Case& c : cases) {
    SetRowSplit({c.threads, 0});
    std::vector<std::atomic<int>> visits(static_cast<std::size_t>(c.end - c.begin + 2));
    ParallelRowRuns(c.begin, c.end, 1, [&](int y0, int y1) {
      ASSERT_LT(y0, y1);
      for (int y = y0; y < y1; ++y) visits[static_cast<std::size_t>(y - c.begin + 1)]++;
    });
    SetRowSplit({});
    for (std::size_t i = 0; i < visits.size(); ++i)
      EXPECT_EQ(visits[i], i == 0 || i + 1 == visits.size() ? 0 : 1)
          << "row " << c.begin + static_cast<int>(i) - 1 << " of " << c.begin << ".." << c.end;
  }
}

}  // namespace
}  // namespace quillane
