#include <string>
#include <vector>

#include "app/entry.h"
#include "base/command_line.h"

int main(int argc, char** argv) {
    // The Windows program receives one command-line text; rebuild it from
    // the words the shell already split.
    std::vector<std::string> words(argv + 1, argv + argc);
    return RunUpdaterProcess(JoinCommandLine(words), kBuiltInUpdateLocation);
}
