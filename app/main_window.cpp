#include "app/main_window.h"

#include <QAction>
#include <QCloseEvent>
#include <QLabel>
#include <QListWidget>
#include <QMenu>
#include <QMenuBar>
#include <QPainter>
#include <QScrollArea>
#include <QStatusBar>
#include <QToolButton>
#include <iterator>

#include "app/app_icon.h"
#include "data/startup_picture.h"
#include "ui/batch_done_dialog.h"
#include "ui/glyphs.h"
#include "ui/picture_view.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr int kInitialWidth = 540;
constexpr int kInitialHeight = 473;
constexpr int kBandGrip = 11;  // room left of each toolbar band for its grip
constexpr int kButtonSide = 25;
const QColor kStatusGray(128, 128, 128);
const QColor kScrollBoxBackground(96, 100, 106);

// The toolbar strip: bands (the panels inside it), each with a grip drawn to its left.
class ControlBar : public QFrame {
 public:
  using QFrame::QFrame;

 protected:
  void paintEvent(QPaintEvent* event) override {
    QFrame::paintEvent(event);
    QPainter p(this);
    const QColor light = palette().color(QPalette::Light);
    const QColor dark = palette().color(QPalette::Mid);
    for (const QObject* child : children()) {
      const auto* band = qobject_cast<const QFrame*>(child);
      if (band == nullptr || !band->isVisible()) continue;
      const int x = band->x() - kBandGrip + 3;
      for (int i = 0; i < 2; ++i) {
        p.setPen(light);
        p.drawLine(x + 3 * i, band->y() + 2, x + 3 * i, band->y() + band->height() - 3);
        p.setPen(dark);
        p.drawLine(x + 3 * i + 1, band->y() + 2, x + 3 * i + 1, band->y() + band->height() - 3);
      }
    }
  }
};

QFrame* Band(QWidget* parent, const char* name, int x, int width) {
  auto* band = new QFrame(parent);
  band->setObjectName(name);
  band->setGeometry(x, 2, width, 26);
  return band;
}

}  // namespace

MainWindow::MainWindow(PlatformServices& platform) : MainWindow(platform, StartupPicture()) {}

MainWindow::MainWindow(PlatformServices& platform, Bitmap32 picture)
    : platform_(platform), document_(std::move(picture)), toolWindows_(Effects().size() + 1) {
  setObjectName("TMyPicture");
  setWindowTitle("Quillane v" QUILLANE_VERSION);
  setWindowIcon(ApplicationIcon());

  auto* central = new QWidget(this);
  central->setObjectName("centralWidget");
  setCentralWidget(central);
  BuildMenus();
  BuildToolbar(central);
  BuildView(central);
  AddDesktopActions();

  statusLine_ = new QLabel("New picture", central);
  statusLine_->setObjectName("Label1");
  QPalette gray = statusLine_->palette();
  gray.setColor(QPalette::WindowText, kStatusGray);
  statusLine_->setPalette(gray);

  // A plain strip at the bottom edge with the size grip; it never shows a message.
  statusBar()->setObjectName("StatusBar1");

  // The arrow glyphs the tool windows copy onto their batch toggles.
  auto* panel1 = new QWidget(central);
  panel1->setObjectName("Panel1");
  downArrow_ = new QToolButton(panel1);
  downArrow_->setObjectName("dd");
  downArrow_->setIcon(GlyphIcon(Glyph::ArrowDown));
  upArrow_ = new QToolButton(panel1);
  upArrow_->setObjectName("uu");
  upArrow_->setIcon(GlyphIcon(Glyph::ArrowUp));
  panel1->hide();

  // The batch file list: filled by the input-folder Browse, read by Convert, never shown.
  batchFileList_ = new QListWidget(central);
  batchFileList_->setObjectName("ListView1");
  batchFileList_->hide();

  batchDone_ = new BatchDoneDialog(
      platform_, [this] { return outputFolder_; }, this);
  batchDone_->hide();
  ConnectExportCommands();
  BuildViewControls();

  ShowWorking(zoomPercent_);
  UpdateHistoryControls();
  move(4, 3);
  resize(kInitialWidth, kInitialHeight);
}

MainWindow::~MainWindow() {
  RememberPendingRecent();
}

