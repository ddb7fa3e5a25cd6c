#include "app/tool_windows.h"

#include "app/main_window.h"
#include "app/tool_window.h"
#include "effects/mono/bw_sketch_window.h"

namespace quillane {

void CreateToolWindows(TMyPicture& main) {
  // The order the windows have always been created in; it decides nothing visible.
  static const int kCreationOrder[] = {6, 7, 8, 1, 2, 3, 14, 4, 5, 9, 10, 11, 12, 13, 15, 16, 17};
  for (int number : kCreationOrder) {
    ToolWindow* window = nullptr;
    switch (number) {
      case 1:
        window = new TBack_and_White_Sketch(main);
        break;
      default:
        window = new ToolWindow(*FindEffect(number), main);
        break;
    }
    window->hide();
    main.RegisterToolWindow(window);
  }
}

}  // namespace quillane
