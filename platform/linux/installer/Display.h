#pragma once

namespace ventras {

/// Whether a window could be shown: the environment names a Wayland or X11 display, and, as far as that is on
/// this computer, its socket is there. Programs for windows tell "no display" and "no" by the same status.
bool isDisplayThere();

}  // namespace ventras
