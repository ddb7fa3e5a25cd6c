#include "document/run_effect.h"

#include <stdexcept>

namespace quillane {

namespace {

// Settings a caller left out keep their defaults, so every routine finds all it reads.
EffectParams Settings(const EffectSpec& effect, const EffectParams& params) {
  if (!effect.routine) throw std::invalid_argument(effect.cliName + " is not available yet");
  EffectParams settings = effect.Defaults();
  settings.Merge(params);
  return settings;
}

}  // namespace

EffectRun::EffectRun(const PictureDocument& document, const EffectSpec& effect,
                     const EffectParams& params)
    : effect_(&effect),
      settings_(Settings(effect, params)),
      source_(document.SharedSource()),
      working_(document.SharedWorking()),
      startState_(document.RandomState()),
      random_(startState_) {}

EffectRun::EffectRun(std::shared_ptr<const Bitmap32> picture, std::uint32_t randomState,
                     const EffectSpec& effect, const EffectParams& params)
    : effect_(&effect),
      settings_(Settings(effect, params)),
      source_(picture),
      working_(std::move(picture)),
      startState_(randomState),
      random_(randomState) {}

void EffectRun::Compute() {
  random_ = startState_;
  result_ = effect_->routine({*source_, *working_, settings_, &random_});
}

void EffectRun::Land(PictureDocument& document, bool recordHistory) {
  document.SetWorking(std::move(result_));
  document.RandomState() = random_;
  if (recordHistory) document.Backup();
}

void RunEffect(PictureDocument& document, const EffectSpec& effect, const EffectParams& params,
               bool recordHistory) {
  EffectRun run(document, effect, params);
  run.Compute();
  run.Land(document, recordHistory);
}

}  // namespace quillane
