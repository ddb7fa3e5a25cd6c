// The main window: the picture document with its history, the view of the working picture,
// the menus and toolbar, and the shared state the tool windows work on (active tool number,
// batch folders, line-art flag), which they reach through ToolHost. Its code is split by what
// it does: main_window.cpp builds the window; main_window_history.cpp, _files, _view and _tools
// hold the document actions, opening and saving, the view, and the tool windows with batch.
#pragma once

#include <QMainWindow>
#include <QPoint>
#include <QRect>
#include <QString>
#include <QStringList>
#include <functional>
#include <vector>

#include "batch/batch_convert.h"
#include "document/document.h"
#include "effects/registry.h"
#include "imaging/rotate.h"
#include "ui/tool_host.h"

class QAction;
class QDragEnterEvent;
class QDropEvent;
class QLabel;
class QMenu;
class QScrollArea;
class QToolButton;
class QFrame;
class QListWidget;
class QMouseEvent;
class QWheelEvent;

namespace quillane {

class PictureView;
class PlatformServices;
class AboutBox;
class BatchDoneDialog;
class ImageSizeDialog;
class ToolWindow;

class MainWindow : public QMainWindow, public ToolHost {
  Q_OBJECT

 public:
  // Starts on the program's built-in picture.
  explicit MainWindow(PlatformServices& platform);
  // Starts on picture instead (its alpha set to 255).
  MainWindow(PlatformServices& platform, Bitmap32 picture);
  ~MainWindow() override;

  PlatformServices& Platform() override { return platform_; }
  const PictureDocument& Document() const override { return document_; }

  // --- Document -----------------------------------------------------------------------------

  // Makes picture the working, source and opened picture, shows it at the current zoom from
  // the top-left corner, and (for a file the user opened) resets the history. The status line
  // is left as it is.
  void ShowNewPicture(Bitmap32 picture, bool resetHistory);

  bool ApplyEffect(const EffectSpec& effect, const EffectParams& params,
                   bool recordHistory) override;
  // True while ApplyEffect waits for its routine; a second apply meanwhile is ignored.
  bool EffectRunning() const { return effectRunning_; }
  void SetWorkingPicture(Bitmap32 picture, bool recordHistory) override;

  // Opens the picture file at path as File > Open does once a file is chosen (a file that
  // cannot be read is reported and changes nothing), and puts it first in the recent list.
  bool OpenPictureFile(const QString& path);
  // The pictures opened last, most recent first (at most ten), as File > Open Recent lists them.
  QStringList RecentFiles() const;

  // The history step after a tool has written the working picture.
  void RecordHistoryStep();

  // --- Status line and zoom -----------------------------------------------------------------

  QString StatusText() const;
  void SetStatusText(const QString& text) override;
  void SetMainWindowEnabled(bool enabled) override { setEnabled(enabled); }
  double ZoomPercent() const { return zoomPercent_; }
  // The number the zoom label shows (its caption without the "%").
  double ZoomFromLabel() const;
  // Size of Image1 for the working picture at zoom: Round(w * zoom / 100) by Round(h * ...),
  // each side kept within 1 and QWIDGETSIZE_MAX.
  void SetDisplaySize(double zoom);
  // One zoom step (times 1.25 or 0.8): the label and the display size follow. A step is not
  // taken when it would make a side of the display larger than QWIDGETSIZE_MAX (zooming in) or
  // smaller than one pixel (zooming out).
  void ZoomIn();
  void ZoomOut();
  // Back to 100 %.
  void ZoomToActualSize();
  // The zoom label's text for zoom: one decimal in the user's locale, then "%".
  static QString ZoomLabelText(double zoom);
  // The image size dialog, created hidden with the main window.
  ImageSizeDialog& ImageSize() { return *imageSize_; }

  // --- Tool windows -------------------------------------------------------------------------

  void RegisterToolWindow(ToolWindow* window);
  ToolWindow* ToolWindowAt(int number) const;
  int ActiveTool() const { return activeTool_; }
  void SetActiveTool(int number) override { activeTool_ = number; }
  // Closes the open tool window, if any.
  void CloseToolWindow();
  // What a menu entry does: close the open tool window, place this one beside the main window
  // and show it.
  void OpenTool(int number);
  // The arrows the batch toggles show, taken from the hidden buttons dd and uu.
  QIcon DownArrowIcon() const override;
  QIcon UpArrowIcon() const override;

  void DisplayImage(PictureView& control) const override;
  static QRect DisplayImageGeometry(int pictureWidth, int pictureHeight);

  // --- Shared tool-window settings ------------------------------------------------------------

  QString InputFolder() const override { return inputFolder_; }
  QString OutputFolder() const override { return outputFolder_; }
  void SetInputFolder(const QString& folder) { inputFolder_ = folder; }
  void SetOutputFolder(const QString& folder) { outputFolder_ = folder; }
  // The batch panels' Browse buttons: choose the input or output folder. Choosing the input
  // folder also lists its pictures in the batch file list.
  void ChooseInputFolder() override;
  void ChooseOutputFolder() override;
  // The batch file list (the hidden ListView1): bare file names as shown (ShownName), as the
  // last input-folder Browse found them.
  QStringList BatchFiles() const;

  // Both typed folders become the shared folders. Each loaded picture is shown and the progress
  // is written in the status bar while the loop runs; "Sorry" messages, the list of skipped
  // files and the error that stopped the loop are shown here.
  BatchResult ConvertBatchFolder(const EffectSpec& effect, const EffectParams& params,
                                 const QString& inputField, const QString& outputField,
                                 const std::function<void()>& afterEffect) override;
  // The dialog a finished batch conversion shows; created hidden with the main window.
  BatchDoneDialog& BatchDone() { return *batchDone_; }
  void ShowBatchDone() override;

