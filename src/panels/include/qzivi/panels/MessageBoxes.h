// The core's message boxes as Qt shows them: a modal box over the active window, with the
// critical icon for the error boxes and none for a plain note.
#pragma once

namespace qzivi {

// Puts the Qt boxes in as the core's handler, once per program; a test's MessageBoxScope still
// takes precedence for its scope.
void InstallQtMessageBoxes();

} // namespace qzivi
