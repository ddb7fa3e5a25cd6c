#include "app/app_icon.h"

namespace quillane {

QIcon ApplicationIcon() {
  QIcon icon;
  for (int size : {16, 32, 48, 64, 128, 256})
    icon.addFile(QStringLiteral(":/icons/quillane-%1.png").arg(size), QSize(size, size));
  return icon;
}

}  // namespace quillane
