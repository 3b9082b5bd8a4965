// A bare X server (Xvfb) runs no window manager, so the atoms that a desktop's window
// manager announces do not exist there, and JUCE 7 sends None in their place when it
// sets up a window, which the server rejects. Interning them here stands in for the
// window manager. The connection stays open so that the server does not reset (and
// forget the atoms) before the test's own windows connect.

#include <X11/Xlib.h>

namespace veltrane::test
{

void internWindowManagerAtoms()
{
    static Display* const display = XOpenDisplay (nullptr);

    if (display == nullptr)
        return;

    const char* const names[] {
        "WM_PROTOCOLS", "WM_TAKE_FOCUS", "WM_DELETE_WINDOW", "WM_CHANGE_STATE", "WM_STATE",
        "_NET_WM_PING", "_NET_WM_WINDOW_TYPE", "_NET_WM_WINDOW_TYPE_NORMAL", "_NET_WM_WINDOW_TYPE_COMBO",
        "_NET_WM_STATE", "_NET_WM_STATE_HIDDEN", "_NET_WM_STATE_FULLSCREEN", "_NET_FRAME_EXTENTS",
        "_NET_WORKAREA", "_MOTIF_WM_HINTS", "_NET_WM_ALLOWED_ACTIONS", "_NET_WM_ACTION_RESIZE",
        "_NET_WM_ACTION_FULLSCREEN", "_NET_WM_ACTION_MINIMIZE", "_NET_WM_ACTION_CLOSE",
    };

    for (const auto* name : names)
        XInternAtom (display, name, False);

    XSync (display, False);
}

} // namespace veltrane::test
