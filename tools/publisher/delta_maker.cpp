#include "tools/publisher/delta_maker.h"

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "patch/vcdiff_decoder.h"
#include "tools/publisher/run_program.h"
#include "tools/publisher/tree_listing.h"

namespace {

void CheckDelta(const std::string& oldFile, const std::string& newFile, const std::string& deltaFile,
                const std::string& scratchFile) {
    {
        FileStream source;
        FileStream delta;
        FileStream target;
        source.Open(oldFile);
        delta.Open(deltaFile);
        target.Create(scratchFile);
        VcdiffDecoder::Decode(&source, &delta, &target);
    }
    const bool same = SameFileContent(scratchFile, newFile);
    if (!same) throw Exception("The delta made by xdelta3 does not rebuild " + newFile);
}

}  // namespace

bool IsXdelta3Available(const std::string& xdelta3) { return RunProgram({xdelta3, "-V"}, true) == 0; }

void MakeCheckedDelta(const std::string& oldFile, const std::string& newFile, const std::string& deltaFile,
                      const std::string& scratchFile, const std::string& xdelta3) {
    const int code = RunProgram({xdelta3, "-e", "-f", "-A", "-S", "none", "-s", oldFile, newFile, deltaFile});
    if (code < 0) throw Exception("Cannot run " + xdelta3 + ": is xdelta3 installed and on the PATH?");
    if (code != 0) throw Exception(xdelta3 + " failed (exit code " + std::to_string(code) + ") on " + newFile);
    try {
        CheckDelta(oldFile, newFile, deltaFile, scratchFile);
    } catch (const Exception& error) {
        DiscardFile(scratchFile);
        throw Exception("Our decoder rejects the delta for " + newFile + ": " + error.message);
    }
    DiscardFile(scratchFile);
}
