#include "document/run_effect.h"

#include <stdexcept>

namespace quillane {

void RunEffect(PictureDocument& document, const EffectSpec& effect, const EffectParams& params,
               bool recordHistory) {
  if (!effect.routine) throw std::invalid_argument(effect.cliName + " is not available yet");
  // Settings a caller left out keep their defaults, so every routine finds all it reads.
  EffectParams settings = effect.Defaults();
  settings.Merge(params);
  document.SetWorking(
      effect.routine({document.Source(), document.Working(), settings, &document.RandomState()}));
  if (recordHistory) document.Backup();
}

}  // namespace quillane
