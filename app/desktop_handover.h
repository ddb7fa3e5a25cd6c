// Handing files to the running desktop through its own command-line programs, found on PATH,
// or its portal on the session bus: the wallpaper setting and the mail program. Each hand-over
// says whether the desktop took the file and, when it did not, why.
#pragma once

#include <QString>
#include <QStringList>
#include <functional>

class QObject;

namespace quillane {

struct HandOver {
  bool accepted = false;
  QString reason;  // why not, when not accepted
};

// Makes the bitmap file at path the desktop background. The desktop is given a fresh name for
// each use (a link to path, "wallpaper-<n>.bmp" beside it): the desktops leave the background
// alone when told the name they already show, even though the file has changed. Links of
// earlier uses are removed once the desktop has taken the new one.
HandOver SetDesktopWallpaper(const QString& path);

// Starts xdg-email with arguments: the desktop's mail program opens a new message. A failure
// that shows within a few seconds is returned; xdg-email often waits for the mail program
// until the message is sent, so one still running then is left to run, and a failure it
// reports later goes to lateFailure (called on the user-interface thread, owner alive).
HandOver StartMailProgram(const QStringList& arguments, QObject* owner,
                          std::function<void(const QString& reason)> lateFailure);

}  // namespace quillane
