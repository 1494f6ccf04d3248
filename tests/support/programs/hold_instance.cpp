// hold_instance MILLISECONDS
//
// Holds the updater's single-instance guard, prints "held" and keeps it for
// the given time, so a test can start a second updater against it.
#include <windows.h>

#include <cstdio>
#include <cstdlib>

#include "app/single_instance.h"

int main(int argc, char** argv) {
    SingleInstance instance;
    if (!instance.Acquire()) {
        std::fprintf(stderr, "hold_instance: the guard is held elsewhere\n");
        return 1;
    }
    std::printf("held\n");
    std::fflush(stdout);
    Sleep(static_cast<DWORD>(argc > 1 ? std::atoi(argv[1]) : 30000));
    return 0;
}
