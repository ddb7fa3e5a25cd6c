// The program's icon (data/desktop/icons), built into the program so that the windows show it
// whether or not the icon theme has it installed.
#pragma once

#include <QIcon>

namespace quillane {

QIcon ApplicationIcon();

}  // namespace quillane
