#pragma once

#include <cstdint>
#include <string>

// The parsed command line. One instance is built at start-up; the Updater
// keeps its own copy for the run.
class UpdaterArguments {
public:
    UpdaterArguments();
    virtual ~UpdaterArguments() = default;

    // Fills the fields from the words of commandLine. Accepts every command
    // line: unknown words are skipped. Always returns true.
    bool Parse(const std::string& commandLine);

    // One line for the log: "Arguments: ServerDeltaTime=...".
    std::string Describe() const;

    int32_t serverDeltaTime = 0;
    bool internallyElevated = false;
    std::string sid;
    std::string sessionId;
    std::string hostName;
    std::string dataCenters;
    std::string latestVersion;
    bool loggedIn = true;
    bool downloadEula = true;
    bool doUninstallCleanup = false;
    bool doRemoveSettings = false;
    bool kdlGlRemove = false;
    bool silent = false;
    bool deleteCorvid = false;
};

// The back-end host name used when the command line names none.
extern const char* const kDefaultHostName;
