// PatchProgressFile::LoadRecord on arbitrary files.
#include <cstdint>
#include <string>

#include "base/exception.h"
#include "patch/patch_progress_file.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string path = WriteFuzzFile("PPF.xml", data, size);
    PatchProgressFile record;
    try {
        record.LoadRecord(path);
    } catch (const Exception&) {
    }
    return 0;
}
