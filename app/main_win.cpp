#include <windows.h>

#include "app/entry.h"

int WINAPI WinMain(HINSTANCE, HINSTANCE, LPSTR commandLine, int) {
    return RunUpdaterProcess(commandLine != nullptr ? commandLine : "", kBuiltInUpdateLocation);
}
