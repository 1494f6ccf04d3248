#include <windows.h>
// windows.h first: shlwapi.h needs its types.
#include <shlwapi.h>

#include <string>

#include "registry_sandbox.h"

namespace {

const char* const kTestsKey = "SOFTWARE\\IronvaleTests";

}  // namespace

RegistrySandbox::RegistrySandbox() {
    static int counter = 0;
    const std::string unique = std::to_string(GetCurrentProcessId()) + "-" + std::to_string(++counter);
    root = std::string(kTestsKey) + "\\" + unique;
    keyPath = root + "\\Game";
    // A user that is not logged on: its hive exists only for this test.
    userSid = "S-1-5-21-1111-2222-3333-" + unique;
}

RegistrySandbox::~RegistrySandbox() {
    SHDeleteKeyA(HKEY_LOCAL_MACHINE, root.c_str());
    SHDeleteKeyA(HKEY_CURRENT_USER, root.c_str());
    SHDeleteKeyA(HKEY_USERS, userSid.c_str());
    // Leave no empty parent behind once the last test is done.
    RegDeleteKeyA(HKEY_LOCAL_MACHINE, kTestsKey);
    RegDeleteKeyA(HKEY_CURRENT_USER, kTestsKey);
}
