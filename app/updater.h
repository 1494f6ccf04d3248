#pragma once

#include <cstdint>

#include "app/updater_arguments.h"
#include "state/configuration.h"

// The one object that carries a run: it owns every long-lived component
// and carries out the mode the command line selects.
class Updater {
public:
    Updater();
    virtual ~Updater() = default;

    // Carries out one invocation; the result is the process exit code.
    int32_t Run(const UpdaterArguments& args);

private:
    Configuration configuration;
    UpdaterArguments arguments;
};
