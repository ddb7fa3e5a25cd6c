// Writes a small seed corpus for the fuzz targets: make_seeds <folder> creates
// <folder>/<family>/ with a few valid files of each family, covering its main variants.
#include <cstddef>
#include <cstdio>
// clang-format off
#include <jpeglib.h>
// clang-format on

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"

namespace {

using quillane::Bitmap32;
using quillane::Pixel;
using Bytes = std::vector<std::uint8_t>;

struct Writer {
  Bytes b;
  Writer& U8(unsigned v) {
    b.push_back(static_cast<std::uint8_t>(v));
    return *this;
  }
  Writer& U16(unsigned v) { return U8(v & 0xFF).U8(v >> 8 & 0xFF); }
  Writer& U32(std::uint32_t v) { return U16(v & 0xFFFF).U16(v >> 16); }
  Writer& Add(const Bytes& more) {
    b.insert(b.end(), more.begin(), more.end());
    return *this;
  }
};

// The header of a written metafile followed by shapes, a path and text instead of its bitmap:
// the vector content that goes to the renderer program.
Bytes VectorEmf(const Bytes& written) {
  Writer w;
  w.Add(Bytes(written.begin(), written.begin() + 108));
  w.U32(39).U32(24).U32(1).U32(0).U32(0x00FF8000).U32(0);         // CreateBrushIndirect
  w.U32(38).U32(28).U32(2).U32(0).U32(1).U32(0).U32(0x000000FF);  // CreatePen
  w.U32(37).U32(12).U32(1).U32(37).U32(12).U32(2);                // SelectObject twice
  w.U32(43).U32(24).U32(0).U32(0).U32(2).U32(1);                  // Rectangle
  w.U32(42).U32(24).U32(1).U32(0).U32(3).U32(2);                  // Ellipse
  w.U32(86).U32(40).U32(0).U32(0).U32(3).U32(2).U32(3);           // Polygon16
  w.U16(0).U16(0).U16(3).U16(0).U16(1).U16(2);
  w.U32(59).U32(8);                                                    // BeginPath
  w.U32(27).U32(16).U32(0).U32(0).U32(54).U32(16).U32(2).U32(2);       // MoveTo, LineTo
  w.U32(60).U32(8).U32(62).U32(24).U32(0).U32(0).U32(2).U32(2);        // EndPath, StrokeAndFillPath
  w.U32(84).U32(80).U32(0).U32(0).U32(0).U32(0).U32(1).U32(0).U32(0);  // ExtTextOutW "A"
  w.U32(0).U32(0).U32(1).U32(76).U32(0).U32(0).U32(0).U32(0).U32(0).U32(0).U16('A').U16(0);
  w.U32(14).U32(20).U32(0).U32(16).U32(20);  // EOF
  const auto size = static_cast<std::uint32_t>(w.b.size());
  for (int i = 0; i < 4; ++i)
    w.b[48 + static_cast<std::size_t>(i)] = static_cast<std::uint8_t>(size >> (8 * i));
  w.b[52] = 15;  // records
  return w.b;
}

Bitmap32 Pattern(int w, int h) {
  Bitmap32 p(w, h);
  for (int y = 0; y < h; ++y) {
    for (int x = 0; x < w; ++x) {
      p.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 8), static_cast<std::uint8_t>(y * 8),
                         static_cast<std::uint8_t>((x ^ y) * 16), 255};
    }
  }
  return p;
}

