// Qt's icon reader warns once for every directory entry it cannot seek to; an icon made of
// thousands of such entries must not flood the terminal.
#include <gtest/gtest.h>

#include <QtGlobal>
#include <atomic>
#include <fstream>

#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

std::atomic<int> qtMessages{0};

void CountQtMessage(QtMsgType, const QMessageLogContext&, const QString&) {
  ++qtMessages;
}

// An icon whose directory promises count entries and holds present of them; the first one (when
// good) holds a 2 by 2 picture and the others point at offset.
std::vector<std::uint8_t> IconWithEntries(unsigned count, unsigned present, bool firstGood,
                                          std::uint32_t offset) {
  ByteWriter w;
  w.U16(0).U16(1).U16(count);
  const std::uint32_t pictureAt = 6 + 16 * present;
  const std::uint32_t pictureBytes = 40 + 2 * 2 * 4 + 2 * 4;  // header, pixels, mask rows
  for (unsigned i = 0; i < present; ++i) {
    const bool good = firstGood && i == 0;
    w.U8(2).U8(2).U8(0).U8(0).U16(1).U16(32).U32(pictureBytes).U32(good ? pictureAt : offset);
  }
  w.U32(40).I32(2).I32(4).U16(1).U16(32).U32(0).U32(0).I32(0).I32(0).U32(0).U32(0);
  for (int i = 0; i < 4; ++i) w.U8(10).U8(20).U8(30).U8(255);
  for (int i = 0; i < 2; ++i) w.U32(0);
  return w.bytes;
}

class IconWarnings : public TempFolder {};

TEST_F(IconWarnings, ThousandsOfBadEntriesGiveAtMostTwoWarnings) {
  struct Case {
    const char* name;
    unsigned count, present;
    bool firstGood;
    std::uint32_t offset;
    bool readable;
  };
  const Case cases[] = {
      {"65535 entries promised, 340 present", 65535, 340, true, 0xFFFFFF00u, false},
      {"all 65535 entries past the end", 65535, 65535, false, 0xFFFFFF00u, false},
      {"one good entry among 65535 past the end", 65535, 65535, true, 0xFFFFFF00u, true},
      {"entries pointing into the directory", 300, 300, false, 20, false},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    const std::string path = Path("flood.ico");
    const std::vector<std::uint8_t> bytes =
        IconWithEntries(c.count, c.present, c.firstGood, c.offset);
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(bytes.data()),
               static_cast<std::streamsize>(bytes.size()));
    qtMessages = 0;
    const QtMessageHandler previous = qInstallMessageHandler(CountQtMessage);
    std::optional<TBitmap32> picture;
    std::string error;
    try {
      picture = LoadPictureFile(path, [](const std::string&, const std::string&) {});
    } catch (const PictureFileError& e) {
      error = e.what();
    }
    qInstallMessageHandler(previous);
    EXPECT_LE(qtMessages.load(), 2);
    if (c.readable) {
      ASSERT_TRUE(picture && !picture->Empty()) << error;
      EXPECT_EQ(picture->Width(), 2);
    } else {
      EXPECT_TRUE(!error.empty() || !picture || picture->Empty());
    }
  }
}

}  // namespace
}  // namespace quillane::testing
