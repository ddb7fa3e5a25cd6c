// File names cross between Qt and the codecs in the file system's own encoding.
#pragma once

#include <QFile>
#include <QString>
#include <string>

namespace quillane {

inline std::string LocalPath(const QString& path) {
  return QFile::encodeName(path).toStdString();
}
inline QString FromLocalPath(const std::string& path) {
  return QFile::decodeName(QByteArray::fromStdString(path));
}

}  // namespace quillane
