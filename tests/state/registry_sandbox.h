#pragma once

#include <string>

// A corner of the registry that belongs to one test: a key path that no
// hive holds yet, and a user SID whose hive a test may write under
// HKEY_USERS. Everything written there is removed when the sandbox goes.
// Natively the store's root is a fresh temporary folder; under Windows the
// real registry is used, with a key name unique to the process.
class RegistrySandbox {
public:
    RegistrySandbox();
    RegistrySandbox(const RegistrySandbox&) = delete;
    RegistrySandbox& operator=(const RegistrySandbox&) = delete;
    ~RegistrySandbox();

    const std::string& KeyPath() const { return keyPath; }
    const std::string& UserSid() const { return userSid; }

private:
    std::string keyPath;
    std::string userSid;
    std::string root;
    std::string previousRoot;
    bool hadPreviousRoot = false;
};
