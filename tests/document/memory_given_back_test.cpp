// Opening a small picture after a big one gives the big one's memory back to the system, the
// history's pictures and the memory kept for reuse included.
#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>

#include "document/document.h"
#include "imaging/picture_memory.h"

namespace quillane {
namespace {

std::int64_t ResidentBytes() {
  std::ifstream statm("/proc/self/statm");
  std::int64_t size = 0, resident = 0;
  statm >> size >> resident;
  return resident * ::sysconf(_SC_PAGESIZE);
}

TEST(MemoryGivenBack, OpeningASmallPictureAfterABigOne) {
#if defined(__SANITIZE_ADDRESS__)
  GTEST_SKIP() << "AddressSanitizer holds freed memory back on purpose";
#endif
  SetUpPictureMemory();
  constexpr std::int64_t kBig = 6000 * 4000 * 4;  // a 24-megapixel picture
  const auto big = [](std::uint8_t v) { return Bitmap32(6000, 4000, Pixel{v, v, v, 255}); };
  const std::int64_t before = ResidentBytes();
  {
    PictureDocument document(big(1));
    for (std::uint8_t step = 2; step <= 4; ++step) {
      document.SetWorking(big(step));
      document.Backup();
    }
    // A result replaced before its step was recorded: its memory is kept for the next one.
    document.SetWorking(big(5));
    document.SetWorking(big(6));
    // Packed history states let go of their pictures, whose memory is kept for reuse too.
    PictureDocument::WaitForHistoryPacking();
    EXPECT_GE(KeptPictureBytes(), static_cast<std::size_t>(kBig));
    EXPECT_GE(ResidentBytes() - before, 2 * kBig);

    document.Load(Bitmap32(451, 300, Pixel{7, 8, 9, 255}));
    document.ResetHistory();
    PictureDocument::WaitForHistoryPacking();
    EXPECT_EQ(KeptPictureBytes(), 0u);
    EXPECT_LT(ResidentBytes() - before, kBig / 2);
    EXPECT_EQ(document.Slot(1), document.Working());
    EXPECT_TRUE(document.Slot(2).Empty());
  }
  ReleasePictureMemory();
}

}  // namespace
}  // namespace quillane
