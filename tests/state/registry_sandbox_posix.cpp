#include <unistd.h>

#include <cstdlib>
#include <string>

#include "base/paths.h"
#include "registry_sandbox.h"

RegistrySandbox::RegistrySandbox() {
    std::string pattern = GetTempDirectory() + "ironvale-registry-XXXXXX";
    if (::mkdtemp(&pattern[0]) != nullptr) root = pattern;
    const char* previous = std::getenv("IRONVALE_REGISTRY_ROOT");
    hadPreviousRoot = previous != nullptr;
    if (hadPreviousRoot) previousRoot = previous;
    ::setenv("IRONVALE_REGISTRY_ROOT", root.c_str(), 1);
    keyPath = "SOFTWARE\\IronvaleTests\\Game";
    userSid = "S-1-5-21-1111-2222-3333-1001";
}

RegistrySandbox::~RegistrySandbox() {
    if (hadPreviousRoot) {
        ::setenv("IRONVALE_REGISTRY_ROOT", previousRoot.c_str(), 1);
    } else {
        ::unsetenv("IRONVALE_REGISTRY_ROOT");
    }
    if (!root.empty()) DeleteDirectory(root, true);
}
