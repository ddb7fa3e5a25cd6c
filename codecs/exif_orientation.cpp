#include "codecs/exif_orientation.h"

#include <libexif/exif-data.h>

#include <cstring>
#include <memory>

namespace quillane::codecs {

int ExifOrientation(std::span<const std::uint8_t> app1Payload) {
  static constexpr std::uint8_t kHeader[6] = {'E', 'x', 'i', 'f', 0, 0};
  // libexif goes looking for JPEG markers in anything that does not start with the header; the
  // payload is already the segment, so only a real EXIF block is handed over.
  if (app1Payload.size() < sizeof kHeader ||
      std::memcmp(app1Payload.data(), kHeader, sizeof kHeader) != 0)
    return 1;
  const std::unique_ptr<ExifData, void (*)(ExifData*)> exif(exif_data_new(), exif_data_unref);
  if (!exif) return 1;
  // Read the block as it is: libexif would otherwise "repair" it against the standard, adding
  // and rewriting entries, which is work and risk for a tag we only look at.
  exif_data_unset_option(exif.get(), EXIF_DATA_OPTION_FOLLOW_SPECIFICATION);
  exif_data_load_data(exif.get(), app1Payload.data(), static_cast<unsigned>(app1Payload.size()));
  const ExifEntry* entry = exif_content_get_entry(exif->ifd[EXIF_IFD_0], EXIF_TAG_ORIENTATION);
  if (entry == nullptr || entry->format != EXIF_FORMAT_SHORT || entry->components < 1 ||
      entry->data == nullptr || entry->size < 2)
    return 1;
  const int value = exif_get_short(entry->data, exif_data_get_byte_order(exif.get()));
  return value >= 1 && value <= 8 ? value : 1;
}

}  // namespace quillane::codecs
