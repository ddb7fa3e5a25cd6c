// The few things the program remembers between runs (recent pictures, the folders of the open
// and save dialogs), in ~/.config/quillane/quillane.ini. Tests point QSettings::setPath for
// the IniFormat user scope at a folder of their own.
#pragma once

#include <QSettings>

namespace quillane {

inline QSettings ProgramSettings() {
  return QSettings(QSettings::IniFormat, QSettings::UserScope, "quillane", "quillane");
}

}  // namespace quillane
