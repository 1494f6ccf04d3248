#pragma once

// A registry root as a portable value. The Windows build maps it to the
// predefined HKEY roots; the POSIX registry store names its folders after
// RegistryHiveName.
enum class RegistryHive {
    None = 0,
    LocalMachine,
    CurrentUser,
    Users,
};

// "HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER" or "HKEY_USERS"; empty for None.
const char* RegistryHiveName(RegistryHive hive);