// progressive: simple progression; components: 1 gray, 3 YCbCr, 4 Adobe CMYK; arithmetic
// coding instead of Huffman; scanPerCoefficient: a progressive script of a scan for every
// coefficient of every component (190 scans), far more than any encoder writes.
Bytes Jpeg(int components, bool progressive, bool arithmetic = false,
           bool scanPerCoefficient = false) {
  jpeg_compress_struct cinfo{};
  jpeg_error_mgr err{};
  cinfo.err = jpeg_std_error(&err);
  jpeg_create_compress(&cinfo);
  unsigned char* out = nullptr;
  unsigned long size = 0;
  jpeg_mem_dest(&cinfo, &out, &size);
  cinfo.image_width = 24;
  cinfo.image_height = 16;
  cinfo.input_components = components;
  cinfo.in_color_space = components == 1 ? JCS_GRAYSCALE : components == 3 ? JCS_RGB : JCS_CMYK;
  jpeg_set_defaults(&cinfo);
  jpeg_set_quality(&cinfo, 75, TRUE);
  cinfo.restart_in_rows = 1;
  if (progressive) jpeg_simple_progression(&cinfo);
  cinfo.arith_code = arithmetic;
  std::vector<jpeg_scan_info> scans;
  if (scanPerCoefficient) {
    scans.push_back({components, {0, 1, 2, 3}, 0, 0, 0, 0});
    for (int c = 0; c < components; ++c)
      for (int k = 1; k < 64; ++k) scans.push_back({1, {c, 0, 0, 0}, k, k, 0, 0});
    cinfo.scan_info = scans.data();
    cinfo.num_scans = static_cast<int>(scans.size());
  }
  jpeg_start_compress(&cinfo, TRUE);
  std::vector<JSAMPLE> row(24 * static_cast<std::size_t>(components));
  while (cinfo.next_scanline < cinfo.image_height) {
    for (std::size_t i = 0; i < row.size(); ++i) {
      row[i] = static_cast<JSAMPLE>(i * 11 + cinfo.next_scanline * 13);
    }
    JSAMPROW rows[1] = {row.data()};
    jpeg_write_scanlines(&cinfo, rows, 1);
  }
  jpeg_finish_compress(&cinfo);
  Bytes bytes(out, out + size);
  jpeg_destroy_compress(&cinfo);
  std::free(out);
  return bytes;
}

Bytes InfoHeader(int w, int h, int bits, std::uint32_t compression, std::uint32_t colours) {
  Writer wr;
  wr.U32(40).U32(static_cast<std::uint32_t>(w)).U32(static_cast<std::uint32_t>(h)).U16(1);
  wr.U16(bits).U32(compression).U32(0).U32(3780).U32(3780).U32(colours).U32(0);
  return wr.b;
}

Bytes Bmp(const Bytes& info, const Bytes& palette, const Bytes& bits) {
  const auto offset = static_cast<std::uint32_t>(14 + info.size() + palette.size());
  Writer wr;
  wr.U8('B').U8('M').U32(offset + static_cast<std::uint32_t>(bits.size())).U32(0).U32(offset);
  return wr.Add(info).Add(palette).Add(bits).b;
}

Bytes Ico() {
  Writer body;
  body.Add(InfoHeader(16, 32, 32, 0, 0));
  for (int i = 0; i < 16 * 16; ++i) body.U8(i).U8(255 - i).U8(128).U8(i % 3 ? 255 : 0);
  for (int i = 0; i < 4 * 16; ++i) body.U8(0);
  Writer small;
  small.Add(InfoHeader(8, 16, 8, 0, 2)).U32(0).U32(0x00FF0000);
  for (int i = 0; i < 8 * 8; ++i) small.U8(i & 1);
  for (int i = 0; i < 4 * 8; ++i) small.U8(0xAA);
  Writer file;
  file.U16(0).U16(1).U16(2);
  file.U8(16).U8(16).U8(0).U8(0).U16(1).U16(32).U32(static_cast<std::uint32_t>(body.b.size()));
  file.U32(38);
  file.U8(8).U8(8).U8(2).U8(0).U16(1).U16(8).U32(static_cast<std::uint32_t>(small.b.size()));
  file.U32(static_cast<std::uint32_t>(38 + body.b.size()));
  return file.Add(body.b).Add(small.b).b;
}

// Literal-only LZW with a clear code every two codes (minimum code size 2).
Bytes Gif(bool interlaced, bool transparent) {
  Writer w;
  for (char c : std::string("GIF89a")) w.U8(static_cast<unsigned char>(c));
  w.U16(6).U16(5).U8(0xF1).U8(0).U8(0);
  w.U8(255).U8(0).U8(0).U8(0).U8(255).U8(0).U8(0).U8(0).U8(255).U8(255).U8(255).U8(255);
  if (transparent) w.U8(0x21).U8(0xF9).U8(4).U8(1).U16(0).U8(3).U8(0);
  w.U8(0x2C).U16(1).U16(0).U16(4).U16(5).U8(interlaced ? 0x40 : 0).U8(2);
  Bytes data;
  std::uint32_t acc = 0;
  int bits = 0;
  const auto emit = [&](unsigned code) {
    acc |= code << bits;
    for (bits += 3; bits >= 8; bits -= 8, acc >>= 8) data.push_back(acc & 0xFF);
  };
  for (int i = 0; i < 20; ++i) {
    if (i % 2 == 0) emit(4);
    emit(static_cast<unsigned>(i % 4));
  }
  emit(5);
  if (bits > 0) data.push_back(acc & 0xFF);
  w.U8(static_cast<unsigned>(data.size())).Add(data).U8(0).U8(0x3B);
  return w.b;
}

