// quillane-emf-render: draws one enhanced metafile with vector content and hands back its pixels
// (the exchange is described in metafile_render.h). libemf2svg turns the records into SVG text,
// which Qt's SVG renderer draws onto a white picture of the size the decoder chose. Both work on
// whatever the file holds, so the program limits itself before it reads a byte: a file that makes
// them draw without end or allocate without bound only ends this process.
#include <emf2svg.h>
#include <signal.h>
#include <unistd.h>

#include <QByteArray>
#include <QGuiApplication>
#include <QImage>
#include <QPainter>
#include <QSvgRenderer>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "codecs/metafile_render.h"
#include "codecs/render_child.h"

namespace {

using quillane::codecs::metafile_render::Reply;
namespace limits = quillane::codecs::metafile_render;
using namespace quillane::codecs::render_child;

constexpr std::uint64_t kMostPixels = std::uint64_t{1} << 31;
constexpr std::size_t kHeaderSize = 88;

bool ParseNumber(const char* text, double& value) {
  const char* end = text + std::strlen(text);
  const auto [stop, error] = std::from_chars(text, end, value);
  return error == std::errc() && stop == end && std::isfinite(value);
}

std::int32_t ReadLong(const std::vector<std::uint8_t>& d, std::size_t at) {
  std::uint32_t v = 0;
  for (int i = 3; i >= 0; --i) v = v << 8 | d[at + static_cast<std::size_t>(i)];
  return static_cast<std::int32_t>(v);
}

// The SVG text, or empty when libemf2svg could not convert the file.
QByteArray ToSvg(std::vector<std::uint8_t>& file) {
  generatorOptions options{};
  options.nameSpace = const_cast<char*>("");
  options.svgDelimiter = true;
  // Dual files carry their drawing as plain records too; those are what libemf2svg plays best.
  options.emfplus = false;
  char* svg = nullptr;
  std::size_t length = 0;
  const int converted =
      emf2svg(reinterpret_cast<char*>(file.data()), file.size(), &svg, &length, &options);
  QByteArray text;
  if (converted == 1 && svg != nullptr && length > 0) {
    text = QByteArray(svg, static_cast<qsizetype>(length));
  }
  std::free(svg);
  return text;
}

// Rows of a Format_RGB32 image are the bytes B, G, R, 255 on a little-endian machine; others
// are converted a row at a time.
bool SendPicture(const QImage& picture) {
  const auto width = static_cast<std::uint32_t>(picture.width());
  const auto height = static_cast<std::uint32_t>(picture.height());
  if (Answer(Reply::kPicture, width, height) != 0) return false;
  std::vector<std::uint8_t> row(static_cast<std::size_t>(width) * 4);
  for (std::uint32_t y = 0; y < height; ++y) {
    const auto* source = reinterpret_cast<const QRgb*>(picture.constScanLine(static_cast<int>(y)));
    for (std::uint32_t x = 0; x < width; ++x) {
      std::uint8_t* out = &row[static_cast<std::size_t>(x) * 4];
      out[0] = static_cast<std::uint8_t>(qBlue(source[x]));
      out[1] = static_cast<std::uint8_t>(qGreen(source[x]));
      out[2] = static_cast<std::uint8_t>(qRed(source[x]));
      out[3] = 255;
    }
    if (!WriteAll(row.data(), row.size())) return false;
  }
  return true;
}

int Run(int argc, char** argv) {
  std::uint64_t width = 0, height = 0, fileSize = 0;
  double m11 = 0, m22 = 0, dx = 0, dy = 0;
  if (argc != 8 || !ParseCount(argv[1], 0x7FFFFFFF, width) ||
      !ParseCount(argv[2], 0x7FFFFFFF, height) || !ParseCount(argv[3], 0x7FFFFFFF, fileSize) ||
      width == 0 || height == 0 || width * height > kMostPixels || fileSize < kHeaderSize ||
      !ParseNumber(argv[4], m11) || !ParseNumber(argv[5], m22) || !ParseNumber(argv[6], dx) ||
      !ParseNumber(argv[7], dy)) {
    return Answer(Reply::kNotStarted);
  }
  const std::uint64_t pixels = width * height;
  // The picture twice over: Qt's image and the rows on their way out.
  const std::uint64_t memory =
      pixels * 8 + fileSize * limits::kEmfBytesPerFileByte + limits::kEmfSpareAddressSpace;
  const rlim_t cpu = limits::CpuSeconds(pixels);
  if (!LimitSelf(cpu, cpu + 1, memory)) return Answer(Reply::kNotStarted);
  // Font caches that cannot be written (no file may grow) are simply not kept.
  ::signal(SIGXFSZ, SIG_IGN);

  std::vector<std::uint8_t> file(static_cast<std::size_t>(fileSize));
  if (!ReadAll(file)) return Answer(Reply::kNotOpened);
  QByteArray svg = ToSvg(file);
  if (svg.isEmpty()) return Answer(Reply::kNotDrawn);

  // Text needs Qt's font database, which needs an application; no display is needed.
  ::setenv("QT_QPA_PLATFORM", "offscreen", 1);
  int qtArgc = 1;
  char* qtArgv[] = {argv[0], nullptr};
  QGuiApplication application(qtArgc, qtArgv);

  QSvgRenderer renderer(svg);
  svg.clear();
  if (!renderer.isValid()) return Answer(Reply::kNotDrawn);
  QImage picture(static_cast<int>(width), static_cast<int>(height), QImage::Format_RGB32);
  if (picture.isNull()) return Answer(Reply::kNotDrawn);
  picture.fill(Qt::white);
  {
    // libemf2svg draws in the reference device's pixels, moved so that the header's bounds
    // start at (0, 0); the decoder's transform places the device's pixels on the picture.
    // The SVG's own size is ignored: a unit view box drawn onto a unit square keeps its
    // coordinates as they are.
    QPainter painter(&picture);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setRenderHint(QPainter::TextAntialiasing);
    // Bitmaps are scaled to the nearest pixel, as in the files played without the renderer.
    painter.translate(dx, dy);
    painter.scale(m11, m22);
    painter.translate(ReadLong(file, 8), ReadLong(file, 12));
    renderer.setViewBox(QRectF(0, 0, 1, 1));
    renderer.render(&painter, QRectF(0, 0, 1, 1));
  }
  return SendPicture(picture) ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  if (!KeepReplyPrivate()) return Answer(Reply::kNotStarted);
  // Qt's and the font library's teardown does nothing the ended process needs.
  std::_Exit(Run(argc, argv));
}
