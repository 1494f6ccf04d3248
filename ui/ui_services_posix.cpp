#include "ui/ui_services.h"

// The console needs no hook, no drawing library and no fonts.

void UiServices::InstallMessageBoxHook() {}

void UiServices::StartGraphics() {}

void UiServices::Shutdown() {}
