#include "app/tool_windows.h"

#include <algorithm>
#include <iterator>
#include <string_view>

#include "app/main_window.h"
#include "ui/effects/bw_sketch_window.h"
#include "ui/effects/color_panel_window.h"
#include "ui/effects/preview_window.h"
#include "ui/effects/snapshot_window.h"
#include "ui/effects/texture_window.h"
#include "ui/freehand/painting_window.h"
#include "ui/tool_window.h"

namespace quillane {
namespace {

using ToolWindowFactory = ToolWindow* (*)(const EffectSpec&, ToolHost&, QWidget* parent);

template <typename Window>
ToolWindow* Make(const EffectSpec& spec, ToolHost& host, QWidget* parent) {
  return new Window(spec, host, parent);
}

// The windows with behaviour of their own, by their effect's command-line name.
struct SpecialWindow {
  std::string_view effect;
  ToolWindowFactory make;
};
constexpr SpecialWindow kSpecialWindows[] = {
    {"pencil-sketch", Make<BwSketchWindow>},
    {"color-variety", Make<ColorVarietyWindow>},
    {"color-panel", Make<ColorPanelWindow>},
    {"color-filter", Make<ColorFilterWindow>},
    {"stria", Make<StriaWindow>},
    {"texture", Make<TextureWindow>},
};

}  // namespace

void CreateToolWindows(MainWindow& main) {
  // The freehand windows the drawing styles' "Color up" opens; they go with the main window.
  auto* freehand = new FreehandPainting(main, &main);
  for (const EffectSpec* spec : Effects()) {
    const auto special =
        std::find_if(std::begin(kSpecialWindows), std::end(kSpecialWindows),
                     [&](const SpecialWindow& w) { return w.effect == spec->cliName; });
    const ToolWindowFactory make =
        special != std::end(kSpecialWindows) ? special->make : Make<ToolWindow>;
    ToolWindow* window = make(*spec, main, &main);
    window->hide();
    if (spec->colorUp)
      QObject::connect(window, &ToolWindow::colorUpRequested, freehand, &FreehandPainting::ColorUp);
    main.RegisterToolWindow(window);
  }
}

}  // namespace quillane
