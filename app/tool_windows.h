// Creates every effect's tool window once, hidden, for the whole run.
#pragma once

namespace quillane {

class MainWindow;

// Each window becomes a child of main and is registered under its tool number. A window with
// behaviour of its own is made by its effect's factory; the others are the generic tool window.
void CreateToolWindows(MainWindow& main);

}  // namespace quillane
