#pragma once

// The process-wide services of the user interface, held by the entry
// point for the main thread: the button hook that shows the system's
// boxes in the player's language, and the drawing library of the window.
// On POSIX, where the console is the user interface, there is nothing to
// set up. The services are process-wide: one object, on the main thread.
class UiServices {
public:
    UiServices() = default;
    UiServices(const UiServices&) = delete;
    UiServices& operator=(const UiServices&) = delete;
    ~UiServices() { Shutdown(); }

    // Relabels the buttons of every box the calling (main) thread shows.
    void InstallMessageBoxHook();
    // GDI+, needed before the window's pictures and fonts are made.
    void StartGraphics();
    // Deletes the cached fonts, removes the hook and shuts GDI+ down, in
    // this order; later calls do nothing.
    void Shutdown();
};
