// run_elevated PROGRAM [ARGUMENT...]: starts the program through the updater's own RunElevated (the shell's "runas"),
// waits for it and ends with its exit code.
#include <string>

#include "state/processes.h"

int main(int argc, char** argv) {
    std::string commandLine;
    for (int i = 1; i < argc; ++i) commandLine += "\"" + std::string(argv[i]) + "\" ";
    return RunElevated(commandLine, "");
}
