// Print, wallpaper, mail and Help. The desktop's programs are stand-in scripts put first on
// PATH that record their arguments and answer as told; the print goes into a real PDF.
#include <QAction>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusMetaType>
#include <QDBusObjectPath>
#include <QDBusVirtualObject>
#include <QDir>
#include <QPrinter>
#include <QProcess>
#include <QStandardPaths>
#include <QToolButton>

#include "app/export_rules.h"
#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

using Message = ScriptedPlatform::Message;

TEST(ExportRules, PrintRectanglesQuotingAndMailLink) {
  // The doubling is the print test's; an empty picture ends rather than doubling for ever.
  EXPECT_EQ(PrintRectangle(0, 0, 4960, 7015), QRect(2480, 3507, 0, 0));
  EXPECT_EQ(PrintRectangle(6000, 8000, 4960, 7015), QRect(-520, -492, 6000, 8000));  // cut
  EXPECT_EQ(GVariantString("/a/it's\\b"), "'/a/it\\'s\\\\b'");
  EXPECT_TRUE(MailBody("https://example.org/q").contains("\r\nhttps://example.org/q\r\n"));
}

class Export : public FileGuiTest {
 protected:
  void SetUp() override {
    FileGuiTest::SetUp();
    for (const char* name : {"PATH", "XDG_DATA_HOME", "XDG_CURRENT_DESKTOP"})
      saved_.push_back({name, qgetenv(name)});
    qputenv("PATH", (Path("bin") + ":" + qgetenv("PATH")).toLocal8Bit());
    qputenv("XDG_DATA_HOME", Path("data").toLocal8Bit());
  }
  void TearDown() override {
    for (const auto& [name, value] : saved_) qputenv(name, value);
    FileGuiTest::TearDown();
  }

  // Records each call's arguments (each ended by NUL, each call by 036), prints output and
  // error, ends with exitCode.
  void StandIn(const QString& name, int exitCode = 0, const QString& output = "",
               const QString& error = "") {
    std::filesystem::create_directories(LocalPath("bin"));
    WriteBytes(LocalPath("bin/" + name),
               "#!/bin/sh\nprintf '%s\\0' \"$@\" >> \"$0.calls\"\nprintf '\\036' >> "
               "\"$0.calls\"\nprintf '" +
                   output.toStdString() + "'\nprintf '" + error.toStdString() + "' >&2\nexit " +
                   std::to_string(exitCode) + "\n");
    QFile(Path("bin/" + name)).setPermissions(QFile::ReadOwner | QFile::ExeOwner);
  }
  std::vector<QStringList> Calls(const QString& name) const {
    const std::vector<std::uint8_t> bytes = ReadBytes(LocalPath("bin/" + name + ".calls"));
    std::vector<QStringList> calls;
    for (const QByteArray& call : QByteArray(reinterpret_cast<const char*>(bytes.data()),
                                             static_cast<qsizetype>(bytes.size()))
                                      .split('\036'))
      if (!call.isEmpty()) calls.push_back(QString::fromLocal8Bit(call.chopped(1)).split(QChar(0)));
    return calls;
  }
  static QString DataFile(const QString& name) {
    return QDir(QStandardPaths::writableLocation(QStandardPaths::AppDataLocation)).filePath(name);
  }
  void Click(const char* name) { MainChild<QToolButton>(name)->click(); }

  std::vector<std::pair<const char*, QByteArray>> saved_;
};

// The box of the dark pixels of a PDF's page rendered at dpi.
QRect DarkBox(const QString& pdf, int dpi, const QString& folder) {
  QProcess::execute("pdftoppm",
                    {"-r", QString::number(dpi), "-gray", "-singlefile", pdf, folder + "/page"});
  QFile file(folder + "/page.pgm");
  if (!file.open(QIODevice::ReadOnly) || file.readLine() != "P5\n") return {};
  const QList<QByteArray> size = file.readLine().trimmed().split(' ');
  file.readLine();
  const QByteArray pixels = file.readAll();
  const int w = size.value(0).toInt(), h = size.value(1).toInt();
  QRect box;
  for (int y = 0; y < h && pixels.size() == qsizetype{w} * h; ++y)
    for (int x = 0; x < w; ++x)
      if (static_cast<unsigned char>(pixels[y * w + x]) < 128) box |= QRect(x, y, 1, 1);
  return box;
}

