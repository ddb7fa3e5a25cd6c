// A fresh folder on disk for each window test that reads or writes picture files.
#pragma once

#include <gtest/gtest.h>

#include <QString>
#include <QTemporaryDir>
#include <algorithm>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "tests/gui/gui_fixture.h"

namespace quillane {

class FileGuiTest : public GuiTest {
 protected:
  void SetUp() override {
    GuiTest::SetUp();
    ASSERT_TRUE(folder_.isValid());
  }

  // The full path of name in the test's folder, as a dialog would return it.
  QString Path(const QString& name) const { return folder_.filePath(name); }
  std::string LocalPath(const QString& name) const { return Path(name).toStdString(); }
  bool Exists(const QString& name) const { return std::filesystem::exists(LocalPath(name)); }

  // The names directly in a folder of the test's folder ("" for the folder itself), sorted.
  std::vector<std::string> Entries(const QString& sub = QString()) const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(LocalPath(sub)))
      names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
  }

  static std::vector<std::uint8_t> ReadBytes(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
  }
  static void WriteBytes(const std::string& path, const std::string& bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
  }

  QTemporaryDir folder_;
};

}  // namespace quillane
