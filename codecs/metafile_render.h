// What passes between the metafile decoders and the programs that draw metafiles in a process
// of their own: quillane-wmf-render (Windows metafiles through libwmf) and quillane-emf-render
// (enhanced metafiles with vector content, through libemf2svg and Qt's SVG renderer). A hostile
// file can make those libraries draw for minutes or allocate without end inside one record; a
// child process can be limited and killed.
//
// The decoder starts the program with its arguments (see kWmfProgramName and kEmfProgramName)
// and writes FILE_SIZE bytes of metafile to its standard input. The program answers on its
// standard output with three 32-bit words in the machine's byte order, the reply, a width and a
// height, followed for kPicture by width x height pixels, row after row from the top, in the
// bytes B, G, R, 255.
#pragma once

#include <cstddef>
#include <cstdint>

namespace quillane::codecs::metafile_render {

// `quillane-wmf-render MAX_PIXELS FILE_SIZE`: the program works out the picture's size itself.
inline constexpr char kWmfProgramName[] = "quillane-wmf-render";
// `quillane-emf-render WIDTH HEIGHT FILE_SIZE M11 M22 DX DY`: the decoder has read the header and
// chosen the picture's size; (M11, M22, DX, DY) scales and moves the reference device's pixels
// onto the picture.
inline constexpr char kEmfProgramName[] = "quillane-emf-render";

enum class Reply : std::uint32_t {
  kPicture = 1,
  kSize,  // the picture would be width x height, which is 0 or more than MAX_PIXELS; no pixels
  kNotStarted,
  kNotOpened,
  kDamaged,
  kNoUnitsPerInch,
  kNoPictureSize,
  kNotDrawn,
};

inline constexpr std::size_t kReplyHeaderSize = 3 * sizeof(std::uint32_t);

// The programs' limits. CPU time bounds the drawing: a fixed allowance for the records plus time
// for filling, converting and handing over every pixel. A program is sent SIGXCPU when the
// allowance for its picture has gone and SIGKILL a second after the allowance for the largest
// picture it was allowed; the decoder's wall clock waits a little longer than that, for a
// loaded machine.
inline constexpr std::uint64_t kCpuSeconds = 5;
inline constexpr std::uint64_t kPixelsPerCpuSecond = std::uint64_t{1} << 24;
constexpr std::uint64_t CpuSeconds(std::uint64_t pixels) {
  return kCpuSeconds + pixels / kPixelsPerCpuSecond;
}
constexpr std::uint64_t WallClockSeconds(std::uint64_t maxPixels) {
  return CpuSeconds(maxPixels) + 5;
}
// Address space beyond the picture itself (4 bytes a pixel) and the file: libraries, fonts,
// libwmf's tables and gd's brushes.
inline constexpr std::uint64_t kSpareAddressSpace = std::uint64_t{768} << 20;
// The enhanced metafile renderer also holds Qt with its platform plugin and font database, the
// SVG text (a few times the file's size) and the SVG renderer's document tree.
inline constexpr std::uint64_t kEmfSpareAddressSpace = std::uint64_t{2048} << 20;
inline constexpr std::uint64_t kEmfBytesPerFileByte = 64;

}  // namespace quillane::codecs::metafile_render
