// One decoder family per build (chosen by QUILLANE_FUZZ_FAMILY_<name>; "stdin" is the entry for
// standard input, which picks the decoder by the content). Any input must give a
// picture or PictureFileError; a crash, leak, hang or sanitizer report is a fault.
#include <QtGlobal>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "codecs/codec_internal.h"
#include "codecs/exif_orientation.h"
#include "imaging/orientation.h"

namespace {

// The decoders' own pixel budget, set low: a header announcing a large picture is refused before
// any pixel is allocated, as it would be on a machine with little memory. With the full budget
// every input could allocate a gigabyte, and the targets ran 25 to 100 inputs a second; at 16K
// pixels (64 KB, 128 by 128) they run thousands. The checks that the file holds enough data
// for the picture it announces come before this limit, so headers of any size still reach them.
[[maybe_unused]] constexpr std::int64_t kFuzzMaxPixels = std::int64_t{1} << 14;

quillane::Bitmap32 Decode(quillane::codecs::Bytes bytes) {
  using namespace quillane::codecs;
#if defined(QUILLANE_FUZZ_FAMILY_jpeg)
  return DecodeJpeg(bytes, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_bmp)
  return DecodeWithQt(bytes, QtFormat::kBitmap, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_ico)
  return DecodeWithQt(bytes, QtFormat::kIcon, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_gif)
  return DecodeWithQt(bytes, QtFormat::kGif, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_png)
  return DecodePng(bytes, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_wmf)
  return DecodeWindowsMetafile(bytes, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_emf)
  return DecodeEnhancedMetafile(bytes, kFuzzMaxPixels);
#elif defined(QUILLANE_FUZZ_FAMILY_exif)
  // The input is the TIFF block of an APP1 segment; the fixed header is put in front so that
  // every input reaches libexif.
  std::vector<std::uint8_t> segment = {'E', 'x', 'i', 'f', 0, 0};
  segment.insert(segment.end(), bytes.begin(), bytes.end());
  return quillane::UprightPicture(quillane::Bitmap32(3, 2), ExifOrientation(segment));
#elif defined(QUILLANE_FUZZ_FAMILY_stdin)
  return DecodeByContent(bytes, kFuzzMaxPixels);
#else
#error "no decoder family chosen"
#endif
}

}  // namespace

// Qt's image readers warn about every hostile input ("QBuffer::seek: Invalid pos"); millions of
// such lines would bury the fuzzer's own report.
extern "C" int LLVMFuzzerInitialize(int*, char***) {
  qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) {});
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    const quillane::Bitmap32 picture = Decode({data, size});
    // Touch every pixel so that a short or misplaced buffer shows up under the sanitizers.
    unsigned sum = 0;
    for (int y = 0; y < picture.Height(); ++y) {
      const quillane::Pixel* row = picture.ScanLine(y);
      for (int x = 0; x < picture.Width(); ++x) sum += row[x].r;
    }
    asm volatile("" : : "r"(sum));  // keep the reads
  } catch (const quillane::PictureFileError&) {
  }
  return 0;
}
