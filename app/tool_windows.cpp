#include "app/tool_windows.h"

#include <algorithm>
#include <iterator>

#include "app/main_window.h"
#include "effects/adjust/color_panel_window.h"
#include "effects/adjust/preview_window.h"
#include "effects/mono/bw_sketch_window.h"
#include "effects/surface/snapshot_window.h"
#include "effects/surface/texture_window.h"
#include "freehand/painting_window.h"
#include "ui/tool_window.h"

namespace quillane {
namespace {

using ToolWindowFactory = ToolWindow* (*)(const EffectSpec&, ToolHost&, QWidget* parent);

template <typename Window>
ToolWindow* Make(const EffectSpec& spec, ToolHost& host, QWidget* parent) {
  return new Window(spec, host, parent);
}

// The windows with behaviour of their own, by tool number.
struct SpecialWindow {
  int toolNumber;
  ToolWindowFactory make;
};
constexpr SpecialWindow kSpecialWindows[] = {
    {1, Make<TBack_and_White_Sketch>}, {12, Make<TColor_variety>}, {13, Make<TColor_Panel>},
    {16, Make<TColor_Filter>},         {17, Make<TStria>},         {14, Make<TTexture>},
};

}  // namespace

void CreateToolWindows(TMyPicture& main) {
  // The freehand windows the drawing styles' "Color up" opens; they go with the main window.
  auto* freehand = new FreehandPainting(main, &main);
  for (const EffectSpec* spec : Effects()) {
    const auto special =
        std::find_if(std::begin(kSpecialWindows), std::end(kSpecialWindows),
                     [&](const SpecialWindow& w) { return w.toolNumber == spec->toolNumber; });
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
