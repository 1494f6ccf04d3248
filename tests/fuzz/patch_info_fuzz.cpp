// The two XML files of a batch on arbitrary bytes: PatchInfoFile::Load with every cursor, and PatchProgressFile.
#include "patch/patch_info_file.h"
#include "patch/patch_progress_file.h"
#include "tests/fuzz/fuzz_files.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string path = WriteFuzzFile("patchinfo.xml", data, size);
    ExpectNoCrash([&] { PatchProgressFile().LoadRecord(path); });
    ExpectNoCrash([&] {
        PatchInfoFile info;
        info.Load(path);
        info.ResetIterators();
        std::string item, archive;
        while (info.NextDiffFile(item, archive) || info.NextNewFile(item, archive)) {
        }
        while (info.NextDeletedFile(item) || info.NextDeletedDirectory(item) || info.NextNewDirectory(item) ||
               info.NextDeletedRegistryKey(item) || info.NextNewRegistryKey(item) ||
               info.NextDeletedRegistryGroup(item) || info.NextNewRegistryGroup(item)) {
        }
        info.CountFileAndDirectoryChanges();
    });
    return 0;
}
