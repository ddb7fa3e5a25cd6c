// The edge bytes of a stretch of a row and then their gray values, so that a stretch's edge
// bytes stay in the first-level cache. The edge arithmetic is written for the compiler to work
// on many bytes per instruction; it is compiled for any x86-64 and for AVX2, and the one this
// processor runs is chosen once.
#include "imaging/edge_gray_rows.h"

#include <algorithm>

#include "imaging/edge_byte.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// Pixels per stretch: their edge bytes take 2 KB.
constexpr int kStretch = 512;

// The edge bytes of the pixels x0 .. x0 + n - 1 of an interior row.
[[gnu::always_inline]] inline void EdgeBytes(const std::uint8_t* __restrict above,
                                             const std::uint8_t* __restrict row,
                                             const std::uint8_t* __restrict below, int x0, int n,
                                             std::uint8_t* __restrict edge) {
  const int first = 4 * x0;
  for (int j = 0; j < 4 * n; ++j) edge[j] = InvertedEdgeByte(above, row, below, first + j);
}

void PlainEdgeBytes(const std::uint8_t* above, const std::uint8_t* row, const std::uint8_t* below,
                    int x0, int n, std::uint8_t* edge) {
  EdgeBytes(above, row, below, x0, n, edge);
}

#if defined(__x86_64__) && defined(__GNUC__)
[[gnu::target("avx2")]] void Avx2EdgeBytes(const std::uint8_t* above, const std::uint8_t* row,
                                           const std::uint8_t* below, int x0, int n,
                                           std::uint8_t* edge) {
  EdgeBytes(above, row, below, x0, n, edge);
}
#endif

}  // namespace

void EdgeGrayRow(const TBitmap32& source, int y, std::uint8_t* gray) {
  const int w = source.Width();
  // The top and bottom rows repeat their inner neighbours, the side pixels theirs.
  const int inner = std::clamp(y, 1, source.Height() - 2);
  const auto* above = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner - 1));
  const auto* row = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner));
  const auto* below = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner + 1));
  auto* edges = PlainEdgeBytes;
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) edges = Avx2EdgeBytes;
#endif
  alignas(64) Pixel edge[kStretch];
  for (int x0 = 1; x0 < w - 1; x0 += kStretch) {
    const int n = std::min(kStretch, w - 1 - x0);
    edges(above, row, below, x0, n, reinterpret_cast<std::uint8_t*>(edge));
    GrayLevels(edge, gray + x0, n);
  }
  gray[0] = gray[1];
  gray[w - 1] = gray[w - 2];
}

}  // namespace quillane