Bytes Wmf() {
  Writer records;
  const auto record = [&records](unsigned function, std::vector<int> params) {
    records.U32(static_cast<std::uint32_t>(3 + params.size())).U16(function);
    for (int p : params) records.U16(static_cast<std::uint16_t>(p));
  };
  record(0x020B, {0, 0});
  record(0x020C, {30, 40});
  record(0x02FC, {0, 0x00FF, 0, 0});
  record(0x012D, {0});
  record(0x02FA, {0, 1, 0, 0x0F0F, 0});
  record(0x012D, {1});
  record(0x041B, {25, 30, 5, 10});
  record(0x0418, {28, 38, 2, 20});  // ellipse
  record(0x0000, {});
  Writer head;
  head.U32(0x9AC6CDD7).U16(0).U16(0).U16(0).U16(40).U16(30).U16(96).U32(0);
  unsigned checksum = 0;
  for (std::size_t i = 0; i < 20; i += 2) checksum ^= head.b[i] | head.b[i + 1] << 8;
  head.U16(checksum);
  head.U16(1).U16(9).U16(0x0300).U32(static_cast<std::uint32_t>(9 + records.b.size() / 2));
  head.U16(2).U32(6).U16(0);
  return head.Add(records.b).b;
}

// The TIFF block of an EXIF segment: the first directory with a camera name, the orientation
// (6) and a pointer to a second directory holding the capture date, in either byte order.
Bytes Exif(bool bigEndian) {
  Bytes b;
  auto u16 = [&](unsigned v) {
    const std::uint8_t hi = static_cast<std::uint8_t>(v >> 8), lo = static_cast<std::uint8_t>(v);
    b.insert(b.end(), bigEndian ? std::initializer_list<std::uint8_t>{hi, lo}
                                : std::initializer_list<std::uint8_t>{lo, hi});
  };
  auto u32 = [&](std::uint32_t v) {
    if (bigEndian) {
      u16(v >> 16);
      u16(v & 0xFFFF);
    } else {
      u16(v & 0xFFFF);
      u16(v >> 16);
    }
  };
  auto entry = [&](unsigned tag, unsigned type, std::uint32_t count, std::uint32_t value) {
    u16(tag);
    u16(type);
    u32(count);
    if (type == 3) {
      u16(value);
      u16(0);
    } else {
      u32(value);
    }
  };
  u16(bigEndian ? 0x4D4D : 0x4949);
  u16(42);
  u32(8);
  u16(3);                   // 8: the first directory
  entry(0x010F, 2, 8, 50);  // Make, at 50
  entry(0x0112, 3, 1, 6);   // Orientation
  entry(0x8769, 4, 1, 58);  // the EXIF directory, at 58
  u32(0);                   // 46: no second picture
  // 50: the camera name; 58: the EXIF directory.
  for (char c : std::string("Camera\0\0", 8)) b.push_back(static_cast<std::uint8_t>(c));
  u16(1);
  entry(0x9003, 2, 20, 76);  // DateTimeOriginal, at 76
  u32(0);
  for (char c : std::string("2026:12:07 03:00:00")) b.push_back(static_cast<std::uint8_t>(c));
  b.push_back(0);
  return b;
}

// The frame header of a JPEG file rewritten to announce width by height.
Bytes WithJpegFrameSize(Bytes file, unsigned width, unsigned height) {
  for (std::size_t i = 2; i + 9 < file.size(); ++i) {
    if (file[i] == 0xFF && (file[i + 1] == 0xC0 || file[i + 1] == 0xC2 || file[i + 1] == 0xC9 ||
                            file[i + 1] == 0xCA)) {
      file[i + 5] = static_cast<std::uint8_t>(height >> 8);
      file[i + 6] = static_cast<std::uint8_t>(height);
      file[i + 7] = static_cast<std::uint8_t>(width >> 8);
      file[i + 8] = static_cast<std::uint8_t>(width);
      break;
    }
  }
  return file;
}

