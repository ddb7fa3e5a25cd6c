#include "app/export_rules.h"

#include <QDir>
#include <QFileInfo>
#include <QStringList>

namespace quillane {

QRect PrintRectangle(int width, int height, int pageWidth, int pageHeight) {
  int w = width, h = height;
  // Both stay below the page size, so doubling never overflows.
  while (w >= 1 && h >= 1 && h < pageHeight / 2 && w < pageWidth / 2) {
    w *= 2;
    h *= 2;
  }
  return QRect((pageWidth - w) / 2, (pageHeight - h) / 2, w, h);
}

QString MailBody(const QString& downloadPage) {
  return QStringLiteral("Hello!\r\n\r\n") + "Attachment is my great work. It is made by Ardelon." +
         "\r\n" + "This is a good software. The download link is folows:" + "\r\n" + downloadPage +
         "\r\n" + "\r\n" + "Please try it. It would give you happiness!" + "\r\n" + "Good luck!";
}

Desktop DesktopFromXdg(const QString& currentDesktop) {
  for (const QString& name : currentDesktop.split(':', Qt::SkipEmptyParts)) {
    const QString upper = name.trimmed().toUpper();
    // Unity and the GNOME flavours keep the wallpaper in GNOME's own settings.
    if (upper == "GNOME" || upper == "GNOME-CLASSIC" || upper == "GNOME-FLASHBACK" ||
        upper == "UNITY")
      return Desktop::kGnome;
    if (upper == "KDE") return Desktop::kKde;
    if (upper == "XFCE") return Desktop::kXfce;
  }
  return Desktop::kOther;
}

QString GVariantString(const QString& text) {
  QString escaped = text;
  escaped.replace('\\', "\\\\");
  escaped.replace('\'', "\\'");
  return '\'' + escaped + '\'';
}

QString DocumentationFile(const QString& exeDir, const QString& sourceDir) {
  const QStringList candidates = {
      QDir(exeDir).filePath("../share/doc/quillane/README.md"),
      sourceDir.isEmpty() ? QString() : QDir(sourceDir).filePath("README.md")};
  for (const QString& candidate : candidates) {
    if (!candidate.isEmpty() && QFileInfo(candidate).isFile())
      return QDir::cleanPath(QFileInfo(candidate).absoluteFilePath());
  }
  return QString();
}

}  // namespace quillane
