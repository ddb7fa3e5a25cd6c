// The row passes of the colour model in every variant (AVX-512 with and without gathers, AVX2,
// plain) against the plain conversions, for every colour there is and every H, S and L that
// comes back; the effects' tests take them through awkward sizes and bands.
#include <gtest/gtest.h>

#include <algorithm>
#include <ostream>
#include <vector>

#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

// The AVX-512 rows come twice: with the table gathered, and read an entry at a time as where
// gathers are slow.
struct Variant {
  VectorWidth widest;
  bool gathers;
};
constexpr Variant kVariants[] = {{VectorWidth::Avx512, true},
                                 {VectorWidth::Avx512, false},
                                 {VectorWidth::Avx2, true},
                                 {VectorWidth::Plain, true}};

void Use(const Variant& variant) {
  SetWidestVectors(variant.widest);
  SetGathersAllowed(variant.gathers);
}

std::ostream& operator<<(std::ostream& out, const Variant& variant) {
  return out << " width " << static_cast<int>(variant.widest) << " gathers " << variant.gathers;
}

struct AllowAllAfterwards {
  ~AllowAllAfterwards() { Use({VectorWidth::Avx512, true}); }
};

Pixel Colour(int r, int g, int b) {
  return Pixel{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
               static_cast<std::uint8_t>(r), 9};
}

// Red levels in shards of 32 so that the shards can run side by side.
class EveryColourInRows : public ::testing::TestWithParam<int> {};
INSTANTIATE_TEST_SUITE_P(RedLevels, EveryColourInRows, ::testing::Range(0, 256, 32));

TEST_P(EveryColourInRows, BothVariantsEqualThePlainConversions) {
  AllowAllAfterwards restore;
  const HslRowChanger unchanged(HslChange{});
  std::vector<Pixel> row(256 * 256);
  std::vector<Hsl> expected(row.size()), hsl(row.size());
  std::vector<Pixel> back(row.size()), out(row.size());
  for (int r = GetParam(); r < GetParam() + 32; ++r) {
    for (int g = 0; g < 256; ++g)
      for (int b = 0; b < 256; ++b) {
        const std::size_t i = static_cast<std::size_t>(g * 256 + b);
        row[i] = Colour(r, g, b);
        expected[i] = RgbToHslReference(r, g, b);
        const Rgb o = HslToRgb(expected[i].h, expected[i].s, expected[i].l);
        back[i] = Pixel{static_cast<std::uint8_t>(o.b), static_cast<std::uint8_t>(o.g),
                        static_cast<std::uint8_t>(o.r), 255};
      }
    for (const Variant& variant : kVariants) {
      Use(variant);
      RgbToHslRow(row.data(), hsl.data(), static_cast<int>(row.size()));
      unchanged.Row(row.data(), out.data(), static_cast<int>(row.size()));
      for (std::size_t i = 0; i < row.size(); ++i) {
        ASSERT_EQ(hsl[i], expected[i]) << r << "," << i / 256 << "," << i % 256 << variant;
        ASSERT_EQ(out[i], back[i]) << r << "," << i / 256 << "," << i % 256 << variant;
      }
    }
  }
}

// Every H, S and L the conversion back can meet: a saturated colour of each hue, its S moved
// down by the change and its L set through the levels.
TEST(HslRowChanger, EveryHslComesBackAsTheTablesGiveIt) {
  AllowAllAfterwards restore;
  std::vector<Pixel> hues(360);
  std::vector<bool> found(360);
  for (int c = 0; c < 6 * 256; ++c) {
    const int v = c % 256, order = c / 256;
    const int channels[6][3] = {{255, v, 0}, {v, 255, 0}, {0, 255, v},
                                {0, v, 255}, {v, 0, 255}, {255, 0, v}};
    const auto [r, g, b] = channels[order];
    const Hsl hsl = RgbToHsl(r, g, b);
    if (hsl.s != 100 || found[static_cast<std::size_t>(hsl.h)]) continue;
    found[static_cast<std::size_t>(hsl.h)] = true;
    hues[static_cast<std::size_t>(hsl.h)] = Colour(r, g, b);
  }
  ASSERT_EQ(std::count(found.begin(), found.end(), true), 360);
  std::vector<Pixel> in, out(360 * 101);
  std::vector<std::uint8_t> level;
  LightnessByLevel asLevel;
  for (int l = 0; l <= 100; ++l) {
    in.insert(in.end(), hues.begin(), hues.end());
    level.insert(level.end(), 360, static_cast<std::uint8_t>(l));
  }
  for (int level0 = 0; level0 <= 100; ++level0)
    for (int l = 0; l <= 100; ++l)
      asLevel.at[static_cast<std::size_t>(level0 * 101 + l)] = static_cast<std::uint8_t>(level0);
  for (const Variant& variant : kVariants) {
    Use(variant);
    for (int s = 0; s <= 100; ++s) {
      HslRowChanger(HslChange{0, s - 100, 0})
          .RowWithLevels(in.data(), out.data(), static_cast<int>(in.size()), level.data(), asLevel);
      for (std::size_t i = 0; i < out.size(); ++i) {
        const int h = static_cast<int>(i % 360), l = static_cast<int>(i / 360);
        const Rgb e = HslToRgb(h, s, l);
        ASSERT_EQ(out[i], (Pixel{static_cast<std::uint8_t>(e.b), static_cast<std::uint8_t>(e.g),
                                 static_cast<std::uint8_t>(e.r), 255}))
            << h << "," << s << "," << l << variant;
      }
    }
  }
}

// Every level with every L, each pair to its own entry, up to the table's last one.
TEST(HslRowChanger, LevelsReachEveryEntryInEveryVariant) {
  AllowAllAfterwards restore;
  std::vector<Pixel> grayOf(101);  // a gray of each L
  for (int v = 0; v < 256; ++v)
    grayOf[static_cast<std::size_t>(RgbToHsl(v, v, v).l)] = Colour(v, v, v);
  LightnessByLevel byLevel;
  std::vector<Pixel> in;
  std::vector<std::uint8_t> level;
  for (int k = 0; k < 256 * 101; ++k) {
    byLevel.at[static_cast<std::size_t>(k)] = static_cast<std::uint8_t>(k * 37 % 101);
    in.push_back(grayOf[static_cast<std::size_t>(k % 101)]);
    level.push_back(static_cast<std::uint8_t>(k / 101));
  }
  std::vector<Pixel> out(in.size());
  for (const Variant& variant : kVariants) {
    Use(variant);
    HslRowChanger(HslChange{})
        .RowWithLevels(in.data(), out.data(), static_cast<int>(in.size()), level.data(), byLevel);
    for (std::size_t k = 0; k < in.size(); ++k) {
      const auto v = static_cast<std::uint8_t>(HslToRgb(0, 0, static_cast<int>(k * 37 % 101)).r);
      ASSERT_EQ(out[k], (Pixel{v, v, v, 255})) << k << variant;
    }
  }
}

}  // namespace
}  // namespace quillane
