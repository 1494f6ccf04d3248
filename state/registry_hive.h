#pragma once

// A registry root as a portable value. The Windows build maps it to the
// predefined HKEY roots; the POSIX registry store names its folders after
// HiveFolderName.
enum class RegistryHive {
    None = 0,
    LocalMachine,
    CurrentUser,
    Users,
};