// A GIF with a 4-colour table whose first frame (width by height at left, top on a screen of
// screenWidth by screenHeight) holds the given literal indices, with a minimum code size of
// codeSize; the frame may announce far more pixels than it holds.
Bytes GifFrame(unsigned screenWidth, unsigned screenHeight, unsigned left, unsigned top,
               unsigned width, unsigned height, int codeSize, const Bytes& indices) {
  Writer w;
  for (char c : std::string("GIF89a")) w.U8(static_cast<unsigned char>(c));
  w.U16(screenWidth).U16(screenHeight).U8(0xF1).U8(0).U8(0);
  w.U8(255).U8(0).U8(0).U8(0).U8(255).U8(0).U8(0).U8(0).U8(255).U8(255).U8(255).U8(255);
  w.U8(0x2C).U16(left).U16(top).U16(width).U16(height).U8(0).U8(static_cast<unsigned>(codeSize));
  const unsigned clear = 1u << codeSize;
  const int bitsPerCode = codeSize + 1;
  Bytes data;
  std::uint32_t acc = 0;
  int bits = 0;
  const auto emit = [&](unsigned code) {
    acc |= code << bits;
    for (bits += bitsPerCode; bits >= 8; bits -= 8, acc >>= 8) data.push_back(acc & 0xFF);
  };
  for (std::size_t i = 0; i < indices.size(); ++i) {
    if (i % 2 == 0) emit(clear);
    emit(indices[i]);
  }
  emit(clear + 1);
  if (bits > 0) data.push_back(acc & 0xFF);
  for (std::size_t at = 0; at < data.size(); at += 255) {
    const std::size_t n = std::min<std::size_t>(255, data.size() - at);
    w.U8(static_cast<unsigned>(n)).Add(Bytes(data.begin() + at, data.begin() + at + n));
  }
  return w.U8(0).U8(0x3B).b;
}

std::uint32_t Crc32(const std::uint8_t* data, std::size_t size) {
  std::uint32_t crc = 0xFFFFFFFFu;
  for (std::size_t i = 0; i < size; ++i) {
    crc ^= data[i];
    for (int k = 0; k < 8; ++k) crc = crc & 1 ? 0xEDB88320u ^ (crc >> 1) : crc >> 1;
  }
  return ~crc;
}

// A gray PNG announcing width by height around idatSize bytes of picture data.
Bytes ShortPng(std::uint32_t width, std::uint32_t height, std::size_t idatSize) {
  Bytes file = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
  const auto chunk = [&](const char* type, const Bytes& body) {
    const auto big32 = [&](std::uint32_t v) {
      for (int shift = 24; shift >= 0; shift -= 8)
        file.push_back(static_cast<std::uint8_t>(v >> shift));
    };
    big32(static_cast<std::uint32_t>(body.size()));
    const std::size_t start = file.size();
    file.insert(file.end(), type, type + 4);
    file.insert(file.end(), body.begin(), body.end());
    big32(Crc32(file.data() + start, file.size() - start));
  };
  Bytes header;
  for (std::uint32_t v : {width, height})
    for (int shift = 24; shift >= 0; shift -= 8)
      header.push_back(static_cast<std::uint8_t>(v >> shift));
  header.insert(header.end(), {8, 0, 0, 0, 0});
  chunk("IHDR", header);
  Bytes idat = {0x78, 0x9C};
  idat.resize(idatSize, 0);
  chunk("IDAT", idat);
  chunk("IEND", {});
  return file;
}

