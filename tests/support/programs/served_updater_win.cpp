// The updater with its patch location from IRONVALE_TEST_UPDATE_LOCATION.
#include <windows.h>

#include <cstdlib>

#include "app/entry.h"

int WINAPI WinMain(HINSTANCE, HINSTANCE, LPSTR commandLine, int) {
    const char* location = std::getenv("IRONVALE_TEST_UPDATE_LOCATION");
    return RunUpdaterProcess(commandLine != nullptr ? commandLine : "", location != nullptr ? location : "");
}