  bool LineArt() const override { return lineArt_; }
  void SetLineArt(bool on) override { lineArt_ = on; }

 public slots:
  // The toolbar buttons and menu entries, one slot each.
  void OnOpen();
  void OnSave();
  void OnUndo();
  void OnRedo();
  void OnRenew();
  void OnSetWallpaper();
  void OnPrint();
  void OnMail();
  void OnOnlineHelp();  // the program's documentation
  void OnAbout();
  void OnExit();
  void OnZoomOut();
  void OnZoomIn();
  void OnRotateClockwise();
  void OnRotateAnticlockwise();
  void OnImageSize();  // shows the image size dialog

 signals:
  // The main window has closed: the program ends.
  void closed();

 protected:
  void resizeEvent(QResizeEvent* event) override;
  void closeEvent(QCloseEvent* event) override;
  // Installed on the application: the mouse wheel over the picture, and the mouse on Image1.
  bool eventFilter(QObject* watched, QEvent* event) override;
  // A single picture file dropped on the window is opened.
  void dragEnterEvent(QDragEnterEvent* event) override;
  void dropEvent(QDropEvent* event) override;

 private:
  // The standard shortcuts, Alt-letter menu access, Open Recent and drag and drop.
  void AddDesktopActions();
  void FillRecentMenu();
  void RememberRecent(const QString& path);
  // A file just opened is stored on the recent list once its picture is on screen: writing
  // the settings takes longer than painting. The menu and RecentFiles show it at once.
  void RememberPendingRecent();
  // A recent-list entry: opened, or taken off the list with a message when it is gone.
  void OpenRecentFile(const QString& path);

  void BuildMenus();
  void BuildToolbar(QWidget* central);
  void BuildView(QWidget* central);
  QToolButton* AddSpeedButton(QWidget* panel, const char* name, const QString& hint, int x);
  // Image1 shows the working picture again, at the display size of zoom.
  void ShowWorking(double zoom);
  // Shows a picture the document has just loaded from the top-left corner, at the current zoom.
  void ShowLoadedPicture(bool resetHistory);
  // The view after the working picture changed in place: shown again, history buttons updated.
  void ShowWorkingChanged();
  void UpdateHistoryControls();
  // Background work (history packing, unpacking ahead) waits until the picture control has
  // painted what the action about to run makes, so the user sees it first.
  void HoldBackgroundUntilShown();
  // Print, wallpaper, mail and Help: connected, and the About box created hidden.
  void ConnectExportCommands();
  // The zoom buttons, rotation, panning, the wheel, the View menu and the image size dialog.
  void BuildViewControls();
  void SetZoom(double zoom);
  bool WheelZoom(QObject* watched, QWheelEvent* event);
  void PictureMouseDown(QMouseEvent* event);
  void PictureMouseMove(QMouseEvent* event);
  void PictureMouseUp(QMouseEvent* event);
  void Rotate(QuarterTurn turn);
  // Runs work on a thread of its own while this thread keeps the windows painted, with a busy
  // cursor; input to the windows is ignored until it ends. The status bar stays empty: the
  // status line above it already says what was done last.
  void RunWhileWindowsWait(const std::function<void()>& work);

  PlatformServices& platform_;
  PictureDocument document_;
  double zoomPercent_ = 100.0;
  int activeTool_ = 0;
  QString inputFolder_;
  QString outputFolder_;
  // Where Save starts: the folder of the picture opened, until the first save of the run.
  QString saveStartFolder_;
  bool savedOnce_ = false;
  bool lineArt_ = false;
  bool effectRunning_ = false;
  std::vector<ToolWindow*> toolWindows_;  // owned as child widgets

  QFrame* controlBar_ = nullptr;
  QFrame* commandBand_ = nullptr;
  QFrame* viewBand_ = nullptr;
  QLabel* zoomLabel_ = nullptr;
  QScrollArea* scrollBox_ = nullptr;
  PictureView* pictureView_ = nullptr;
  QLabel* statusLine_ = nullptr;
  QMenu* popupMenu_ = nullptr;
  QToolButton* undoButton_ = nullptr;
  QToolButton* redoButton_ = nullptr;
  QAction* undoAction_ = nullptr;
  QAction* redoAction_ = nullptr;
  QToolButton* downArrow_ = nullptr;
  QToolButton* upArrow_ = nullptr;
  QListWidget* batchFileList_ = nullptr;
  // Entries of the browsed input folder named like pictures that are no files (folders, FIFOs,
  // links to nothing): told as skipped after each batch.
  std::vector<BatchSkipped> batchNotFiles_;
  BatchDoneDialog* batchDone_ = nullptr;
  AboutBox* aboutBox_ = nullptr;
  ImageSizeDialog* imageSize_ = nullptr;

  // Panning with the right mouse button, from a press on Image1 to its release.
  struct Panning {
    bool dragging = false;
    bool unmoved = true;
    QPoint press;  // in Image1's coordinates
    int horizontal = 0;
    int vertical = 0;
  } panning_;
  int ctrlWheelRest_ = 0;  // Ctrl+wheel turn not yet a whole notch
  QMenu* recentMenu_ = nullptr;
  QString pendingRecent_;  // opened, not yet on the stored recent list
};

}  // namespace quillane
