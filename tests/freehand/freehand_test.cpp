// The freehand colour model, the tools' pixels, Thin, Thick and stroke undo on crafted pictures.
#include <gtest/gtest.h>

#include <cstring>

#include "freehand/stroke_history.h"
#include "freehand/strokes.h"

namespace quillane {
namespace {

constexpr Pixel kWhite{255, 255, 255, 255};
constexpr Pixel kBlack{0, 0, 0, 255};
Pixel Rgb(int r, int g, int b, int a = 255) {
  return Pixel{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
               static_cast<std::uint8_t>(r), static_cast<std::uint8_t>(a)};
}

// Rows of '#' (black), 'T' (paper tint) and '.' (white) into a picture.
Bitmap32 Drawing(std::initializer_list<const char*> rows) {
  Bitmap32 picture(static_cast<int>(std::strlen(*rows.begin())), static_cast<int>(rows.size()));
  int y = 0;
  for (const char* row : rows) {
    for (int x = 0; row[x] != 0; ++x)
      picture.At(x, y) = row[x] == '#' ? kBlack : row[x] == 'T' ? kPaperTint : kWhite;
    ++y;
  }
  return picture;
}

Bitmap32 Square(int size, int inset, int side) {
  Bitmap32 picture(size, size, kWhite);
  for (int y = inset; y < inset + side; ++y)
    for (int x = inset; x < inset + side; ++x) picture.At(x, y) = kBlack;
  return picture;
}

int CountBlack(const Bitmap32& picture) {
  int n = 0;
  for (int y = 0; y < picture.Height(); ++y)
    for (int x = 0; x < picture.Width(); ++x) n += picture.At(x, y) == kBlack ? 1 : 0;
  return n;
}

TEST(FreehandColor, BrushColourOfOnePixel) {
  struct Case {
    const char* what;
    Pixel brush, pixel, expected;
  };
  for (const Case& c : {
           Case{"red over black", Rgb(255, 0, 0), kBlack, Rgb(250, 0, 0)},
           Case{"red over a lighter gray keeps its lightness", Rgb(255, 0, 0), Rgb(200, 200, 200),
                Rgb(255, 140, 140)},
           Case{"gray brush raises to its lightness", Rgb(128, 128, 128), Rgb(10, 10, 10),
                Rgb(125, 125, 125)},
           Case{"blue over black", Rgb(0, 0, 255), kBlack, Rgb(0, 0, 250)},
       }) {
    SCOPED_TRACE(c.what);
    EXPECT_EQ(BrushColour(c.pixel, RGBtoHSL(c.brush)), c.expected);
  }
  EXPECT_EQ(RGBtoHSL(Rgb(255, 0, 0)), (FreehandHsl{0, 1, 0.5}));
  EXPECT_EQ(HSLtoRGB(0.49, 1, 0), Rgb(250, 0, 0));
}

TEST(FreehandBrush, NeverRecoloursPaperAndRecoloursAgainEachPass) {
  Bitmap32 picture(5, 1, kWhite);
  picture.At(1, 0) = Rgb(236, 233, 216, 0);
  picture.At(2, 0) = kBlack;
  picture.At(3, 0) = Rgb(200, 200, 200);
  const FreehandHsl red = RGBtoHSL(Rgb(255, 0, 0));
  BrushDisc(picture, 2, 0, 3, red);
  EXPECT_EQ(picture.At(0, 0), kWhite);
  EXPECT_EQ(picture.At(1, 0), Rgb(236, 233, 216, 0));
  EXPECT_EQ(picture.At(2, 0), Rgb(250, 0, 0));
  const Pixel once = picture.At(3, 0);
  BrushDisc(picture, 2, 0, 3, red);
  EXPECT_EQ(picture.At(2, 0), Rgb(250, 0, 0)) << "settles at the brush lightness - 0.01";
  EXPECT_LT(picture.At(3, 0).g, once.g) << "a second pass darkens a lighter stroke";
}

TEST(FreehandDisc, ExtentClippedAtTheEdges) {
  struct Case {
    int x, y, size, expectedWhite;
    PaintRect bounds;
  };
  // Radius 2: columns at distance 0, 1, 2 cover 5, 5, 1 rows: 17 pixels.
  for (const Case& c : {Case{5, 5, 2, 17, {3, 3, 8, 8}}, Case{0, 0, 2, 7, {0, 0, 3, 3}},
                        Case{10, 10, 2, 2, {8, 8, 10, 10}}, Case{-2, 5, 2, 1, {0, 3, 1, 8}},
                        Case{4, 4, 100, 100, {0, 0, 10, 10}}, Case{5, 5, 0, 1, {5, 5, 6, 6}}}) {
    SCOPED_TRACE(testing::Message() << c.x << "," << c.y << " size " << c.size);
    Bitmap32 picture(10, 10, kBlack);
    EXPECT_EQ(RubDisc(picture, c.x, c.y, c.size), c.bounds);
    EXPECT_EQ(100 - CountBlack(picture), c.expectedWhite);
  }
}

TEST(FreehandPen, DashedAtWidthOneSolidAbove) {
  Bitmap32 thin(40, 3, kWhite);
  LinePen pen{kBlack, 1, 0};
  DrawLine(thin, pen, 0, 1, 39, 1);
  EXPECT_EQ(CountBlack(thin), 18 + 15) << "18 on, 6 off; the end point left out";
  Bitmap32 wide(40, 7, kWhite);
  LinePen wider{kBlack, 3, 0};
  DrawLine(wide, wider, 5, 3, 34, 3);
  for (int x = 5; x <= 34; ++x) EXPECT_EQ(wide.At(x, 2), kBlack) << x;
  EXPECT_EQ(wide.At(20, 0), kWhite);
  EXPECT_EQ(wide.At(20, 5), kWhite);
  Bitmap32 beeline(10, 10, kWhite);
  LinePen one{kBlack, 1, 0};
  DrawLine(beeline, one, 1, 1, 6, 4, true);
  EXPECT_EQ(beeline.At(6, 4), kBlack) << "a beeline reaches its release point";
}

TEST(FreehandThin, OnePassPerPress) {
  Bitmap32 square = Square(10, 2, 6);
  Thin(square);
  EXPECT_EQ(square, Square(10, 3, 4)) << "the outer ring turns white";
  Thin(square);
  EXPECT_EQ(square, Square(10, 4, 2));

  const Bitmap32 line = Drawing({"........", "..####..", "........"});
  Bitmap32 thinned = line;
  Thin(thinned);
  EXPECT_EQ(thinned, line);

  // The block reaches the last interior row and column: they are thinned like the first.
  Bitmap32 block = Drawing({"....", ".##.", ".##.", "...."});
  Thin(block);
  EXPECT_EQ(block, Drawing({"....", "....", "....", "...."}));

  Bitmap32 inked = Drawing({".....", ".##T.", ".##T.", ".##T.", "....."});
  Thin(inked);
  EXPECT_EQ(inked.At(2, 2), Rgb(236, 233, 216, 0)) << "no pure white beside: the paper tint";
}

TEST(FreehandThick, SpreadsIntoPaperLastNeighbourWins) {
  Bitmap32 line = Drawing({".....", ".....", ".###.", ".....", "....."});
  Thick(line);
  EXPECT_EQ(line, Drawing({".....", ".###.", ".###.", ".###.", "....."}));

  Bitmap32 order(3, 3, kWhite);
  order.At(0, 1) = Rgb(255, 0, 0);
  order.At(2, 1) = Rgb(0, 255, 0);
  order.At(1, 0) = Rgb(0, 0, 200);
  order.At(1, 2) = Rgb(0, 0, 255);
  Bitmap32 result = order;
  Thick(result);
  EXPECT_EQ(result.At(1, 1), Rgb(0, 0, 255)) << "S wins over N, E and W";
  order.At(1, 2) = kWhite;
  Thick(result = order);
  EXPECT_EQ(result.At(1, 1), Rgb(0, 0, 200)) << "then N";
  // A white pixel takes the tint from S first, then the tint gives way to the ink at W.
  Bitmap32 tinted(3, 3, kPaperTint);
  tinted.At(0, 1) = Rgb(9, 9, 9);
  tinted.At(1, 1) = kWhite;
  Thick(tinted);
  EXPECT_EQ(tinted.At(1, 1), Rgb(9, 9, 9));
}

TEST(FreehandStrokes, UndoGivesBackTheExactPictureStrokeByStroke) {
  Bitmap32 picture(150, 90);
  for (int y = 0; y < 90; ++y)
    for (int x = 0; x < 150; ++x) picture.At(x, y) = Rgb(x, y, x ^ y, 200);
  const Bitmap32 original = picture;
  StrokeHistory history;
  history.Begin(picture);
  for (int x = -10; x < 160; x += 7) {
    history.Keep(picture, DiscBounds(picture, x, x / 2, 12));
    RubDisc(picture, x, x / 2, 12);
  }
  history.End();
  const Bitmap32 afterFirst = picture;
  history.Begin(picture);
  history.Keep(picture, {0, 0, 150, 90});
  Thin(picture);
  history.End();
  history.Begin(picture);  // nothing kept: no step
  history.End();
  history.End();  // a mouse-up without a stroke
  EXPECT_EQ(history.Count(), 2u);
  history.Undo(picture);
  EXPECT_EQ(picture, afterFirst);
  EXPECT_EQ(history.Undo(picture), (PaintRect{0, 0, 150, 90}));
  EXPECT_EQ(picture, original);
  EXPECT_TRUE(history.Undo(picture).Empty());
}

}  // namespace
}  // namespace quillane
