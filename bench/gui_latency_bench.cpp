// What the user waits for on a 20-megapixel photo: the real main window and tool windows on
// the offscreen platform, each action timed from the moment it is given to the moment the
// picture control has painted the new state, beside the floor of the same work measured in the
// same run (the decoder alone, the routine alone, a memcpy, the encoder alone). Each action is
// the median of a few runs with the background work idle before each, so that one action's
// background work is not charged to the next; each floor is the best of its runs.
#include <unistd.h>

#include <QAbstractButton>
#include <QApplication>
#include <QElapsedTimer>
#include <QEvent>
#include <QLineEdit>
#include <QPainter>
#include <QScrollArea>
#include <QScrollBar>
#include <QTemporaryDir>
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <fstream>
#include <functional>
#include <iterator>
#include <string>
#include <vector>

#include "app/image_size_dialog.h"
#include "app/main_window.h"
#include "app/tool_windows.h"
#include "bench/resident_memory.h"
#include "bench/synthetic_photo.h"
#include "bench/wall_clock.h"
#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"
#include "document/run_effect.h"
#include "imaging/picture_memory.h"
#include "imaging/rotate.h"
#include "ui/picture_view.h"
#include "ui/platform.h"
#include "ui/tool_window.h"

namespace quillane {
namespace {

// The size of the camera photo the figures were first taken on.
constexpr int kWidth = 6028;
constexpr int kHeight = 3391;
constexpr int kRuns = 5;

// Answers the save dialog from a queue; everything else is refused or cancelled, and any
// message or error is printed, since the benchmark expects none.
class BenchPlatform : public PlatformServices {
 public:
  std::deque<FileChoice> saveAnswers;

  void ShowMessage(const QString& caption, const QString& text) override {
    std::fprintf(stderr, "message: %s: %s\n", qPrintable(caption), qPrintable(text));
  }
  void ShowError(const QString& text) override {
    std::fprintf(stderr, "error: %s\n", qPrintable(text));
  }
  std::optional<FileChoice> OpenPictureDialog(const QString&) override { return std::nullopt; }
  std::optional<FileChoice> SavePictureDialog(const QString&, const QString&) override {
    if (saveAnswers.empty()) return std::nullopt;
    FileChoice choice = saveAnswers.front();
    saveAnswers.pop_front();
    return choice;
  }
  std::optional<QString> BrowseFolder(const QString&, const QString&) override {
    return std::nullopt;
  }
  std::optional<std::uint32_t> ChooseColor(std::uint32_t) override { return std::nullopt; }
  bool OpenFolder(const QString&) override { return false; }
  bool PrintDialog(QPrinter&) override { return false; }
  bool OpenWithDefaultProgram(const QString&) override { return false; }
};

// Notes when the picture control has finished painting; what the window does after that (once
// the picture is on screen) is not the user's wait.
class PaintProbe {
 public:
  explicit PaintProbe(PictureView* view) {
    QObject::connect(view, &PictureView::painted, view, [this] {
      painted = true;
      paintedAt = Clock::now();
    });
  }
  bool painted = false;
  Clock::time_point paintedAt;
};

class Bench {
 public:
  Bench(MainWindow& main, BenchPlatform& platform)
      : main_(main), platform_(platform), probe_(main.findChild<PictureView*>("Image1")) {}

  // Waits for the history packer and the event loop to go quiet.
  void Settle() {
    PictureDocument::WaitForHistoryPacking();
    for (int i = 0; i < 3; ++i) QApplication::processEvents();
  }

  // From action to the picture control's next paint after the action returned.
  double TimeToPaint(const std::function<void()>& action) {
    Settle();
    probe_.painted = false;
    const auto start = Clock::now();
    action();
    probe_.painted = false;
    while (!probe_.painted) QApplication::processEvents(QEventLoop::WaitForMoreEvents);
    return std::chrono::duration<double, std::milli>(probe_.paintedAt - start).count();
  }

  // A floor is timed on its second run, so that its memory comes warm from the first, as the
  // window's own memory does once the program has run a while.
  // The history packer is let finish first, as before each action.
  static double TimeOf(const std::function<void()>& work) {
    PictureDocument::WaitForHistoryPacking();
    work();
    const auto start = Clock::now();
    work();
    return Milliseconds(start);
  }

  void Report(const char* action, const std::vector<double>& times, const char* floorName,
              const std::vector<double>& floors) {
    const double t = Median(times), f = *std::min_element(floors.begin(), floors.end());
    std::printf("%s: %.1f ms (floor %s %.1f ms, %.1fx)\n", action, t, floorName, f, t / f);
    std::fflush(stdout);
  }

