// PatchInfoFile::Load and every cursor on arbitrary files.
#include <cstdint>
#include <string>

#include "base/exception.h"
#include "patch/patch_info_file.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string path = WriteFuzzFile("patchinfo.xml", data, size);
    PatchInfoFile info;
    try {
        info.Load(path);
    } catch (const Exception&) {
        return 0;
    }
    info.ResetIterators();
    std::string item;
    std::string archive;
    while (info.NextDiffFile(item, archive)) {
    }
    while (info.NextNewFile(item, archive)) {
    }
    while (info.NextDeletedFile(item) || info.NextDeletedDirectory(item) || info.NextNewDirectory(item) ||
           info.NextDeletedRegistryKey(item) || info.NextNewRegistryKey(item) || info.NextDeletedRegistryGroup(item) ||
           info.NextNewRegistryGroup(item)) {
    }
    info.CountFileAndDirectoryChanges();
    return 0;
}