// --- Construction ----------------------------------------------------------------------------

void MainWindow::BuildMenus() {
  QMenuBar* bar = menuBar();
  bar->setObjectName("MainMenu1");
  auto addMenu = [&](const QString& caption, const char* name) {
    QMenu* menu = bar->addMenu(caption);
    menu->setObjectName(name);
    return menu;
  };
  auto addEntry = [](QMenu* menu, const QString& caption, const char* name) {
    QAction* action = menu->addAction(caption);
    action->setObjectName(name);
    return action;
  };

  QMenu* file = addMenu(" File", "File1");
  connect(addEntry(file, "Open", "Open1"), &QAction::triggered, this, &MainWindow::OnOpen);
  connect(addEntry(file, "Save", "Save1"), &QAction::triggered, this, &MainWindow::OnSave);
  connect(addEntry(file, "Exit", "Exit1"), &QAction::triggered, this, &MainWindow::OnExit);

  QMenu* edit = addMenu(" Edit", "Edit1");
  undoAction_ = addEntry(edit, "Undo", "Undo1");
  connect(undoAction_, &QAction::triggered, this, &MainWindow::OnUndo);
  redoAction_ = addEntry(edit, "Redo", "Redo1");
  connect(redoAction_, &QAction::triggered, this, &MainWindow::OnRedo);
  addEntry(edit, "Image size", "Imagesize1");

  for (EffectMenu effectMenu : kEffectMenus) {
    QMenu* menu = addMenu(MenuCaption(effectMenu), MenuObjectName(effectMenu));
    for (const EffectSpec* spec : MenuEffects(effectMenu)) {
      QAction* entry =
          addEntry(menu, QString::fromStdString(spec->menuEntry), spec->menuObjectName.c_str());
      const int number = spec->toolNumber;
      connect(entry, &QAction::triggered, this, [this, number] { OpenTool(number); });
    }
  }

  QMenu* help = addMenu(" Help", "Help1");
  addEntry(help, "Online", "Online1");
  addEntry(help, "About", "About1");

  popupMenu_ = new QMenu(this);
  popupMenu_->setObjectName("PopupMenu1");
  connect(addEntry(popupMenu_, "Open a new picture", "Openanewpicture1"), &QAction::triggered, this,
          &MainWindow::OnOpen);
  addEntry(popupMenu_, "Image size", "Imagesize2");
  connect(addEntry(popupMenu_, "Save as", "Saveas1"), &QAction::triggered, this,
          &MainWindow::OnSave);
}

QToolButton* MainWindow::AddSpeedButton(QWidget* panel, const char* name, const QString& hint,
                                        int x) {
  auto* button = new QToolButton(panel);
  button->setObjectName(name);
  button->setToolTip(hint);
  button->setAutoRaise(true);
  button->setIconSize(QSize(20, 20));
  button->setGeometry(x, 0, kButtonSide, kButtonSide + 1);
  return button;
}

