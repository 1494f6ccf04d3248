#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <iterator>

#include "tests/support/console_run.h"

extern char** environ;

ConsoleRun RunConsoleProgram(const std::string& program, const std::vector<std::string>& arguments,
                             const std::string& input, const std::string& workingFolder) {
    // Files rather than pipes: the program may stop reading its input early.
    char inputPath[] = "/tmp/ivl-input-XXXXXX";
    char outputPath[] = "/tmp/ivl-output-XXXXXX";
    const int inputFile = mkstemp(inputPath);
    const int outputFile = mkstemp(outputPath);
    ConsoleRun run;
    if (inputFile >= 0 && write(inputFile, input.data(), input.size()) == static_cast<ssize_t>(input.size())) {
        lseek(inputFile, 0, SEEK_SET);
        std::vector<std::string> words{program};
        words.insert(words.end(), arguments.begin(), arguments.end());
        std::vector<char*> argv;
        for (std::string& word : words) argv.push_back(word.data());
        argv.push_back(nullptr);
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_adddup2(&actions, inputFile, 0);
        posix_spawn_file_actions_adddup2(&actions, outputFile, 1);
        posix_spawn_file_actions_adddup2(&actions, outputFile, 2);
        if (!workingFolder.empty()) posix_spawn_file_actions_addchdir_np(&actions, workingFolder.c_str());
        pid_t child = 0;
        int status = 0;
        if (posix_spawn(&child, program.c_str(), &actions, nullptr, argv.data(), environ) == 0 &&
            waitpid(child, &status, 0) == child && WIFEXITED(status)) {
            run.exitCode = static_cast<signed char>(WEXITSTATUS(status));
        }
        posix_spawn_file_actions_destroy(&actions);
    }
    std::ifstream output(outputPath, std::ios::binary);
    run.output.assign(std::istreambuf_iterator<char>(output), {});
    close(inputFile);
    close(outputFile);
    unlink(inputPath);
    unlink(outputPath);
    return run;
}
