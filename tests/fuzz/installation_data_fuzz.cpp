// InstallationData::Load on arbitrary files.
#include <cstdint>
#include <string>

#include "base/exception.h"
#include "state/installation_data.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    WriteFuzzFile("InstallationData.xml", data, size);
    InstallationData installation;
    try {
        installation.Load(FuzzFolder());
    } catch (const Exception&) {
    }
    return 0;
}
