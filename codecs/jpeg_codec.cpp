// JPEG through libjpeg-turbo. libjpeg reports errors through a callback that must not return;
// it longjmps back to the one function that owns the libjpeg object, and only after that
// function has left the libjpeg frames does anything throw. Objects with destructors live
// outside the region a longjmp can skip.
// jpeglib.h needs size_t and FILE declared first.
#include <cstddef>
#include <cstdio>
// clang-format off
#include <jpeglib.h>
#include <jerror.h>
// clang-format on

#include <algorithm>
#include <csetjmp>
#include <cstring>
#include <new>
#include <string>
#include <utility>

#include "codecs/codec_internal.h"
#include "codecs/exif_orientation.h"
#include "imaging/orientation.h"

namespace quillane::codecs {
namespace {

// Far more scans than any encoder writes; a crafted progressive file with thousands of tiny
// scans would otherwise take minutes.
constexpr int kMaxScans = 500;
constexpr JDIMENSION kRowsPerRead = 16;

struct ErrorManager {
  jpeg_error_mgr pub;
  std::jmp_buf jump;
  char message[JMSG_LENGTH_MAX + 64];
  bool headerRead;  // past jpeg_read_header
  bool dataEnded;   // the source ran dry and libjpeg went on with a made-up end marker
  bool allRowsRead;
};

[[noreturn]] void Fail(j_common_ptr cinfo, const char* text) {
  auto* err = reinterpret_cast<ErrorManager*>(cinfo->err);
  std::snprintf(err->message, sizeof err->message, "%s", text);
  std::longjmp(err->jump, 1);
}

[[noreturn]] void ErrorExit(j_common_ptr cinfo) {
  auto* err = reinterpret_cast<ErrorManager*>(cinfo->err);
  (*cinfo->err->format_message)(cinfo, err->message);
  std::longjmp(err->jump, 1);
}

// Damaged entropy data is refused rather than shown with gray blocks: the decoder's warnings
// that data is corrupt or ended early mean the picture is not all there. The end of the data
// alone is not enough to tell: libjpeg also reaches it looking for the end marker after the
// last scan, which some writers leave out. It is the entropy decoder then finding no more bits
// (a marker where data should be) that shows real loss.
void EmitMessage(j_common_ptr cinfo, int level) {
  if (level >= 0) return;
  auto* err = reinterpret_cast<ErrorManager*>(cinfo->err);
  switch (cinfo->err->msg_code) {
    case JWRN_JPEG_EOF:
      if (!err->headerRead) Fail(cinfo, "The JPEG file is truncated (it ends inside its header)");
      // The arithmetic decoder reads on past the data as zeros without a word, so the end of
      // the file before the last row is the only sign of loss it gives.
      if (reinterpret_cast<j_decompress_ptr>(cinfo)->arith_code && !err->allRowsRead)
        Fail(cinfo, "The JPEG file is truncated (premature end of data)");
      err->dataEnded = true;
      break;
    case JWRN_HIT_MARKER:
      Fail(cinfo, err->dataEnded ? "The JPEG file is truncated (premature end of data)"
                                 : "The JPEG file is damaged (corrupt data)");
    case JWRN_EXTRANEOUS_DATA:
      // Stray bytes before the end marker, which some cameras write, follow complete data.
      if (cinfo->err->msg_parm.i[1] == 0xD9) break;
      [[fallthrough]];
    case JWRN_MUST_RESYNC:
    case JWRN_HUFF_BAD_CODE:
    case JWRN_ARITH_BAD_CODE:
    case JWRN_BOGUS_PROGRESSION:
      if (!err->allRowsRead) Fail(cinfo, "The JPEG file is damaged (corrupt data)");
      break;
    default:
      break;
  }
  cinfo->err->num_warnings++;
}

void OutputMessage(j_common_ptr) {}

// The first EXIF block among the APP1 segments libjpeg kept (XMP packets are APP1 too).
int OrientationOf(const jpeg_decompress_struct& cinfo) {
  for (jpeg_saved_marker_ptr m = cinfo.marker_list; m != nullptr; m = m->next) {
    if (m->marker == JPEG_APP0 + 1 && m->data != nullptr && m->data_length >= 6 &&
        std::memcmp(m->data, "Exif\0\0", 6) == 0)
      return ExifOrientation(Bytes(m->data, m->data_length));
  }
  return 1;
}

// Times each block may be visited by the scans of a progressive file: the usual scan script goes
// over a 4:2:0 picture's blocks about five times, so 32 leaves room for any real encoder while a
// crafted file of hundreds of scans over a large picture (minutes of work from 10 KB) is refused
// before the decoder starts.
constexpr std::uint64_t kMostVisitsPerBlock = 32;
// Visits that cost nothing worth refusing a file for (a few tens of milliseconds).
constexpr std::uint64_t kFreeBlockVisits = std::uint64_t{1} << 20;
// Arithmetic coding can give a block of one flat colour in a small fraction of a bit, so a file
// is only asked for one byte per this many blocks of its first component: a flat picture of
// 16000 by 16000 pixels needs 4 KB, and no photograph comes near.
constexpr std::uint64_t kArithmeticBlocksPerByte = 1024;

// What the scans of a file hold, found by walking its markers: each start of scan names its
// components, and entropy-coded data runs up to the next marker that is not a restart.
struct ScanSurvey {
  int scans = 0;
  std::uint64_t blockVisits = 0;   // blocks of the components each scan names, summed
  std::uint64_t entropyBytes = 0;  // coded data, not counting headers, tables or metadata
};

ScanSurvey SurveyScans(Bytes data, const jpeg_decompress_struct& cinfo) {
  ScanSurvey survey;
  std::size_t at = 2;  // after the start of image
  while (at + 4 <= data.size()) {
    if (data[at] != 0xFF) {  // stray bytes between segments, which libjpeg skips as well
      ++at;
      continue;
    }
    const std::uint8_t marker = data[at + 1];
    if (marker == 0xFF) {  // fill byte
      ++at;
      continue;
    }
    if (marker == 0xD9) break;  // end of image
    if (marker == 0x00 || marker == 0x01 || (marker >= 0xD0 && marker <= 0xD8)) {
      at += 2;
      continue;
    }
    const std::size_t length = std::size_t{data[at + 2]} << 8 | data[at + 3];
    at += 2 + length;
    if (marker != 0xDA || length < 3) continue;
    ++survey.scans;
    const std::size_t header = at - length + 2;  // the component count, after the length
    if (header >= data.size()) break;
    const unsigned count = data[header];
    for (unsigned i = 0; i < count && header + 1 + 2 * i < std::min(at, data.size()); ++i) {
      const int id = data[header + 1 + 2 * i];
      for (int c = 0; c < cinfo.num_components; ++c) {
        const jpeg_component_info& comp = cinfo.comp_info[c];
        if (comp.component_id == id)
          survey.blockVisits += std::uint64_t{comp.width_in_blocks} * comp.height_in_blocks;
      }
    }
    const std::size_t dataStart = std::min(at, data.size());
    while (at + 1 < data.size() &&
           !(data[at] == 0xFF && data[at + 1] != 0 && (data[at + 1] < 0xD0 || data[at + 1] > 0xD7)))
      ++at;
    at = std::min(at + (at + 1 >= data.size() ? 1 : 0), data.size());
    survey.entropyBytes += at - dataStart;
  }
  return survey;
}

// What makes the file unable to hold the picture its header announces, or "" when it can. Runs
// before anything of the picture's size is allocated. Only coded data counts: metadata such as
// a large profile or thumbnail says nothing about the picture.
std::string EvidenceProblem(Bytes data, const jpeg_decompress_struct& cinfo) {
  const std::string picture = "a picture of " + std::to_string(cinfo.image_width) + " by " +
                              std::to_string(cinfo.image_height) + " pixels";
  const ScanSurvey survey = SurveyScans(data, cinfo);
  const std::uint64_t blocks =
      std::uint64_t{cinfo.comp_info[0].width_in_blocks} * cinfo.comp_info[0].height_in_blocks;
  // Huffman coding spends at least one bit on every block of the first component.
  const std::uint64_t blocksPerByte = cinfo.arith_code ? kArithmeticBlocksPerByte : 8;
  if (survey.entropyBytes < blocks / blocksPerByte) {
    return "The JPEG file is truncated (" + std::to_string(survey.entropyBytes) +
           " bytes of picture data cannot hold " + picture + ")";
  }
  if (!cinfo.progressive_mode) return {};
  std::uint64_t allBlocks = 0;
  for (int c = 0; c < cinfo.num_components; ++c)
    allBlocks +=
        std::uint64_t{cinfo.comp_info[c].width_in_blocks} * cinfo.comp_info[c].height_in_blocks;
  if (survey.scans > kMaxScans ||
      survey.blockVisits > std::max(kFreeBlockVisits, kMostVisitsPerBlock * allBlocks)) {
    return "The JPEG file is damaged (its " + std::to_string(survey.scans) +
           " progressive scans go over " + picture + " more often than any encoder writes)";
  }
  return {};
}

void LimitScans(j_common_ptr cinfo) {
  if (!cinfo->is_decompressor) return;
  const auto* dinfo = reinterpret_cast<j_decompress_ptr>(cinfo);
  if (dinfo->input_scan_number > kMaxScans) {
    Fail(cinfo, "The JPEG file has too many progressive scans to be a real picture");
  }
}

void InstallErrorManager(ErrorManager& err) {
  jpeg_std_error(&err.pub);
  err.pub.error_exit = ErrorExit;
  err.pub.emit_message = EmitMessage;
  err.pub.output_message = OutputMessage;
  err.message[0] = '\0';
  err.headerRead = false;
  err.dataEnded = false;
  err.allRowsRead = false;
}

std::uint8_t MulDiv255(unsigned a, unsigned b) {
  return static_cast<std::uint8_t>((a * b * 2 + 255) / 510);
}

struct Decompressor {
  jpeg_decompress_struct cinfo{};
  ErrorManager err{};
  jpeg_progress_mgr progress{};
  bool created = false;
  int orientation = 1;  // from the EXIF block, 1 without one
  ~Decompressor() {
    if (created) jpeg_destroy_decompress(&cinfo);
  }
};

// Everything libjpeg touches happens here; returns false with err.message set on failure.
bool RunDecoder(Decompressor& d, Bytes data, std::int64_t maxPixels, Bitmap32& result,
                std::vector<JSAMPLE>& inkRows, std::string& sizeProblem) {
  if (setjmp(d.err.jump)) return false;
  jpeg_create_decompress(&d.cinfo);
  d.created = true;
  d.progress.progress_monitor = LimitScans;
  d.cinfo.progress = &d.progress;
  jpeg_mem_src(&d.cinfo, data.data(), static_cast<unsigned long>(data.size()));
  jpeg_save_markers(&d.cinfo, JPEG_APP0 + 1, 0xFFFF);
  jpeg_read_header(&d.cinfo, TRUE);
  d.err.headerRead = true;
  d.orientation = OrientationOf(d.cinfo);

  const std::int64_t width = d.cinfo.image_width;
  const std::int64_t height = d.cinfo.image_height;
  // A file too short for the picture its header announces is refused before a huge picture is
  // allocated and decoded from a few bytes.
  sizeProblem = EvidenceProblem(data, d.cinfo);
  if (!sizeProblem.empty()) return true;
  // A progressive file is decoded into a coefficient buffer of two bytes per sample first.
  // Standing a picture upright across its diagonal copies it once more.
  const int extraBytesPerPixel = (d.cinfo.progressive_mode ? 2 * d.cinfo.num_components : 0) +
                                 (OrientationSwapsSides(d.orientation) ? 4 : 0);
  try {
    CheckPictureSize(width, height, maxPixels, "JPEG", extraBytesPerPixel);
  } catch (const PictureFileError& e) {
    sizeProblem = e.what();
    return true;
  }
  const bool inks = d.cinfo.jpeg_color_space == JCS_CMYK || d.cinfo.jpeg_color_space == JCS_YCCK;
  d.cinfo.out_color_space = inks ? JCS_CMYK : JCS_EXT_BGRA;
  d.cinfo.dct_method = JDCT_ISLOW;
  jpeg_start_decompress(&d.cinfo);
  if (d.cinfo.output_width != d.cinfo.image_width ||
      d.cinfo.output_height != d.cinfo.image_height) {
    Fail(reinterpret_cast<j_common_ptr>(&d.cinfo), "The JPEG decoder changed the picture size");
  }
  result.SetSize(static_cast<int>(width), static_cast<int>(height));
  const auto w = static_cast<std::size_t>(width);
  if (inks) inkRows.resize(w * 4 * kRowsPerRead);

  // Adobe writers store inverted inks (0 = full ink); everyone else stores plain inks.
  const bool inverted = d.cinfo.saw_Adobe_marker;
  JSAMPROW rows[kRowsPerRead];
  while (d.cinfo.output_scanline < d.cinfo.output_height) {
    const JDIMENSION first = d.cinfo.output_scanline;
    const JDIMENSION count = std::min(kRowsPerRead, d.cinfo.output_height - first);
    for (JDIMENSION i = 0; i < count; ++i) {
      rows[i] = inks ? inkRows.data() + i * w * 4
                     : reinterpret_cast<JSAMPROW>(result.ScanLine(static_cast<int>(first + i)));
    }
    const JDIMENSION got = jpeg_read_scanlines(&d.cinfo, rows, count);
    if (got == 0) Fail(reinterpret_cast<j_common_ptr>(&d.cinfo), "The JPEG decoder stalled");
    if (!inks) continue;
    for (JDIMENSION i = 0; i < got; ++i) {
      const JSAMPLE* ink = rows[i];
      Pixel* out = result.ScanLine(static_cast<int>(first + i));
      for (std::size_t x = 0; x < w; ++x, ink += 4) {
        unsigned c = ink[0], m = ink[1], y = ink[2], k = ink[3];
        if (!inverted) {
          c = 255 - c;
          m = 255 - m;
          y = 255 - y;
          k = 255 - k;
        }
        out[x] = Pixel{MulDiv255(y, k), MulDiv255(m, k), MulDiv255(c, k), 255};
      }
    }
  }
  // Every row is in; whatever follows the last scan (or a missing end marker) does not matter.
  d.err.allRowsRead = true;
  return true;
}

struct VectorDestination {
  jpeg_destination_mgr pub;
  std::vector<std::uint8_t>* out;
  std::size_t used;
  bool outOfMemory;
};

constexpr std::size_t kDestinationChunk = 1 << 16;

bool Grow(VectorDestination* dest) {
  try {
    dest->out->resize(dest->out->size() + kDestinationChunk);
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

void InitDestination(j_compress_ptr cinfo) {
  auto* dest = reinterpret_cast<VectorDestination*>(cinfo->dest);
  if (!Grow(dest)) Fail(reinterpret_cast<j_common_ptr>(cinfo), "Out of memory");
  dest->pub.next_output_byte = dest->out->data();
  dest->pub.free_in_buffer = dest->out->size();
}

boolean EmptyDestination(j_compress_ptr cinfo) {
  auto* dest = reinterpret_cast<VectorDestination*>(cinfo->dest);
  const std::size_t used = dest->out->size();
  if (!Grow(dest)) Fail(reinterpret_cast<j_common_ptr>(cinfo), "Out of memory");
  dest->pub.next_output_byte = dest->out->data() + used;
  dest->pub.free_in_buffer = dest->out->size() - used;
  return TRUE;
}

void TermDestination(j_compress_ptr cinfo) {
  auto* dest = reinterpret_cast<VectorDestination*>(cinfo->dest);
  dest->out->resize(dest->out->size() - dest->pub.free_in_buffer);
}

struct Compressor {
  jpeg_compress_struct cinfo{};
  ErrorManager err{};
  VectorDestination dest{};
  bool created = false;
  ~Compressor() {
    if (created) jpeg_destroy_compress(&cinfo);
  }
};

bool RunEncoder(Compressor& c, const Bitmap32& picture, int quality,
                std::vector<std::uint8_t>& out) {
  if (setjmp(c.err.jump)) return false;
  jpeg_create_compress(&c.cinfo);
  c.created = true;
  c.dest.pub.init_destination = InitDestination;
  c.dest.pub.empty_output_buffer = EmptyDestination;
  c.dest.pub.term_destination = TermDestination;
  c.dest.out = &out;
  c.cinfo.dest = &c.dest.pub;
  c.cinfo.image_width = static_cast<JDIMENSION>(picture.Width());
  c.cinfo.image_height = static_cast<JDIMENSION>(picture.Height());
  c.cinfo.input_components = 4;
  c.cinfo.in_color_space = JCS_EXT_BGRX;
  jpeg_set_defaults(&c.cinfo);
  jpeg_set_quality(&c.cinfo, quality, TRUE);
  jpeg_start_compress(&c.cinfo, TRUE);
  JSAMPROW rows[kRowsPerRead];
  while (c.cinfo.next_scanline < c.cinfo.image_height) {
    const JDIMENSION first = c.cinfo.next_scanline;
    const JDIMENSION count = std::min(kRowsPerRead, c.cinfo.image_height - first);
    for (JDIMENSION i = 0; i < count; ++i) {
      // libjpeg only reads input rows; its interface just lacks the const.
      rows[i] = reinterpret_cast<JSAMPROW>(
          const_cast<Pixel*>(picture.ScanLine(static_cast<int>(first + i))));
    }
    jpeg_write_scanlines(&c.cinfo, rows, count);
  }
  jpeg_finish_compress(&c.cinfo);
  return true;
}

}  // namespace

Bitmap32 DecodeJpeg(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The JPEG file is empty");
  Decompressor d;
  InstallErrorManager(d.err);
  d.cinfo.err = &d.err.pub;
  Bitmap32 result;
  std::vector<JSAMPLE> inkRows;
  std::string sizeProblem;
  if (!RunDecoder(d, data, maxPixels, result, inkRows, sizeProblem)) {
    throw PictureFileError(std::string("Cannot read the JPEG picture: ") + d.err.message);
  }
  if (!sizeProblem.empty()) throw PictureFileError(sizeProblem);
  return UprightPicture(std::move(result), d.orientation);
}

std::vector<std::uint8_t> EncodeJpeg(const Bitmap32& picture, int quality) {
  if (picture.Empty()) throw PictureFileError("There is no picture to save");
  if (picture.Width() > JPEG_MAX_DIMENSION || picture.Height() > JPEG_MAX_DIMENSION) {
    throw PictureFileError("The picture is too large for a JPEG file (at most " +
                           std::to_string(JPEG_MAX_DIMENSION) + " pixels a side)");
  }
  Compressor c;
  InstallErrorManager(c.err);
  c.cinfo.err = &c.err.pub;
  std::vector<std::uint8_t> out;
  if (!RunEncoder(c, picture, std::clamp(quality, 1, 100), out)) {
    throw PictureFileError(std::string("Cannot write the JPEG picture: ") + c.err.message);
  }
  return out;
}

}  // namespace quillane::codecs
