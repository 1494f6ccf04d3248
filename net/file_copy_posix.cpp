#include <cstdio>
#include <vector>

#include "base/exception.h"
#include "base/file_stream.h"
#include "net/file_copy.h"

namespace {

const uint32_t kPieceSize = 1024 * 1024;

}  // namespace

bool CopyFileWithProgress(const std::string& source, const std::string& destination, const CopyProgress& progress) {
    FileStream in;
    FileStream out;
    try {
        in.Open(source);
    } catch (const Exception&) {
        return false;
    }
    // Opening the destination fails when it is the source itself (the
    // source's read lock keeps the writer out), before anything is lost.
    try {
        out.Create(destination);
    } catch (const Exception&) {
        return false;
    }
    bool copied = false;
    try {
        const uint64_t total = static_cast<uint64_t>(in.GetLength());
        std::vector<char> buffer(kPieceSize);
        uint64_t done = 0;
        bool going = progress(0, total);
        while (going) {
            const uint32_t count = in.Read(buffer.data(), kPieceSize);
            if (count == 0) {
                copied = true;
                break;
            }
            out.Write(buffer.data(), count);
            done += count;
            going = progress(done, total);
        }
    } catch (const Exception&) {
        copied = false;
    }
    out.Close();
    if (!copied) std::remove(destination.c_str());
    return copied;
}
