#pragma once

#include <string>
#include <vector>

// Runs a program found on the search path with the given arguments (the
// first is the program's name) and waits for it. Returns its exit code, or
// -1 when it could not be started at all (not installed, not executable).
// A quiet program's output goes nowhere; otherwise it shares ours.
int RunProgram(const std::vector<std::string>& arguments, bool quiet = false);
