#pragma once

#include <string>
#include <vector>

// A console program run to its end with text on its standard input (the
// answers to its questions), its standard output and error captured.
struct ConsoleRun {
    int exitCode = -1;  // -1 when it did not start or did not end normally
    std::string output;
};
ConsoleRun RunConsoleProgram(const std::string& program, const std::vector<std::string>& arguments,
                             const std::string& input, const std::string& workingFolder = "");
