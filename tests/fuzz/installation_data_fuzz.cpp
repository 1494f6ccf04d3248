// InstallationData::Load on arbitrary files.
#include "state/installation_data.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    WriteFuzzFile("InstallationData.xml", data, size);
    ExpectNoCrash([] { InstallationData().Load(FuzzFolder()); });
    return 0;
}
