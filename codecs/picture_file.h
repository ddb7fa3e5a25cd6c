// Reading and writing picture files. The loader chooses its decoder by the last four
// characters of the name; the writers never leave a half-written file behind.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include "imaging/bitmap32.h"

namespace quillane {

// A decoder or encoder failure (corrupt or hostile file, picture beyond the size limit, write
// error, full disk). what() is the text shown to the user.
class PictureFileError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// The largest picture the decoders accept unless told otherwise, in pixels. The largest
// single-shot cameras write about 151 million pixels (14204 by 10652, medium-format backs), and
// 100 million is common among them; 200 million opens all of those, and stitched panoramas of
// that size, with room to spare. A picture at the limit already needs 3.2 GB for the copies an
// effect holds at once. Pixel-shift composites (240 to 400 million) and larger panoramas can be
// let in with SetMaxPicturePixels (quillane-cli --max-pixels), up to Bitmap32::kMaxPixels, the
// most a working bitmap can hold.
inline constexpr std::int64_t kDefaultMaxPicturePixels = 200'000'000;

// The limit every decoder applies by default, for the whole process. SetMaxPicturePixels takes
// values from 1 to Bitmap32::kMaxPixels (others are clamped into that range).
std::int64_t MaxPicturePixels();
void SetMaxPicturePixels(std::int64_t pixels);

// Receives the loader's own message boxes (caption, text): an icon that cannot be read.
using LoaderNotice = std::function<void(const std::string& caption, const std::string& text)>;

// Loads the picture at path with the decoder chosen by the last four characters of the path
// in upper case: ".BMP", ".ICO", ".JPG" or "JPEG", ".GIF", ".WMF" or ".EMF".
// - std::nullopt when no file exists at path;
// - an empty bitmap for any other ending;
// - PictureFileError "<path> is not a picture file" for a folder, FIFO, device or socket;
// - otherwise the decoded 32-bit picture. Its alpha bytes are whatever the decoder gives;
//   callers set them to 255.
// A corrupt file, a picture larger than MaxPicturePixels() or one that would not fit in the
// memory available (the message says how much it needs) throws PictureFileError; an
// icon that cannot be read is reported through notice (caption "Exit") and gives an empty
// bitmap.
std::optional<Bitmap32> LoadPictureFile(const std::string& path,
                                        const LoaderNotice& notice = nullptr);

// A PNG file (not one of the program's own input types; the command line reads it), alpha kept
// as stored. Throws PictureFileError as LoadPictureFile does; std::nullopt when no file exists.
std::optional<Bitmap32> LoadPng(const std::string& path);

// Writers. Each writes beside the target and renames over it only when complete, so a failed
// write leaves any existing file as it was. They throw PictureFileError.
void SaveJpeg(const Bitmap32& picture, const std::string& path, int quality = 90);
void SaveBitmap24(const Bitmap32& picture, const std::string& path);
void SaveBitmap32(const Bitmap32& picture, const std::string& path);  // B, G, R, A as held
void SaveMetafile(const Bitmap32& picture, const std::string& path);
void SavePng(const Bitmap32& picture, const std::string& path);  // keeps the alpha byte

// What a writer does with a symbolic link standing at the target's name.
enum class LinkAtTarget {
  Follow,  // the file it names is replaced and the link stays, as an explicit save does
  Refuse,  // PictureFileError "it is a symbolic link", nothing written: for outputs whose names
           // the program makes up in a folder others may write to (batch, gallery)
};
void SaveJpeg(const Bitmap32& picture, const std::string& path, int quality, LinkAtTarget links);
void SavePng(const Bitmap32& picture, const std::string& path, LinkAtTarget links);
// Any bytes, saved as the pictures are.
void SaveTextFile(const std::string& text, const std::string& path, LinkAtTarget links);

// If the name's last ".", "\" or "/" or ":" is a ".", everything from that dot on is replaced
// by extension (given with its dot); otherwise extension is appended.
std::string ReplaceExtension(const std::string& name, const std::string& extension);

// text with A..Z made a..z and every other byte left alone (file names are bytes, not letters
// of any locale).
std::string AsciiLower(std::string_view text);

}  // namespace quillane
