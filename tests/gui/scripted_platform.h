// Platform services for the window tests: every call is recorded, and dialogs answer from
// queues the test fills beforehand (an empty queue answers "cancelled").
#pragma once

#include <QString>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "ui/platform.h"

namespace quillane {

class ScriptedPlatform : public PlatformServices {
 public:
  struct Message {
    QString caption;
    QString text;
    friend bool operator==(const Message&, const Message&) = default;
  };
  struct FolderRequest {
    QString title;
    QString startFolder;
    friend bool operator==(const FolderRequest&, const FolderRequest&) = default;
  };

  std::vector<Message> messages;
  std::vector<QString> errors;
  std::vector<QString> openFilters;
  std::vector<QString> saveFilters;
  std::vector<QString> saveStartFolders;
  std::vector<FolderRequest> folderRequests;
  std::vector<std::uint32_t> colorRequests;
  std::vector<QString> openedFolders;
  int printDialogs = 0;
  std::vector<QString> openedFiles;
  bool fileManagerStarts = true;  // what OpenFolder answers

  std::deque<std::optional<FileChoice>> openAnswers;
  std::deque<std::optional<FileChoice>> saveAnswers;
  std::deque<std::optional<QString>> folderAnswers;
  std::deque<std::optional<std::uint32_t>> colorAnswers;
  // Each sets up the printer as a user would in the dialog; an empty queue cancels.
  std::deque<std::function<void(QPrinter&)>> printAnswers;
  bool defaultProgramStarts = true;

  void ShowMessage(const QString& caption, const QString& text) override {
    messages.push_back({caption, text});
  }
  void ShowError(const QString& text) override { errors.push_back(text); }
  std::optional<FileChoice> OpenPictureDialog(const QString& filter) override {
    openFilters.push_back(filter);
    return Next(openAnswers);
  }
  std::optional<FileChoice> SavePictureDialog(const QString& filter,
                                              const QString& startFolder) override {
    saveFilters.push_back(filter);
    saveStartFolders.push_back(startFolder);
    return Next(saveAnswers);
  }
  std::optional<QString> BrowseFolder(const QString& title, const QString& startFolder) override {
    folderRequests.push_back({title, startFolder});
    return Next(folderAnswers);
  }
  std::optional<std::uint32_t> ChooseColor(std::uint32_t initial) override {
    colorRequests.push_back(initial);
    return Next(colorAnswers);
  }
  bool OpenFolder(const QString& folder) override {
    openedFolders.push_back(folder);
    return fileManagerStarts;
  }
  bool PrintDialog(QPrinter& printer) override {
    ++printDialogs;
    if (printAnswers.empty()) return false;
    const std::function<void(QPrinter&)> answer = std::move(printAnswers.front());
    printAnswers.pop_front();
    answer(printer);
    return true;
  }
  bool OpenWithDefaultProgram(const QString& path) override {
    openedFiles.push_back(path);
    return defaultProgramStarts;
  }

 private:
  template <typename T>
  static std::optional<T> Next(std::deque<std::optional<T>>& answers) {
    std::optional<T> answer;
    if (!answers.empty()) {
      answer.swap(answers.front());
      answers.pop_front();
    }
    return answer;
  }
};

}  // namespace quillane
