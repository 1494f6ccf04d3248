#include "base/registry_hive.h"

const char* RegistryHiveName(RegistryHive hive) {
    switch (hive) {
        case RegistryHive::LocalMachine:
            return "HKEY_LOCAL_MACHINE";
        case RegistryHive::CurrentUser:
            return "HKEY_CURRENT_USER";
        case RegistryHive::Users:
            return "HKEY_USERS";
        case RegistryHive::None:
            break;
    }
    return "";
}
