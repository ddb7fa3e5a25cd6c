// What a tool window may ask of the main window: the document and its actions, the status
// line, the active tool number, the line-art flag, the shared batch folders and the batch loop.
// Tool windows see the main window only through this, so they can be built and tested apart
// from its menus, toolbar and view.
#pragma once

#include <QIcon>
#include <QString>
#include <functional>

#include "document/document.h"
#include "effects/registry.h"

namespace quillane {

class PictureView;
class PlatformServices;
struct BatchResult;

class ToolHost {
 public:
  virtual ~ToolHost() = default;

  virtual PlatformServices& Platform() = 0;
  virtual const PictureDocument& Document() const = 0;

  // Runs effect with params on the document (RunEffect), shows the result, records a history
  // step if asked and sets the status line to the effect's status text. If the effect throws,
  // the standard error box shows its message and document, history and status line stay as
  // they were; the result is then false.
  virtual bool ApplyEffect(const EffectSpec& effect, const EffectParams& params,
                           bool recordHistory) = 0;
  // For a window that computed its result itself (a preview it kept): the working picture
  // becomes picture and is shown, with a history step if asked.
  virtual void SetWorkingPicture(Bitmap32 picture, bool recordHistory) = 0;

  virtual void SetStatusText(const QString& text) = 0;
  // The freehand windows keep the main window disabled while they are open.
  virtual void SetMainWindowEnabled(bool enabled) = 0;
  virtual void SetActiveTool(int number) = 0;
  virtual bool LineArt() const = 0;
  virtual void SetLineArt(bool on) = 0;

  // The shared batch folders and the batch panels' Browse buttons (which also list the input
  // folder's pictures).
  virtual QString InputFolder() const = 0;
  virtual QString OutputFolder() const = 0;
  virtual void ChooseInputFolder() = 0;
  virtual void ChooseOutputFolder() = 0;
  // The Convert button: effect with params over every listed file of the folder typed in
  // inputField into the one typed in outputField; afterEffect runs after each picture's
  // effect. Messages are shown here; the completion dialog is left to ShowBatchDone.
  virtual BatchResult ConvertBatchFolder(const EffectSpec& effect, const EffectParams& params,
                                         const QString& inputField, const QString& outputField,
                                         const std::function<void()>& afterEffect) = 0;
  virtual void ShowBatchDone() = 0;

  // The arrows the batch toggles show.
  virtual QIcon DownArrowIcon() const = 0;
  virtual QIcon UpArrowIcon() const = 0;
  // Fits a thumbnail control into a 105 by 105 area by its picture's proportions.
  virtual void DisplayImage(PictureView& control) const = 0;
};

}  // namespace quillane
