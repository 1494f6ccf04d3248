// ironvale-patch decode SOURCE DELTA TARGET: rebuilds TARGET from SOURCE and
// a VCDIFF delta, exactly as the updater does when it patches a file.
#include "base/file_stream.h"
#include "patch/vcdiff_decoder.h"
#include "tools/ironvale_patch/command.h"

namespace {

constexpr char kUsage[] = "decode SOURCE DELTA TARGET";

int RunDecode(const std::vector<std::string>& args) {
    if (args.size() != 3) return UsageError(kUsage);
    FileStream source;
    FileStream delta;
    FileStream target;
    source.Open(args[0]);
    delta.Open(args[1]);
    target.Create(args[2]);
    VcdiffDecoder::Decode(&source, &delta, &target);
    return 0;
}

const CommandRegistration registration("decode", kUsage, RunDecode);

}  // namespace
