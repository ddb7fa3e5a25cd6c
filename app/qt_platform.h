// The desktop services of the running program: Qt's message boxes and dialogs, and the XDG
// file manager through QDesktopServices.
#pragma once

#include <QStringList>

#include "ui/platform.h"

namespace quillane {

class QtPlatformServices : public PlatformServices {
 public:
  void ShowMessage(const QString& caption, const QString& text) override;
  void ShowError(const QString& text) override;
  std::optional<FileChoice> OpenPictureDialog(const QString& filter) override;
  std::optional<FileChoice> SavePictureDialog(const QString& filter,
                                              const QString& startFolder) override;
  std::optional<QString> BrowseFolder(const QString& title, const QString& startFolder) override;
  std::optional<std::uint32_t> ChooseColor(std::uint32_t initial) override;
  bool OpenFolder(const QString& folder) override;
  bool PrintDialog(QPrinter& printer) override;
  bool OpenWithDefaultProgram(const QString& path) override;
};

// "name|mask|name|mask" as QFileDialog name filters, one per pair. A name that repeats its mask
// is shown once ("*.jpg"); otherwise "name (mask)". "*.*" matches every file, as it does on the
// desktop the program was designed for, so it becomes "*"; several masks joined by ";" are
// joined by a blank. A trailing name without a mask is dropped.
QStringList NameFiltersFromPairs(const QString& filter);

}  // namespace quillane