  MainWindow& main_;
  BenchPlatform& platform_;
  PaintProbe probe_;
};

QAbstractButton* OkButton(ToolWindow& window) {
  for (QAbstractButton* button : window.findChildren<QAbstractButton*>())
    if (button->text() == "OK" && button->isVisible()) return button;
  return nullptr;
}

int Run(int argc, char** argv) {
  SetUpPictureMemory();
  QApplication app(argc, argv);
  QTemporaryDir folder;
  const std::string photoPath = (folder.path() + "/photo.jpg").toStdString();
  {
    const std::vector<std::uint8_t> bytes =
        codecs::EncodeJpeg(bench::SyntheticPhoto(kWidth, kHeight), 90);
    std::ofstream(photoPath, std::ios::binary)
        .write(reinterpret_cast<const char*>(bytes.data()),
               static_cast<std::streamsize>(bytes.size()));
  }

  BenchPlatform platform;
  MainWindow main(platform);
  CreateToolWindows(main);
  main.resize(1280, 900);
  main.show();
  Bench bench(main, platform);
  bench.Settle();

  std::printf("gui latency, %d x %d JPEG: each action the median of %d, each floor the best\n",
              kWidth, kHeight, kRuns);

  // --- Open
  std::vector<double> times, floors;
  for (int i = 0; i < kRuns; ++i) {
    times.push_back(
        bench.TimeToPaint([&] { main.OpenPictureFile(QString::fromStdString(photoPath)); }));
    floors.push_back(Bench::TimeOf([&] { (void)LoadPictureFile(photoPath); }));
  }
  bench.Report("open", times, "decode", floors);

  // --- OK of three tool windows, each from the opened picture
  const auto memcpyFloor = [&] {
    const Bitmap32& picture = main.Document().Working();
    Bitmap32 copy = Bitmap32::ForOverwrite(picture.Width(), picture.Height());
    return Bench::TimeOf(
        [&] { std::memcpy(copy.Data(), picture.Data(), picture.PixelCount() * sizeof(Pixel)); });
  };
  struct OkCase {
    const char* label;
    const char* cliName;
  };
  for (const OkCase& c :
       {OkCase{"OK pencil sketch", "pencil-sketch"}, OkCase{"OK water colour", "water-color"},
        OkCase{"OK HSL adjust", "hsl-adjust"}}) {
    const EffectSpec& spec = *FindEffectByCliName(c.cliName);
    main.OpenTool(spec.toolNumber);
    ToolWindow& window = *main.ToolWindowAt(spec.toolNumber);
    QAbstractButton* ok = OkButton(window);
    if (ok == nullptr) {
      std::fprintf(stderr, "%s: no OK button\n", c.cliName);
      return 1;
    }
    times.clear();
    floors.clear();
    for (int i = 0; i < kRuns; ++i) {
      // The floor runs on the pictures the OK started from, once the OK is done.
      EffectRun run(main.Document(), spec, window.Params());
      times.push_back(bench.TimeToPaint([&] { ok->click(); }));
      floors.push_back(Bench::TimeOf([&] {
        EffectRun fresh = run;  // each result let go of before the next run
        fresh.Compute();
      }));
    }
    main.CloseToolWindow();
    bench.Report(c.label, times, "routine", floors);
  }

  // --- Undo, Redo over the steps just made, then Renew after a step
  times.clear();
  floors.clear();
  for (int i = 0; i < kRuns; ++i) {
    floors.push_back(memcpyFloor());
    times.push_back(bench.TimeToPaint([&] { main.OnUndo(); }));
  }
  bench.Report("undo", times, "memcpy", floors);
  times.clear();
  for (int i = 0; i < kRuns; ++i) times.push_back(bench.TimeToPaint([&] { main.OnRedo(); }));
  bench.Report("redo", times, "memcpy", floors);
  times.clear();
  {
    const EffectSpec& hsl = *FindEffectByCliName("hsl-adjust");
    for (int i = 0; i < kRuns; ++i) {
      main.ApplyEffect(hsl, hsl.Defaults(), true);
      times.push_back(bench.TimeToPaint([&] { main.OnRenew(); }));
    }
  }
  bench.Report("renew", times, "memcpy", floors);

  // --- A quarter turn, with a step made first so that source and working differ as usual
  times.clear();
  floors.clear();
  {
    const EffectSpec& pencil = *FindEffectByCliName("pencil-sketch");
    main.ApplyEffect(pencil, pencil.Defaults(), true);
    for (int i = 0; i < kRuns; ++i) {
      const auto working = main.Document().SharedWorking();
      const auto source = main.Document().SharedSource();
      times.push_back(bench.TimeToPaint([&] { main.OnRotateClockwise(); }));
      floors.push_back(Bench::TimeOf([&] {
        const auto turn = [](const Bitmap32& p) {
          (void)RotatePicture(p, RotationCentre(p.Width()), RotationCentre(p.Height()),
                              QuarterTurn::Clockwise);
        };
        turn(*working);
        if (source != working) turn(*source);
      }));
    }
  }
  bench.Report("rotate", times, "routine", floors);
  main.OnRenew();

  // --- Image size to half
  times.clear();
  floors.clear();
  {
    const EffectSpec& pencil = *FindEffectByCliName("pencil-sketch");
    ImageSizeDialog& dialog = main.ImageSize();
    for (int i = 0; i < kRuns; ++i) {
      main.OnRenew();
      main.ApplyEffect(pencil, pencil.Defaults(), true);
      bench.Settle();
      const auto working = main.Document().SharedWorking();
      const auto source = main.Document().SharedSource();
      const int w = working->Width() / 2, h = working->Height() / 2;
      main.OnImageSize();
      dialog.findChild<QLineEdit*>("Edit1")->setText(QString::number(w));
      dialog.findChild<QLineEdit*>("Edit2")->setText(QString::number(h));
      QAbstractButton* ok = dialog.findChild<QAbstractButton*>("Button1");
      times.push_back(bench.TimeToPaint([&] { ok->click(); }));
      floors.push_back(Bench::TimeOf([&] {
        for (const auto& p : {working, source}) {
          Bitmap32 copy = *p;
          ResampleNearest(copy, static_cast<double>(h) / p->Height(),
                          static_cast<double>(w) / p->Width());
        }
      }));
    }
  }
  bench.Report("image size half", times, "routine", floors);
  main.OnRenew();

  // --- One zoom step each way; the floor draws the visible part at the new scale
  times.clear();
  floors.clear();
  std::vector<double> outTimes;
  {
    auto* scroll = main.findChild<QScrollArea*>("ScrollBox1");
    const QSize viewport = scroll->viewport()->size();
    const Bitmap32& picture = main.Document().Working();
    const QImage shown(reinterpret_cast<const uchar*>(picture.Data()), picture.Width(),
                       picture.Height(), static_cast<qsizetype>(picture.Width()) * 4,
                       QImage::Format_RGB32);
    for (int i = 0; i < kRuns; ++i) {
      floors.push_back(Bench::TimeOf([&] {
        QImage target(viewport, QImage::Format_RGB32);
        QPainter painter(&target);
        const double scale = main.ZoomPercent() * 1.25 / 100;
        painter.drawImage(QRectF(0, 0, picture.Width() * scale, picture.Height() * scale), shown);
      }));
      times.push_back(bench.TimeToPaint([&] { main.OnZoomIn(); }));
      outTimes.push_back(bench.TimeToPaint([&] { main.OnZoomOut(); }));
    }
  }
  bench.Report("zoom in", times, "paint visible", floors);
  bench.Report("zoom out", outTimes, "paint visible", floors);

  // --- Save as JPEG
  times.clear();
  floors.clear();
  {
    const QString savePath = folder.path() + "/saved.jpg";
    std::vector<double> saveTimes;
    for (int i = 0; i < kRuns; ++i) {
      floors.push_back(
          Bench::TimeOf([&] { (void)codecs::EncodeJpeg(main.Document().Working(), 90); }));
      platform.saveAnswers.push_back(FileChoice{savePath, 1});
      bench.Settle();
      const auto start = Clock::now();
      main.OnSave();
      saveTimes.push_back(Milliseconds(start));
    }
    // Saving changes nothing on screen: the wait is the command itself.
    bench.Report("save JPEG", saveTimes, "encode", floors);
  }

  // --- Resident memory after 20 OKs
  {
    const char* names[] = {"pencil-sketch", "hsl-adjust", "water-color", "emboss"};
    main.OnRenew();
    for (int i = 0; i < 20; ++i) {
      const EffectSpec& spec = *FindEffectByCliName(names[i % std::size(names)]);
      main.ApplyEffect(spec, spec.Defaults(), true);
      QApplication::processEvents();
    }
    bench.Settle();
    std::printf("resident after 20 OKs: %.0f MB\n", ResidentMegabytes());
  }
  return 0;
}

}  // namespace
}  // namespace quillane

int main(int argc, char** argv) {
  setenv("QT_QPA_PLATFORM", "offscreen", 0);
  // The offscreen platform says for every window that it cannot raise it; the table is all
  // that matters here.
  qInstallMessageHandler([](QtMsgType type, const QMessageLogContext&, const QString& text) {
    if (type != QtDebugMsg && type != QtInfoMsg && !text.startsWith("This plugin does not support"))
      std::fprintf(stderr, "%s\n", qPrintable(text));
  });
  return quillane::Run(argc, argv);
}