TEST_F(Export, PrintPlacesTheDoubledPictureCentredOnOnePage) {
  if (QStandardPaths::findExecutable("pdftoppm").isEmpty())
    GTEST_SKIP() << "pdftoppm (poppler-utils) is needed to read the page back";
  Main().SetWorkingPicture(Bitmap32(521, 346, Pixel{40, 40, 40, 255}), false);
  // The 4960 x 7015 dot page of the example. The PDF writer keeps page sizes in whole points,
  // so it is 992 x 1403 points at 360 dots per inch rather than A4 at 600.
  auto pdfIn = [](QString path) {
    return [path](QPrinter& printer) {
      printer.setOutputFormat(QPrinter::PdfFormat);
      printer.setOutputFileName(path);
      printer.setResolution(360);
      printer.setPageSize(QPageSize(QSize(992, 1403), "", QPageSize::ExactMatch));
      printer.setFullPage(true);
    };
  };
  platform_.printAnswers = {pdfIn(Path("page.pdf")), pdfIn(Path("missing/page.pdf"))};
  Click("SpeedButton10");
  ASSERT_TRUE(platform_.messages.empty() && platform_.errors.empty());
  const QRect box = DarkBox(Path("page.pdf"), 360, folder_.path());
  EXPECT_EQ(box.topLeft(), QPoint(396, 2123));
  // The renderer may cover the last partly touched row and column.
  EXPECT_NEAR(box.width(), 4168, 1);
  EXPECT_NEAR(box.height(), 2768, 1);

  // A printer that cannot start the job; a cancelled dialog; an empty picture, refused first.
  Click("SpeedButton10");
  EXPECT_EQ(platform_.errors, std::vector<QString>{"The printer could not start the print job"});
  Click("SpeedButton10");
  Main().SetWorkingPicture(Bitmap32(), false);
  Click("SpeedButton10");
  EXPECT_EQ(platform_.printDialogs, 3);
  EXPECT_EQ(platform_.messages, (std::vector<Message>{{"Sorry", "There is no picture to print"}}));
}

TEST_F(Export, ASecondWallpaperNamesANewFileSoTheDesktopReallyChanges) {
  qputenv("XDG_CURRENT_DESKTOP", "ubuntu:GNOME");
  StandIn("gsettings");
  const Bitmap32 first(30, 20, Pixel{1, 2, 3, 255}), second(20, 30, Pixel{9, 8, 7, 255});
  Main().SetWorkingPicture(first, false);
  Click("SpeedButton9");
  Main().SetWorkingPicture(second, false);
  Click("SpeedButton9");

  const std::vector<QStringList> calls = Calls("gsettings");
  ASSERT_EQ(calls.size(), 4u);
  std::vector<QString> files;
  for (int i = 0; i < 4; ++i) {
    const char* key = i % 2 ? "picture-uri-dark" : "picture-uri";
    EXPECT_EQ(calls[i].mid(0, 3), QStringList({"set", "org.gnome.desktop.background", key}));
    files.push_back(QUrl(calls[i].value(3).mid(1).chopped(1)).toLocalFile());  // in quotes
  }
  EXPECT_TRUE(files[0] == files[1] && files[2] == files[3] && files[0] != files[2]);
  EXPECT_EQ(LoadPictureFile(files[2].toStdString()), second);
  EXPECT_EQ(platform_.messages, std::vector<Message>(2, {"ok!", "Set as wallpaper successful!"}));
}

TEST_F(Export, EachDesktopIsToldInItsOwnWayAndAFailureSaysWhyAndWhere) {
  struct Case {
    const char *desktop, *program;
    int exitCode, calls;
    QString output, error, reason;
  } const cases[] = {
      {"KDE", "plasma-apply-wallpaperimage", 0, 1},
      {"XFCE", "xfconf-query", 0, 3,
       "/backdrop/screen0/monitor0/workspace0/last-image\\n/a/b\\n"
       "/backdrop/screen0/monitorHDMI-1/workspace1/last-image\\n"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.program);
    std::filesystem::remove_all(LocalPath("bin"));
    qputenv("XDG_CURRENT_DESKTOP", c.desktop);
    StandIn(c.program, c.exitCode, c.output, c.error);
    platform_.messages.clear();
    Click("SpeedButton9");
    EXPECT_EQ(Calls(c.program).size(), std::size_t(c.calls));
    const QString file = DataFile("wallpaper.bmp");
    EXPECT_EQ(LoadPictureFile(file.toStdString()), Main().Document().Working());
    const Message expected = c.reason.isEmpty()
                                 ? Message{"ok!", "Set as wallpaper successful!"}
                                 : Message{"Sorry", "The wallpaper could not be set: " + c.reason +
                                                        ".\nThe picture was saved as " + file};
    EXPECT_EQ(platform_.messages, std::vector<Message>{expected});
    // Only the name a desktop took last stays; one refused is not left behind.
    EXPECT_EQ(QDir(DataFile("")).entryList({"wallpaper-*"}, QDir::Files).size(), 1);
  }
}

// The desktop portal on a bus of the test's own: it answers the call with the request's path,
// then settles the request with answer in the request's Response signal.
class StandInPortal : public QDBusVirtualObject {
 public:
  uint answer = 0;
  std::vector<QVariantList> calls;

