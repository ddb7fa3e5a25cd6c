// Running an effect on a document: the one way OK, batch conversion and the command line do it.
#pragma once

#include <cstdint>
#include <memory>

#include "document/document.h"
#include "effects/registry.h"

namespace quillane {

// Runs effect's routine with params over its defaults (source and working picture in) and
// makes the result the working picture; then, when recordHistory, the history step. Whatever
// the routine throws passes on with the document unchanged. Throws std::invalid_argument when
// the effect has no routine yet.
void RunEffect(PictureDocument& document, const EffectSpec& effect, const EffectParams& params,
               bool recordHistory);

// The same in three steps, so the routine can run on another thread while the document's owner
// goes on (painting a window, or loading the next picture of a batch): taken from the document
// (or from a picture about to be loaded into it), computed without touching any document, then
// landed on the document as RunEffect would have.
class EffectRun {
 public:
  // Throws std::invalid_argument when the effect has no routine yet.
  EffectRun(const PictureDocument& document, const EffectSpec& effect, const EffectParams& params);
  // For picture loaded as the document's picture (working and source alike), with the random
  // state the document will have then.
  EffectRun(std::shared_ptr<const Bitmap32> picture, std::uint32_t randomState,
            const EffectSpec& effect, const EffectParams& params);

  // Runs the routine; safe on any thread. Throws whatever the routine throws.
  void Compute();
  // The random state the routine started from.
  std::uint32_t StartState() const { return startState_; }
  // Result into the working picture, the random state carried on, and the history step when
  // recordHistory. Only after Compute returned.
  void Land(PictureDocument& document, bool recordHistory);

 private:
  const EffectSpec* effect_;
  EffectParams settings_;
  std::shared_ptr<const Bitmap32> source_;
  std::shared_ptr<const Bitmap32> working_;
  std::uint32_t startState_;
  std::uint32_t random_;
  Bitmap32 result_;
};

}  // namespace quillane
