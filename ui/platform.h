// Everything the program asks of the desktop that a test cannot drive: message boxes, the file,
// folder and colour dialogs, and handing a folder to the file manager. The program runs on
// QtPlatformServices; the window tests run on a scripted implementation that records each call
// and answers from a queue. No window shows a message or a dialog except through this.
#pragma once

#include <QString>
#include <cstdint>
#include <optional>

class QPrinter;

namespace quillane {

// A file chosen in the open or save dialog, with the filter the user had selected (1-based, in
// the order the filter string lists them).
struct FileChoice {
  QString path;
  int filterIndex = 1;

  friend bool operator==(const FileChoice&, const FileChoice&) = default;
};

class PlatformServices {
 public:
  virtual ~PlatformServices() = default;

  // A plain message box with an OK button.
  virtual void ShowMessage(const QString& caption, const QString& text) = 0;

  // The application's standard error box: an unexpected failure (a decoder or file-system
  // error, a routine that gave up) that ended the current command. text is the error's own
  // message.
  virtual void ShowError(const QString& text) = 0;

  // The picture open and save dialogs. filter lists pairs of displayed name and mask separated
  // by "|": "*.jpg|*.jpg|All files|*.*". std::nullopt when the user cancels. The save dialog
  // opens in startFolder, or with none in the folder it was last used in.
  virtual std::optional<FileChoice> OpenPictureDialog(const QString& filter) = 0;
  virtual std::optional<FileChoice> SavePictureDialog(const QString& filter,
                                                      const QString& startFolder) = 0;

  // The folder browser: folders only, with a title line, opened at startFolder. The chosen
  // folder's full path, or std::nullopt on cancel.
  virtual std::optional<QString> BrowseFolder(const QString& title, const QString& startFolder) = 0;

  // The colour dialog, colours as 0x00BBGGRR (red in the lowest byte).
  virtual std::optional<std::uint32_t> ChooseColor(std::uint32_t initial) = 0;

  // Shows folder in the desktop's file manager. False when no file manager could be started.
  virtual bool OpenFolder(const QString& folder) = 0;

  // The print dialog for printer: false when the user cancels; otherwise the chosen printer,
  // page and resolution are set in printer.
  virtual bool PrintDialog(QPrinter& printer) = 0;

  // Opens a local file with the desktop's default program for its type; false when no program
  // could be started.
  virtual bool OpenWithDefaultProgram(const QString& path) = 0;
};

}  // namespace quillane
