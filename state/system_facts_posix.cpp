#include <sys/stat.h>
#include <unistd.h>

#include "state/configuration.h"
#include "state/registry_manager.h"
#include "state/system_facts.h"

// No UAC, no token elevation and no Windows version numbers here; rights
// mean being able to write where the update writes.

bool IsUacEnabled() { return false; }

int32_t GetElevationType() { return 0; }

bool IsAdministrator() {
    if (::geteuid() == 0) return true;
    Configuration configuration;
    configuration.SetDefaults();
    RegistryManager registry;
    if (!registry.Locate(configuration.GetRegistryKey(), std::string())) return false;
    return ::access(registry.GetInstallDir().c_str(), W_OK) == 0;
}

bool IsPowerUser() { return false; }

bool ReadOsVersion(uint32_t&, uint32_t&) { return false; }

bool ReadProcessOwnerSid(std::array<uint8_t, 6>& authority, std::vector<uint32_t>& subAuthorities) {
    // The Unix user namespace of Windows interoperability: S-1-22-1-<uid>.
    authority = {0, 0, 0, 0, 0, 22};
    subAuthorities = {1, static_cast<uint32_t>(::geteuid())};
    return true;
}
