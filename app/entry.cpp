#include "app/entry.h"

#include <memory>

#include "app/failure_report.h"
#include "app/language.h"
#include "app/single_instance.h"
#include "app/updater.h"
#include "app/updater_arguments.h"
#include "base/exception.h"
#include "base/log.h"
#include "state/configuration.h"
#include "state/registry_manager.h"
#include "text/localization.h"
#include "ui/message_box.h"
#include "ui/ui_services.h"

const char* const kLogFileName = "IronvaleUpdater.log";

namespace {

void ReportEscapedException(const Exception& error) {
    const FailureReport report = DescribeFailure(error, FailureSite::EntryPoint);
    LogEntry(report.level, "Main", __LINE__).Stream() << report.logLine;
    ShowTitledMessage(report.text, MessageIcon::Error);
}

}  // namespace

int32_t RunUpdaterProcess(const std::string& commandLine, const std::string& updateLocation) {
    Localization::Initialize();
    try {
        Log::Open(kLogFileName);
    } catch (const Exception&) {
        // No temporary folder: the run goes on without a log.
    }
    LOG_AS("Main", Info) << "";
    LOG_AS("Main", Info) << std::string(103, '-');
    LOG_AS("Main", Info) << "WinMain Enter";
    LOG_AS("Main", Info) << "Command line: " << commandLine;

    auto arguments = std::make_unique<UpdaterArguments>();
    arguments->Parse(commandLine);
    {
        // Before any box can appear, so that every later text is in the
        // player's language.
        Configuration configuration;
        configuration.SetDefaults();
        RegistryManager registry;
        registry.Locate(configuration.GetRegistryKey(), arguments->sid);
        SelectStoredLanguage(registry.GetLanguage());
    }
    LOG_AS("Main", Info) << arguments->Describe();

    // The button hook comes first, so that the instance-running box below
    // has its buttons in the player's language too.
    UiServices ui;
    ui.InstallMessageBoxHook();
    SingleInstance instance;
    if (!arguments->internallyElevated && !instance.Acquire()) {
        LOG_AS("Main", Error) << "There is already another updater instance running.";
        ShowTitledMessage(Localize("INSTALLER_INSTANCE_RUNNING"), MessageIcon::Warning);
        return -1;
    }
    ui.StartGraphics();

    int32_t exitCode = -1;
    {
        auto updater = std::make_unique<Updater>(updateLocation);
        try {
            exitCode = updater->Run(*arguments);
        } catch (const Exception& error) {
            ReportEscapedException(error);
        }
        ui.Shutdown();
        instance.Release();
        Log::Close();
    }
    return exitCode;
}