  QString introspect(const QString&) const override { return {}; }
  bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override {
    if (message.member() != "SetWallpaperURI") return false;
    calls.push_back(message.arguments());
    const QVariantMap options = qdbus_cast<QVariantMap>(message.arguments().value(2));
    const QString handle = "/org/freedesktop/portal/desktop/request/" +
                           message.service().mid(1).replace('.', '_') + "/" +
                           options.value("handle_token").toString();
    QDBusConnection bus(connection);
    bus.send(message.createReply(QVariant::fromValue(QDBusObjectPath(handle))));
    QDBusMessage response =
        QDBusMessage::createSignal(handle, "org.freedesktop.portal.Request", "Response");
    response << answer << QVariantMap();
    bus.send(response);
    return true;
  }
};

// Success was shown as soon as the portal took the request, before it said whether the
// picture was set.
TEST_F(Export, ThePortalsAnswerIsAwaitedBeforeSuccessIsShown) {
  if (QStandardPaths::findExecutable("dbus-daemon").isEmpty())
    GTEST_SKIP() << "dbus-daemon is needed for a bus of the test's own";
  QProcess daemon;
  daemon.start("dbus-daemon", {"--session", "--nofork", "--print-address"});
  ASSERT_TRUE(daemon.waitForReadyRead(10000));
  const QByteArray address = daemon.readLine().trimmed();
  saved_.push_back({"DBUS_SESSION_BUS_ADDRESS", qgetenv("DBUS_SESSION_BUS_ADDRESS")});
  qputenv("DBUS_SESSION_BUS_ADDRESS", address);
  qputenv("XDG_CURRENT_DESKTOP", "");
  const QString sorry = "The wallpaper could not be set: the desktop portal did not take it: ";
  const QString where = ".\nThe picture was saved as " + DataFile("wallpaper.bmp");

  Click("SpeedButton9");  // nobody there to answer
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_TRUE(platform_.messages[0].text.startsWith(sorry))
      << platform_.messages[0].text.toStdString();
  EXPECT_TRUE(platform_.messages[0].text.endsWith(where));

  StandInPortal portal;
  QDBusConnection bus = QDBusConnection::connectToBus(QString::fromLatin1(address), "portal");
  ASSERT_TRUE(bus.registerVirtualObject("/org/freedesktop/portal/desktop", &portal));
  ASSERT_TRUE(bus.registerService("org.freedesktop.portal.Desktop"));
  const std::pair<uint, Message> answers[] = {
      {0, {"ok!", "Set as wallpaper successful!"}},
      {2, {"Sorry", sorry + "it refused the picture" + where}},
      {1, {"Sorry", sorry + "it was cancelled" + where}}};
  for (const auto& [answer, message] : answers) {
    platform_.messages.clear();
    portal.answer = answer;
    Click("SpeedButton9");
    EXPECT_EQ(platform_.messages, std::vector<Message>{message}) << answer;
  }
  QDBusConnection::disconnectFromBus("portal");
  daemon.kill();
  daemon.waitForFinished();

  ASSERT_EQ(portal.calls.size(), 3u);
  const QString uri = portal.calls[0].value(1).toString();
  EXPECT_TRUE(uri.startsWith("file://") && uri.contains("/wallpaper-")) << uri.toStdString();
  const QVariantMap options = qdbus_cast<QVariantMap>(portal.calls[0].value(2));
  EXPECT_EQ(options.value("show-preview"), QVariant(false));
  EXPECT_EQ(options.value("set-on"), QVariant("background"));
}

TEST_F(Export, MailHandsThePictureToTheMailProgramOrSaysWhereItIs) {
  StandIn("xdg-email");
  Click("SpeedButton11");
  const QString attachment = DataFile("mywork.jpg");
  EXPECT_EQ(Calls("xdg-email"), std::vector<QStringList>({{"--subject", kMailSubject, "--body",
                                                           MailBody("Quillane " QUILLANE_VERSION),
                                                           "--attach", attachment}}));
  EXPECT_EQ(LoadPictureFile(attachment.toStdString())->Width(), 24);
  EXPECT_TRUE(platform_.messages.empty());

  StandIn("xdg-email", 3, "", "xdg-email: no method available for opening mailto:");
  Click("SpeedButton11");
  qputenv("PATH", Path("nowhere").toLocal8Bit());
  Click("SpeedButton11");
  const QString start = "No mail program could be started: xdg-email ";
  const QString where = ".\nThe picture was saved as " + attachment;
  EXPECT_EQ(platform_.messages,
            (std::vector<Message>{{"Sorry", start +
                                                "ended with code 3 (xdg-email: no method "
                                                "available for opening mailto:)" +
                                                where},
                                  {"Sorry", start + "was not found" + where}}));
}

TEST_F(Export, HelpOpensTheReadmeOrSaysWhyNot) {
  MenuAction("Online1")->trigger();
  platform_.defaultProgramStarts = false;
  MenuAction("Online1")->trigger();
  const QString readme = QDir::cleanPath(QUILLANE_SOURCE_DIR "/README.md");
  EXPECT_EQ(platform_.openedFiles, std::vector<QString>(2, readme));
  EXPECT_EQ(platform_.messages,
            (std::vector<Message>{{"Sorry", "No program could be started to show " + readme}}));
}

}  // namespace
}  // namespace quillane
