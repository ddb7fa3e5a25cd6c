// How a helper program started by RunHelper (helper_process.h) learns which process started it,
// so that it can end with that process instead of running on after it was killed.
#pragma once

namespace quillane::codecs {

// The environment variable RunHelper gives each child: the starting process's id in decimal.
inline constexpr char kHelperParentVariable[] = "QUILLANE_HELPER_PARENT";

}  // namespace quillane::codecs
