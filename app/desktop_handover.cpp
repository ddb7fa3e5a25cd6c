#include "app/desktop_handover.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusObjectPath>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDateTime>
#include <QDir>
#include <QEventLoop>
#include <QFileInfo>
#include <QProcess>
#include <QStandardPaths>
#include <QTimer>
#include <QUrl>
#include <filesystem>
#include <optional>
#include <system_error>

#include "app/export_rules.h"
#include "app/local_path.h"

namespace quillane {
namespace {

// The settings programs answer at once; one that has not after this long is stuck.
constexpr int kDesktopAnswerMs = 20000;
// xdg-email fails within this when no mail program is set up; one that runs longer has started
// the mail program and waits for it.
constexpr int kMailQuickAnswerMs = 3000;

constexpr char kGnomeBackground[] = "org.gnome.desktop.background";

QString FirstLine(const QByteArray& bytes) {
  return QString::fromLocal8Bit(bytes).trimmed().section('\n', 0, 0).trimmed();
}

QString StartFailure(const QString& program, const QProcess& process) {
  if (QStandardPaths::findExecutable(program).isEmpty()) return program + " was not found";
  return program + " could not be started (" + process.errorString() + ")";
}

QString ExitFailure(const QString& program, QProcess& process) {
  if (process.exitStatus() == QProcess::CrashExit) return program + " stopped unexpectedly";
  QString reason = program + " ended with code " + QString::number(process.exitCode());
  const QString detail = FirstLine(process.readAllStandardError());
  if (!detail.isEmpty()) reason += " (" + detail + ")";
  return reason;
}

bool Succeeded(const QProcess& process) {
  return process.exitStatus() == QProcess::NormalExit && process.exitCode() == 0;
}

struct Run {
  bool ok = false;
  QByteArray output;
  QString reason;
};

Run RunProgram(const QString& program, const QStringList& arguments) {
  QProcess process;
  process.setStandardInputFile(QProcess::nullDevice());
  process.start(program, arguments);
  if (!process.waitForStarted()) return {false, {}, StartFailure(program, process)};
  if (!process.waitForFinished(kDesktopAnswerMs)) {
    process.kill();
    process.waitForFinished();
    return {false, {}, program + " did not answer"};
  }
  if (!Succeeded(process)) return {false, {}, ExitFailure(program, process)};
  return {true, process.readAllStandardOutput(), {}};
}

QString FileUri(const QString& path) {
  return QString::fromLatin1(QUrl::fromLocalFile(path).toEncoded());
}

HandOver SetGnomeWallpaper(const QString& file) {
  const QString uri = GVariantString(FileUri(file));
  const Run light = RunProgram("gsettings", {"set", kGnomeBackground, "picture-uri", uri});
  if (!light.ok) return {false, light.reason};
  // The dark style's own picture came with GNOME 42; before it the key above is all there is.
  const Run dark = RunProgram("gsettings", {"set", kGnomeBackground, "picture-uri-dark", uri});
  if (!dark.ok && !dark.reason.contains("No such key")) return {false, dark.reason};
  return {true, {}};
}

HandOver SetKdeWallpaper(const QString& file) {
  const Run run = RunProgram("plasma-apply-wallpaperimage", {file});
  return {run.ok, run.reason};
}

// XFCE keeps one picture per monitor and workspace; all of them get the new one.
HandOver SetXfceWallpaper(const QString& file) {
  const Run list = RunProgram("xfconf-query", {"-c", "xfce4-desktop", "-l"});
  if (!list.ok) return {false, list.reason};
  QStringList properties;
  for (const QByteArray& line : list.output.split('\n')) {
    const QString property = QString::fromLocal8Bit(line).trimmed();
    if (property.endsWith("/last-image")) properties << property;
  }
  if (properties.isEmpty()) return {false, "the XFCE desktop lists no background picture to set"};
  for (const QString& property : properties) {
    const Run set = RunProgram("xfconf-query", {"-c", "xfce4-desktop", "-p", property, "-s", file});
    if (!set.ok) return {false, set.reason};
  }
  return {true, {}};
}

constexpr char kPortalService[] = "org.freedesktop.portal.Desktop";
constexpr char kPortalPath[] = "/org/freedesktop/portal/desktop";
// The portal may ask the user before it sets the picture.
constexpr int kPortalResponseMs = 120000;

// The Response the portal sends when one request is settled.
class PortalRequest : public QObject {
  Q_OBJECT

 public:
  std::optional<uint> response;
  QEventLoop loop;