void Save(const std::filesystem::path& folder, const std::string& family, int index,
          const Bytes& bytes) {
  std::filesystem::create_directories(folder / family);
  std::ofstream out(folder / family / ("seed-" + std::to_string(index)), std::ios::binary);
  out.write(reinterpret_cast<const char*>(bytes.data()),
            static_cast<std::streamsize>(bytes.size()));
  if (!out) throw std::runtime_error("cannot write into " + folder.string());
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: " << argv[0] << " <seed folder>\n";
    return 2;
  }
  try {
    namespace c = quillane::codecs;
    const std::filesystem::path folder = argv[1];
    const Bitmap32 picture = Pattern(24, 16);

    Save(folder, "jpeg", 0, c::EncodeJpeg(picture, 90));
    Save(folder, "jpeg", 1, Jpeg(3, true));
    Save(folder, "jpeg", 2, Jpeg(1, false));
    Save(folder, "jpeg", 3, Jpeg(4, false));
    // A phone's portrait photo: EXIF first, then the picture.
    const Bytes exif[] = {Exif(false), Exif(true)};
    Bytes tagged = c::EncodeJpeg(picture, 90);
    Bytes app1 = {0xFF, 0xE1, 0, static_cast<std::uint8_t>(exif[0].size() + 8), 'E', 'x', 'i',
                  'f',  0,    0};
    app1.insert(app1.end(), exif[0].begin(), exif[0].end());
    tagged.insert(tagged.begin() + 2, app1.begin(), app1.end());
    Save(folder, "jpeg", 4, tagged);
    Save(folder, "exif", 0, exif[0]);
    Save(folder, "exif", 1, exif[1]);

    c::MemorySink bmp24;
    c::EncodeBitmap24(picture, bmp24);
    Save(folder, "bmp", 0, bmp24.bytes());
    const Bytes palette = {0, 0, 0, 0, 0, 0, 255, 0, 0, 255, 0, 0, 255, 0, 0, 0};
    Save(folder, "bmp", 1, Bmp(InfoHeader(3, 2, 8, 0, 4), palette, {0, 1, 0, 0, 1, 2, 3, 0}));
    Save(folder, "bmp", 2,
         Bmp(InfoHeader(3, 2, 8, 1, 4), palette, {1, 0, 1, 1, 1, 0, 0, 0, 0, 3, 1, 2, 3, 0, 0, 1}));
    Save(folder, "bmp", 3,
         Bmp(InfoHeader(3, -2, 4, 2, 4), palette, {3, 0x01, 0, 0, 0, 3, 0x12, 0x30, 0, 1}));
    Save(folder, "bmp", 4,
         Bmp(InfoHeader(3, 2, 16, 3, 0), {0, 0xF8, 0, 0, 0xE0, 7, 0, 0, 0x1F, 0, 0, 0},
             {0, 0, 0, 0xF8, 0, 0, 0, 0, 0, 0xF8, 0xE0, 7, 0x1F, 0, 0, 0}));
    Save(folder, "bmp", 5,
         Bmp(InfoHeader(9, 2, 1, 0, 2), {0, 0, 0, 0, 255, 255, 255, 0},
             {0xA5, 0x80, 0, 0, 0x5A, 0x00, 0, 0}));

    Save(folder, "ico", 0, Ico());
    Save(folder, "gif", 0, Gif(false, false));
    Save(folder, "gif", 1, Gif(true, true));
    Save(folder, "wmf", 0, Wmf());
    Save(folder, "png", 0, c::EncodePng(picture));
    Save(folder, "png", 1, c::EncodePng(Pattern(3, 2)));

    c::MemorySink emf;
    c::EncodeEnhancedMetafile(picture, emf);
    Save(folder, "emf", 0, emf.bytes());
    c::MemorySink tiny;
    c::EncodeEnhancedMetafile(Pattern(3, 2), tiny);
    Save(folder, "emf", 1, tiny.bytes());
    Save(folder, "emf", 2, VectorEmf(tiny.bytes()));

    // Headers announcing far more than the files hold, and the codings the size checks treat
    // apart: each decoder must refuse these from its own evidence, before its pixel limit.
    Save(folder, "jpeg", 4, Jpeg(3, false, true));
    Save(folder, "jpeg", 5, Jpeg(3, true, true));
    Save(folder, "jpeg", 6, WithJpegFrameSize(Jpeg(3, false, true), 16000, 16000));
    Save(folder, "jpeg", 7, WithJpegFrameSize(Jpeg(3, true, true), 16384, 16384));
    Save(folder, "jpeg", 8, Jpeg(3, true, true, true));
    Save(folder, "jpeg", 9, WithJpegFrameSize(Jpeg(1, true), 8000, 8000));
    Save(folder, "bmp", 6, Bmp(InfoHeader(16384, 16384, 8, 1, 4), palette, {0, 1}));
    Save(folder, "bmp", 7,
         Bmp(InfoHeader(16384, 16384, 4, 2, 4), palette, {255, 0x12, 0, 2, 255, 255, 0, 1}));
    Save(folder, "gif", 2, GifFrame(12000, 12000, 0, 0, 12000, 12000, 2, {1}));
    Save(folder, "gif", 3, GifFrame(65535, 4096, 0, 0, 65535, 4096, 2, {1, 2}));
    Save(folder, "gif", 4, GifFrame(3, 2, 0, 0, 3, 2, 11, {0, 1, 2, 2, 1, 0}));
    Save(folder, "gif", 5, GifFrame(40, 30, 10, 5, 2, 2, 2, {0, 1, 2, 3}));
    Save(folder, "png", 2, ShortPng(16384, 16384, 100));

    // Standard input: one of each family, told apart by content alone.
    int stdinSeed = 0;
    for (const char* family : {"jpeg", "bmp", "ico", "gif", "png", "wmf", "emf"}) {
      std::ifstream in(folder / family / "seed-0", std::ios::binary);
      Save(folder, "stdin", stdinSeed++,
           Bytes(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()));
    }
  } catch (const std::exception& error) {
    std::cerr << error.what() << "\n";
    return 1;
  }
  return 0;
}
