// A fresh folder per test and a way to run the built quillane-cli in it.
#pragma once

#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

namespace quillane {

inline std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

class CliRun : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string pattern = (std::filesystem::temp_directory_path() / "quillane-cli-XXXXXX").string();
    ASSERT_NE(mkdtemp(pattern.data()), nullptr);
    dir_ = pattern;
  }
  void TearDown() override { std::filesystem::remove_all(dir_); }

  std::string Path(const std::string& name) const { return dir_ + "/" + name; }
  // The path of name in the test's folder, quoted for the shell.
  std::string Q(const std::string& name) const {
    // Appended piece by piece: "'" + a temporary trips a false -Wrestrict in GCC 12.
    std::string quoted(1, '\'');
    quoted += Path(name);
    quoted += '\'';
    return quoted;
  }

  // Runs quillane-cli in the test's folder with arguments (already quoted as the shell needs);
  // its exit code, with out_ and err_ holding what it printed.
  int Run(const std::string& arguments, const std::string& shellPrefix = "") {
    const std::string command = shellPrefix + "cd '" + dir_ + "' && " + launcher_ + "'" +
                                QUILLANE_CLI_PATH + "' " + arguments + " >stdout.txt 2>stderr.txt";
    const int status = std::system(command.c_str());
    out_ = ReadText(Path("stdout.txt"));
    err_ = ReadText(Path("stderr.txt"));
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  std::string dir_;
  std::string launcher_;  // a command that runs the program ("setpriv ..."), or nothing
  std::string out_;
  std::string err_;
};

}  // namespace quillane
