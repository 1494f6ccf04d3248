#pragma once

#include <cstdint>
#include <string>

// Starting other programs: the game at the end of a run, the game's
// executable for the component removal, and an elevated copy of the
// updater.

// Starts programPath (when empty, the first word of parameters) with
// parameters, in the program's own folder. -1 when it cannot be started;
// otherwise its exit code when wait is set, else 0. A program still
// running after the wait is ended with code 0.
int32_t RunProcess(const std::string& programPath, const std::string& parameters, bool wait);

// Starts the program with the system's elevation prompt ("runas") and
// waits for it: its exit code, or -1 when it cannot be started (the player
// declined, or the platform cannot elevate).
int32_t RunElevated(const std::string& parameters, const std::string& programPath);

// This process's command line as the system keeps it, program first.
std::string GetOwnCommandLine();

// What RunElevated starts. With an empty programPath the first word of
// parameters is the program and every further word is passed quoted and
// followed by one space ("w1" "w2" ), so words with blanks survive.
struct ProgramCall {
    std::string program;
    std::string parameters;
};
ProgramCall ElevatedCall(const std::string& parameters, const std::string& programPath);

// The game's command line: the configured parameters, then " +sessionId ",
// " +dataCenters " and " +webSiteHostName " each with its value, for each
// value that is not empty, quoted as one argument (QuoteArgument).
std::string GameParameters(const std::string& configured, const std::string& sessionId, const std::string& dataCenters,
                           const std::string& hostName);

// The edition sold through Steam has "GDFBinary.dll" in its folder; this
// updater must not patch it.
bool IsSteamEdition(const std::string& installDir);
