// The updater as tests run it against a server of their own: the same
// program, with the location of its patches taken from the environment
// (IRONVALE_TEST_UPDATE_LOCATION) instead of being built in.
#include <windows.h>

#include <cstdlib>

#include "app/entry.h"

int WINAPI WinMain(HINSTANCE, HINSTANCE, LPSTR commandLine, int) {
    const char* location = std::getenv("IRONVALE_TEST_UPDATE_LOCATION");
    return RunUpdaterProcess(commandLine != nullptr ? commandLine : "", location != nullptr ? location : "");
}