void MainWindow::BuildToolbar(QWidget* central) {
  controlBar_ = new ControlBar(central);
  controlBar_->setObjectName("ControlBar1");
  controlBar_->setFrameShape(QFrame::StyledPanel);
  controlBar_->setFrameShadow(QFrame::Raised);

  struct ButtonSpec {
    const char* name;
    const char* hint;
    Glyph glyph;
  };
  static const ButtonSpec kCommandButtons[] = {
      {"SpeedButton1", "Open a picture as foreground", Glyph::Open},
      {"SpeedButton2", "Save", Glyph::Save},
      {"SpeedButton7", "Renew", Glyph::Renew},
      {"SpeedButton3", "Undo", Glyph::Undo},
      {"SpeedButton18", "Redo", Glyph::Redo},
      {"SpeedButton4", "Image size", Glyph::ImageSize},
      {"SpeedButton5", "Zoom out the view", Glyph::ZoomOut},
      {"SpeedButton6", "Zoom in the view", Glyph::ZoomIn},
  };
  static const ButtonSpec kViewButtons[] = {
      {"SpeedButton12", "Rotate Clockwise", Glyph::RotateClockwise},
      {"SpeedButton8", "Rotate anticlockwise", Glyph::RotateAnticlockwise},
      {"SpeedButton9", "Set as wallpaper", Glyph::Wallpaper},
      {"SpeedButton10", "Print", Glyph::Print},
      {"SpeedButton11", "Mail to friend", Glyph::Mail},
  };

  const int commandBandWidth = static_cast<int>(std::size(kCommandButtons)) * kButtonSide + 2;
  commandBand_ = Band(controlBar_, "Panel4", kBandGrip, commandBandWidth);
  int x = 1;
  for (const ButtonSpec& b : kCommandButtons) {
    AddSpeedButton(commandBand_, b.name, b.hint, x)->setIcon(GlyphIcon(b.glyph));
    x += kButtonSide;
  }

  viewBand_ = Band(controlBar_, "Panel8", kBandGrip + commandBandWidth + kBandGrip, 200);
  zoomLabel_ = new QLabel("100%", viewBand_);
  zoomLabel_->setObjectName("Label5");
  zoomLabel_->setAlignment(Qt::AlignCenter);
  zoomLabel_->setGeometry(1, 0, 56, kButtonSide + 1);
  x = 1 + 56 + 4;
  for (const ButtonSpec& b : kViewButtons) {
    AddSpeedButton(viewBand_, b.name, b.hint, x)->setIcon(GlyphIcon(b.glyph));
    x += kButtonSide;
  }

  auto* open = commandBand_->findChild<QToolButton*>("SpeedButton1");
  connect(open, &QToolButton::clicked, this, &MainWindow::OnOpen);
  auto* save = commandBand_->findChild<QToolButton*>("SpeedButton2");
  connect(save, &QToolButton::clicked, this, &MainWindow::OnSave);
  auto* renew = commandBand_->findChild<QToolButton*>("SpeedButton7");
  connect(renew, &QToolButton::clicked, this, &MainWindow::OnRenew);
  undoButton_ = commandBand_->findChild<QToolButton*>("SpeedButton3");
  connect(undoButton_, &QToolButton::clicked, this, &MainWindow::OnUndo);
  redoButton_ = commandBand_->findChild<QToolButton*>("SpeedButton18");
  connect(redoButton_, &QToolButton::clicked, this, &MainWindow::OnRedo);
}

void MainWindow::BuildView(QWidget* central) {
  scrollBox_ = new QScrollArea(central);
  scrollBox_->setObjectName("ScrollBox1");
  scrollBox_->setWidgetResizable(false);
  scrollBox_->setAlignment(Qt::AlignLeft | Qt::AlignTop);
  QPalette background = scrollBox_->palette();
  background.setColor(QPalette::Window, kScrollBoxBackground);
  scrollBox_->setPalette(background);
  scrollBox_->setBackgroundRole(QPalette::Window);
  scrollBox_->viewport()->setAutoFillBackground(true);

  pictureView_ = new PictureView;
  pictureView_->setObjectName("Image1");
  pictureView_->setToolTip("scroll the mouse-wheel to zoom out or zoom in");
  // The context menu opens on the release of a right click that did not pan the view.
  pictureView_->setContextMenuPolicy(Qt::PreventContextMenu);
  scrollBox_->setWidget(pictureView_);
  // Queued, so that it runs once the painted picture has gone to the screen.
  connect(
      pictureView_, &PictureView::painted, this,
      [this] {
        PictureDocument::ResumeBackgroundWork();
        RememberPendingRecent();
      },
      Qt::QueuedConnection);
}

// --- Layout and lifecycle --------------------------------------------------------------------

void MainWindow::resizeEvent(QResizeEvent* event) {
  QMainWindow::resizeEvent(event);
  const int w = width();
  const int h = height();
  controlBar_->setGeometry(0, 0, w - 10, 30);
  viewBand_->resize(controlBar_->width() - commandBand_->width() - 32, viewBand_->height());
  scrollBox_->setGeometry(2, 32, w - 13, h - 120);
  statusLine_->move(5, scrollBox_->height() + 34);
  statusLine_->adjustSize();
}

void MainWindow::closeEvent(QCloseEvent* event) {
  RememberPendingRecent();
  QMainWindow::closeEvent(event);
  if (event->isAccepted()) emit closed();
}

void MainWindow::OnExit() {
  close();
}

}  // namespace quillane
