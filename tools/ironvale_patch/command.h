#pragma once

#include <string>
#include <vector>

// A subcommand of ironvale-patch. Each subcommand file registers itself
// with a static CommandRegistration, so adding one touches no shared file.
using CommandFunction = int (*)(const std::vector<std::string>& args);

struct CommandRegistration {
    CommandRegistration(const char* name, const char* usage, CommandFunction run);
};

// Exit code and message for a wrong command line of a subcommand.
int UsageError(const char* usage);
