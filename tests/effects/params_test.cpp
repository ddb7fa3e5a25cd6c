// The command line's reading of each parameter kind, and the cells' whole-number rule.
#include "effects/params.h"

#include <gtest/gtest.h>

namespace quillane {
namespace {

ParamSpec Direction() {
  return {.kind = ParamKind::Choice,
          .name = "direction",
          .defaultValue = 1,
          .options = {{.word = "rising"}, {.word = "falling"}, {.word = "vertical"}}};
}

TEST(ParamText, EachKindReadsItsOwnSyntax) {
  const ParamSpec slider{.name = "scope", .minimum = 1, .maximum = 10, .defaultValue = 3};
  EXPECT_EQ(ParseParamText(slider, "+10"), EffectParams::Values{10});
  EXPECT_EQ(ParseParamText(Direction(), "falling"), EffectParams::Values{2});
  EXPECT_EQ(ParseParamText(Direction(), "3"), EffectParams::Values{3});

  ParamSpec clicks = Direction();
  clicks.kind = ParamKind::Clicks;
  EXPECT_EQ(ParseParamText(clicks, "vertical,rising,vertical"), (EffectParams::Values{3, 1, 3}));
  EXPECT_EQ(ParseParamText(clicks, ""), EffectParams::Values{});

  const ParamSpec kernel{.kind = ParamKind::Cells, .name = "kernel", .cells = {"E1", "E2", "E3"}};
  EXPECT_EQ(ParseParamText(kernel, "1,-2,2147483647"), (EffectParams::Values{1, -2, 2147483647}));

  const ParamSpec colour{.kind = ParamKind::Colour, .name = "color"};
  // RRGGBB in, 0x00BBGGRR kept.
  EXPECT_EQ(ParseParamText(colour, "ff8000"), EffectParams::Values{0x0080FF});
  EXPECT_EQ(ParseParamText(colour, "#0000Fe"), EffectParams::Values{0xFE0000});
}

TEST(ParamText, BadTextNamesTheOptionAndWhatItTakes) {
  const ParamSpec slider{.name = "scope", .minimum = 1, .maximum = 10};
  const ParamSpec kernel{.kind = ParamKind::Cells, .name = "kernel", .cells = {"E1", "E2"}};
  ParamSpec clicks = Direction();
  clicks.kind = ParamKind::Clicks;
  const ParamSpec colour{.kind = ParamKind::Colour, .name = "color"};
  const struct {
    const ParamSpec& param;
    const char* text;
    const char* says;
  } cases[] = {
      {slider, "11", "--scope must be an integer from 1 to 10, not '11'"},
      {slider, "0x5", "from 1 to 10"},
      {Direction(), "diagonal", "--direction must be one of rising|falling|vertical"},
      {Direction(), "4", "one of"},
      {clicks, "rising,,falling", "a list of rising|falling|vertical"},
      {kernel, "1,2,3", "2 integers separated by commas"},
      {kernel, "1,x", "'x' is not a valid integer value"},
      {kernel, "1,2147483648", "'2147483648' is not a valid integer value"},
      {colour, "ff80", "RRGGBB"},
      {colour, "gg8000", "RRGGBB"},
  };
  for (const auto& c : cases) {
    try {
      ParseParamText(c.param, c.text);
      ADD_FAILURE() << c.text << " was accepted";
    } catch (const ParamError& e) {
      EXPECT_NE(std::string(e.what()).find(c.says), std::string::npos) << e.what();
    }
  }
}

TEST(ParamText, CellsTakeSignedDecimalsOnly) {
  EXPECT_EQ(ParseWholeNumber("-2147483648"), -2147483648LL);
  EXPECT_EQ(ParseWholeNumber("+7"), 7);
  for (const char* bad : {"", " 1", "1 ", "1.0", "--1", "+-1", "0x10", "1e3"})
    EXPECT_THROW(ParseWholeNumber(bad), ParamError) << bad;
}

}  // namespace
}  // namespace quillane
