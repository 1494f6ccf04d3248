// hold_instance MILLISECONDS: holds the updater's single-instance guard,
// prints "held" and keeps it that long, for a second updater to meet.
#include <windows.h>

#include <cstdio>
#include <cstdlib>

#include "app/single_instance.h"

int main(int argc, char** argv) {
    SingleInstance instance;
    if (!instance.Acquire()) return 1;
    std::printf("held\n");
    std::fflush(stdout);
    Sleep(static_cast<DWORD>(argc > 1 ? std::atoi(argv[1]) : 30000));
    return 0;
}
