// PatchProgressFile::LoadRecord on arbitrary files.
#include "patch/patch_progress_file.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string path = WriteFuzzFile("PPF.xml", data, size);
    ExpectNoCrash([&] { PatchProgressFile().LoadRecord(path); });
    return 0;
}
