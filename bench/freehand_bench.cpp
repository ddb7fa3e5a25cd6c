// Freehand painting on a 12-megapixel picture: one brush dab in the pixel core, and one mouse
// move through the real work area (stroke undo bookkeeping and the repaint of what changed
// included), against a plain copy of the whole picture, which a move must never need.
#include <benchmark/benchmark.h>

#include <QApplication>
#include <QMouseEvent>
#include <QPointingDevice>
#include <QToolButton>
#include <cstring>

#include "app/main_window.h"
#include "app/tool_windows.h"
#include "bench/synthetic_photo.h"
#include "freehand/stroke_history.h"
#include "freehand/strokes.h"
#include "ui/freehand/control_panel_window.h"
#include "ui/freehand/painting_window.h"
#include "ui/freehand/work_area_window.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr int kWidth = bench::kPhotoWidth;
constexpr int kHeight = bench::kPhotoHeight;
using bench::Photo;

// A point on a zigzag through the part of the picture the work area shows at first.
QPoint PathPoint(std::int64_t i) {
  const int x = 50 + static_cast<int>(i * 3 % 1200);
  return QPoint(x < 650 ? x : 1250 - x, 50 + static_cast<int>(i % 400));
}

void BM_WholePictureCopy(benchmark::State& state) {
  Bitmap32 copy(kWidth, kHeight);
  for (auto _ : state) {
    std::memcpy(copy.Data(), Photo().Data(), Photo().PixelCount() * sizeof(Pixel));
    benchmark::DoNotOptimize(copy.Data());
  }
}
BENCHMARK(BM_WholePictureCopy)->Unit(benchmark::kMicrosecond);

void BM_BrushDab(benchmark::State& state) {
  Bitmap32 picture = Photo();
  const int size = static_cast<int>(state.range(0));
  const FreehandHsl red = RGBtoHSL(Pixel{0, 0, 255, 255});
  StrokeHistory strokes;
  std::int64_t i = 0;
  strokes.Begin(picture);
  for (auto _ : state) {
    const QPoint at = PathPoint(i++);
    strokes.Keep(picture, DiscBounds(picture, at.x(), at.y(), size));
    benchmark::DoNotOptimize(BrushDisc(picture, at.x(), at.y(), size, red));
  }
  strokes.End();
}
BENCHMARK(BM_BrushDab)->Arg(16)->Arg(100)->Unit(benchmark::kMicrosecond);

class NoPlatform : public PlatformServices {
 public:
  void ShowMessage(const QString&, const QString&) override {}
  void ShowError(const QString&) override {}
  std::optional<FileChoice> OpenPictureDialog(const QString&) override { return {}; }
  std::optional<FileChoice> SavePictureDialog(const QString&, const QString&) override {
    return {};
  }
  std::optional<QString> BrowseFolder(const QString&, const QString&) override { return {}; }
  std::optional<std::uint32_t> ChooseColor(std::uint32_t) override { return {}; }
  bool OpenFolder(const QString&) override { return false; }
  bool PrintDialog(QPrinter&) override { return false; }
  bool OpenWithDefaultProgram(const QString&) override { return false; }
};

// One mouse move with the brush held down, delivered to the work area and painted.
void BM_BrushMoveEvent(benchmark::State& state) {
  static const QPointingDevice mouse("bench mouse", 1, QInputDevice::DeviceType::Mouse,
                                     QPointingDevice::PointerType::Generic,
                                     QInputDevice::Capability::Position, 1, 3);
  NoPlatform platform;
  MainWindow main(platform, Photo());
  CreateToolWindows(main);
  main.show();
  FreehandPainting* painting = main.findChild<FreehandPainting*>();
  painting->ColorUp();
  painting->ControlPanel().findChild<QToolButton*>("SpeedButton14")->click();
  QWidget* canvas = painting->WorkArea().Canvas();
  QCoreApplication::processEvents();
  const auto send = [&](QEvent::Type type, QPoint at, Qt::MouseButton button,
                        Qt::MouseButtons held) {
    QMouseEvent event(type, at, at, at, button, held, Qt::NoModifier, &mouse);
    QCoreApplication::sendEvent(canvas, &event);
  };
  std::int64_t i = 0;
  send(QEvent::MouseButtonPress, PathPoint(i), Qt::LeftButton, Qt::LeftButton);
  for (auto _ : state) {
    send(QEvent::MouseMove, PathPoint(++i), Qt::NoButton, Qt::LeftButton);
    QCoreApplication::processEvents();
  }
  send(QEvent::MouseButtonRelease, PathPoint(i), Qt::LeftButton, Qt::NoButton);
  painting->WorkArea().close();
}
BENCHMARK(BM_BrushMoveEvent)->Unit(benchmark::kMicrosecond);

void BM_Thin(benchmark::State& state) {
  Bitmap32 picture = Photo();
  for (auto _ : state) Thin(picture);
}
BENCHMARK(BM_Thin)->Unit(benchmark::kMillisecond);

void BM_Thick(benchmark::State& state) {
  Bitmap32 picture = Photo();
  for (auto _ : state) Thick(picture);
}
BENCHMARK(BM_Thick)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace quillane

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