 public slots:
  void Response(uint code, const QVariantMap&) {
    if (!response) response = code;
    loop.quit();
  }
};

// The portal's call only says the request was made; whether the picture was set comes later,
// in the request's Response signal (0 done, 1 cancelled by the user, 2 refused). That is
// awaited, with the user's input held back meanwhile, before anything is said to the user.
HandOver SetPortalWallpaper(const QString& file) {
  const QString refused = "the desktop portal did not take it: ";
  // A connection of its own, closed afterwards, so it follows the session bus the environment
  // names at the time.
  const QString name = "quillane-wallpaper";
  struct Closer {
    QString name;
    ~Closer() { QDBusConnection::disconnectFromBus(name); }
  } closer{name};
  QDBusConnection bus = QDBusConnection::connectToBus(QDBusConnection::SessionBus, name);
  if (!bus.isConnected())
    return {false, refused + "there is no session bus (" + bus.lastError().message() + ")"};

  // Listened for before the call, at the path the token gives, so the answer cannot come first.
  static int requests = 0;
  const QString token = "quillane" + QString::number(++requests);
  const QString sender = bus.baseService().mid(1).replace('.', '_');
  const QString expected = QString(kPortalPath) + "/request/" + sender + "/" + token;
  PortalRequest request;
  const auto listen = [&](const QString& path) {
    bus.connect(kPortalService, path, "org.freedesktop.portal.Request", "Response", &request,
                SLOT(Response(uint, QVariantMap)));
  };
  listen(expected);

  QDBusMessage call = QDBusMessage::createMethodCall(
      kPortalService, kPortalPath, "org.freedesktop.portal.Wallpaper", "SetWallpaperURI");
  call << QString() << FileUri(file)
       << QVariantMap{
              {"show-preview", false}, {"set-on", QString("background")}, {"handle_token", token}};
  QDBusPendingCallWatcher watcher(bus.asyncCall(call, kDesktopAnswerMs));
  QObject::connect(&watcher, &QDBusPendingCallWatcher::finished, &request.loop, &QEventLoop::quit);
  while (!watcher.isFinished()) request.loop.exec(QEventLoop::ExcludeUserInputEvents);
  const QDBusPendingReply<QDBusObjectPath> reply = watcher;
  if (reply.isError()) return {false, refused + reply.error().message()};
  // Portals older than the token choose the path themselves.
  if (reply.value().path() != expected) listen(reply.value().path());
  if (!request.response) {
    QTimer::singleShot(kPortalResponseMs, &request.loop, &QEventLoop::quit);
    request.loop.exec(QEventLoop::ExcludeUserInputEvents);
  }
  if (!request.response) return {false, refused + "it did not answer"};
  if (*request.response == 0) return {true, {}};
  if (*request.response == 1) return {false, refused + "it was cancelled"};
  return {false, refused + "it refused the picture"};
}

// A new name for the same bytes: a hard link costs no space; a copy where links are not had.
// The file itself when neither can be made.
QString FreshName(const QString& path) {
  const QFileInfo info(path);
  qint64 stamp = QDateTime::currentMSecsSinceEpoch();
  QString name;
  do {
    name = info.dir().filePath(info.completeBaseName() + '-' + QString::number(stamp++) + '.' +
                               info.suffix());
  } while (QFileInfo::exists(name));
  std::error_code error;
  std::filesystem::create_hard_link(LocalPath(path), LocalPath(name), error);
  if (!error) return name;
  error.clear();
  if (std::filesystem::copy_file(LocalPath(path), LocalPath(name), error) && !error) return name;
  return path;
}

void RemoveOtherNames(const QString& path, const QString& keep) {
  const QFileInfo info(path);
  QDir dir = info.dir();
  const QStringList others =
      dir.entryList({info.completeBaseName() + "-*." + info.suffix()}, QDir::Files);
  for (const QString& other : others)
    if (dir.filePath(other) != keep) dir.remove(other);
}

}  // namespace

HandOver SetDesktopWallpaper(const QString& path) {
  const QString given = FreshName(path);
  HandOver result;
  switch (DesktopFromXdg(qEnvironmentVariable("XDG_CURRENT_DESKTOP"))) {
    case Desktop::kGnome:
      result = SetGnomeWallpaper(given);
      break;
    case Desktop::kKde:
      result = SetKdeWallpaper(given);
      break;
    case Desktop::kXfce:
      result = SetXfceWallpaper(given);
      break;
    case Desktop::kOther:
      result = SetPortalWallpaper(given);
      break;
  }
  if (given != path) {
    if (result.accepted)
      RemoveOtherNames(path, given);
    else
      QFile::remove(given);
  }
  return result;
}

HandOver StartMailProgram(const QStringList& arguments, QObject* owner,
                          std::function<void(const QString& reason)> lateFailure) {
  const QString program = "xdg-email";
  auto* process = new QProcess(owner);
  process->setStandardInputFile(QProcess::nullDevice());
  process->setStandardOutputFile(QProcess::nullDevice());
  process->start(program, arguments);
  if (!process->waitForStarted()) {
    const QString reason = StartFailure(program, *process);
    delete process;
    return {false, reason};
  }
  if (process->waitForFinished(kMailQuickAnswerMs)) {
    const HandOver result{Succeeded(*process),
                          Succeeded(*process) ? QString() : ExitFailure(program, *process)};
    delete process;
    return result;
  }
  QObject::connect(process, &QProcess::finished, owner,
                   [process, program, lateFailure = std::move(lateFailure)] {
                     if (!Succeeded(*process)) lateFailure(ExitFailure(program, *process));
                     process->deleteLater();
                   });
  return {true, {}};
}

}  // namespace quillane

#include "desktop_handover.moc"
