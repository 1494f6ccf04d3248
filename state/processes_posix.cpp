#include <spawn.h>
#include <sys/wait.h>

#include <fstream>
#include <iterator>
#include <vector>

#include "base/command_line.h"
#include "base/paths.h"
#include "state/processes.h"

extern char** environ;

int32_t RunProcess(const std::string& programPath, const std::string& parameters, bool wait) {
    // The words the program's C runtime would read on Windows.
    std::vector<std::string> words = SplitArguments(parameters);
    std::string program = programPath;
    if (program.empty()) {
        if (words.empty()) return -1;
        program = words.front();
        words.erase(words.begin());
    }
    std::vector<char*> argv{program.data()};
    for (std::string& word : words) argv.push_back(word.data());
    argv.push_back(nullptr);

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    const std::string folder = GetParentDirectory(program);
    if (!folder.empty()) posix_spawn_file_actions_addchdir_np(&actions, folder.c_str());
    pid_t child = 0;
    const int started = posix_spawn(&child, program.c_str(), &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (started != 0) return -1;
    if (!wait) return 0;
    int status = 0;
    if (waitpid(child, &status, 0) != child) return -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

// There is no elevation prompt here: the rights checks take their roads
// for a system without one, and a request to elevate fails.
int32_t RunElevated(const std::string&, const std::string&) { return -1; }

std::string GetOwnCommandLine() {
    std::ifstream in("/proc/self/cmdline", std::ios::binary);
    const std::string raw((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    std::vector<std::string> words;
    size_t start = 0;
    while (start < raw.size()) {
        const size_t end = raw.find('\0', start);
        words.push_back(raw.substr(start, end - start));
        if (end == std::string::npos) break;
        start = end + 1;
    }
    return JoinCommandLine(words);
}
