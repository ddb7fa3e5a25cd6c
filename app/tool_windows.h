// Creates the seventeen tool windows once, hidden, for the whole run.
#pragma once

namespace quillane {

class TMyPicture;

// Each window becomes a child of main and is registered under its tool number. A window with
// behaviour of its own is made by its effect's factory; the others are the generic tool window.
void CreateToolWindows(TMyPicture& main);

}  // namespace quillane
