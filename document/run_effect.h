// Running an effect on a document: the one way OK, batch conversion and the command line do it.
#pragma once

#include "document/document.h"
#include "effects/registry.h"

namespace quillane {

// Runs effect's routine with params over its defaults (source and working picture in) and
// makes the result the working picture; then, when recordHistory, the history step. Whatever
// the routine throws passes on with the document unchanged. Throws std::invalid_argument when
// the effect has no routine yet.
void RunEffect(PictureDocument& document, const EffectSpec& effect, const EffectParams& params,
               bool recordHistory);

}  // namespace quillane
