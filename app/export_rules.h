// The plain rules behind the main window's print, wallpaper, mail and help commands: what is
// computed and chosen before anything is handed to the printer or the desktop.
#pragma once

#include <QRect>
#include <QString>

namespace quillane {

// Where a width by height picture lands on a page of pageWidth by pageHeight printer dots. A
// picture under half the page in both directions is doubled until it reaches half the page in
// one of them, so a small picture is not printed as a stamp, then centred (division truncating
// toward zero). A picture larger than the page is centred and cut by the page edges. width and
// height must be at least 1: an empty picture would be doubled for ever.
QRect PrintRectangle(int width, int height, int pageWidth, int pageHeight);

// The mail that goes with a picture.
inline constexpr char kMailSubject[] = "Give you my great work, perfect sketch!";
// Its text, lines ending in CR LF; downloadPage is the line that tells the friend where the
// program is found.
QString MailBody(const QString& downloadPage);

// The desktop whose own wallpaper setting is used; any other goes through the desktop portal.
enum class Desktop { kGnome, kKde, kXfce, kOther };
// From XDG_CURRENT_DESKTOP: a ":"-separated list, most specific first ("ubuntu:GNOME"); the
// first name the program knows decides, in any letter case.
Desktop DesktopFromXdg(const QString& currentDesktop);

// text as a GVariant string literal, as gsettings and gdbus parse their value arguments: in
// single quotes, with "\" and "'" escaped, so no file name can be read as another value.
QString GVariantString(const QString& text);

// The program's documentation: README.md as installed beside the program
// (<exeDir>/../share/doc/quillane), else the one in its source tree; empty when neither exists.
QString DocumentationFile(const QString& exeDir, const QString& sourceDir);

}  // namespace quillane
