// The updater with its patch location from IRONVALE_TEST_UPDATE_LOCATION.
#include <cstdlib>
#include <string>
#include <vector>

#include "app/entry.h"
#include "base/command_line.h"

int main(int argc, char** argv) {
    const char* location = std::getenv("IRONVALE_TEST_UPDATE_LOCATION");
    return RunUpdaterProcess(JoinCommandLine(std::vector<std::string>(argv + 1, argv + argc)),
                             location != nullptr ? location : "");
}
