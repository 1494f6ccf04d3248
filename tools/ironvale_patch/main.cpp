// ironvale-patch: the publisher's tool for the updater's patch formats.
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "base/exception.h"
#include "tools/ironvale_patch/command.h"

namespace {

struct Command {
    const char* usage;
    CommandFunction run;
};

std::map<std::string, Command>& Commands() {
    static std::map<std::string, Command> commands;
    return commands;
}

int PrintUsage(FILE* out) {
    std::fprintf(out, "usage: ironvale-patch COMMAND ...\n\ncommands:\n");
    for (const auto& entry : Commands()) std::fprintf(out, "  ironvale-patch %s\n", entry.second.usage);
    return out == stdout ? 0 : 2;
}

}  // namespace

CommandRegistration::CommandRegistration(const char* name, const char* usage, CommandFunction run) {
    Commands()[name] = Command{usage, run};
}

int UsageError(const char* usage) {
    std::fprintf(stderr, "usage: ironvale-patch %s\n", usage);
    return 2;
}

int main(int argc, char** argv) {
    if (argc < 2) return PrintUsage(stderr);
    if (std::strcmp(argv[1], "--help") == 0 || std::strcmp(argv[1], "help") == 0) return PrintUsage(stdout);
    const auto found = Commands().find(argv[1]);
    if (found == Commands().end()) {
        std::fprintf(stderr, "ironvale-patch: unknown command '%s'\n", argv[1]);
        return PrintUsage(stderr);
    }
    try {
        return found->second.run(std::vector<std::string>(argv + 2, argv + argc));
    } catch (const Exception& error) {
        std::fprintf(stderr, "%s\n", error.message.c_str());
        return 1;
    }
}
