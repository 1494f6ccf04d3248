#pragma once

#include <string>

// The corner of the registry a test writes to: keyPath in every hive and the hive of userSid under HKEY_USERS, empty
// when the sandbox starts and cleared when it goes. Natively the store gets a fresh root folder.
struct RegistrySandbox {
    RegistrySandbox();
    ~RegistrySandbox();

    const std::string keyPath = "SOFTWARE\\IronvaleTests\\Game";
    const std::string userSid = "S-1-5-21-1111-2222-3333-1001";
    std::string root;  // of the native store
};
