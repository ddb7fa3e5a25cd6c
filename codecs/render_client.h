// The decoders' side of the metafile renderers (metafile_render.h): finding a renderer program,
// running it under its time limit and taking its reply apart.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"
#include "codecs/metafile_render.h"

namespace quillane::codecs {

// The program named by the environment variable when that is set; otherwise the program beside
// the running one (an installed program), then, for a program running from the build tree, the
// copy built there. "" when none can run.
std::string FindRenderer(const char* environmentVariable, const char* programName,
                         const char* builtPath);

struct RendererAnswer {
  metafile_render::Reply reply{};
  std::uint32_t width = 0, height = 0;
  Bitmap32 picture;  // for kPicture
};

// Runs the renderer with the file on its standard input and returns its complete reply; a
// picture of more than maxPixels is refused before its pixels are taken. Throws PictureFileError
// when the program is missing ("The metafile reader is not installed"), was stopped by its limits
// ("The metafile takes too long to draw") or gave no complete reply.
RendererAnswer RunRenderer(const std::string& program, const std::vector<std::string>& arguments,
                           Bytes file, std::int64_t maxPixels);

}  // namespace quillane::codecs
