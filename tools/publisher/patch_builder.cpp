#include "tools/publisher/patch_builder.h"

#include <algorithm>
#include <filesystem>
#include <memory>
#include <system_error>
#include <vector>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"
#include "base/version_order.h"
#include "net/sha256.h"
#include "tools/publisher/archive_writer.h"
#include "tools/publisher/delta_maker.h"
#include "tools/publisher/lzma_encoder.h"
#include "tools/publisher/patch_description.h"
#include "tools/publisher/signing_key.h"
#include "tools/publisher/tree_listing.h"

namespace {

const char kPatchBase[] = "patch_515195_";

// Fills archives patch0.lzma, patch1.lzma, ... in the order members come,
// so the applier, which walks the description in the same order, can start
// on the first archive while the rest are still downloading. The names
// begin with "patch" so the updater's clean-up of its patch folder finds
// them.
class ArchivePacker {
public:
    ArchivePacker(std::string archiveFolder, std::string scratch, int64_t maximum)
        : folder(std::move(archiveFolder)), scratchFile(std::move(scratch)), maximumSize(maximum) {}

    // Compresses source as the member called name; returns the archive
    // that holds it.
    std::string Add(const std::string& name, const std::string& source) {
        {
            FileStream input;
            FileStream output;
            input.Open(source);
            output.Create(scratchFile);
            EncodeLzma(input, static_cast<uint64_t>(input.GetLength()), LzmaOptions(),
                       [&output](const uint8_t* data, size_t size) {
                           while (size > 0) {
                               const uint32_t piece = static_cast<uint32_t>(std::min<size_t>(size, 1u << 30));
                               const uint32_t done = output.Write(data, piece);
                               if (done == 0) throw Exception("Failed to write data to file.");
                               data += done;
                               size -= done;
                           }
                       });
        }
        FileStream compressed;
        compressed.Open(scratchFile);
        const int64_t memberSize = 6 + static_cast<int64_t>(name.size()) + compressed.GetLength();
        if (writer && writer->Size() > 0 && writer->Size() + memberSize > maximumSize) Finish();
        if (!writer) {
            archiveName = "patch" + std::to_string(archives.size()) + ".lzma";
            archives.push_back(archiveName);
            writer.reset(new ArchiveWriter(PathJoin(folder, archiveName)));
        }
        writer->AddStoredMember(name, compressed);
        compressed.Close();
        DiscardFile(scratchFile);
        return archiveName;
    }

    // Closes the last archive; returns the bytes of all archives.
    int64_t Finish() {
        if (writer) {
            totalSize += writer->Size();
            writer->Close();
            writer.reset();
        }
        return totalSize;
    }

    // The archives' names, in the order they were started.
    const std::vector<std::string>& Archives() const { return archives; }

private:
    std::string folder;
    std::string scratchFile;
    int64_t maximumSize;
    std::unique_ptr<ArchiveWriter> writer;
    std::string archiveName;
    std::vector<std::string> archives;
    int64_t totalSize = 0;
};

ArchiveRecord DescribeArchive(const std::string& folder, const std::string& name) {
    ArchiveRecord record;
    record.file = name;
    Sha256Digest digest{};
    if (!Sha256OfFile(PathJoin(folder, name), digest, record.size)) {
        throw Exception("Cannot read back " + PathJoin(folder, name));
    }
    record.sha256 = HexDigits(digest.data(), digest.size());
    return record;
}

void RemoveTree(const std::string& path) {
    std::error_code ignored;
    std::filesystem::remove_all(ToFileSystemPath(path), ignored);
}

void Report(const BuildOptions& options, size_t done, size_t total, const char* what, const std::string& path) {
    if (options.progress == nullptr) return;
    *options.progress << "[" << done << "/" << total << "] " << what << " " << path << std::endl;
}

// Fills description and the archives in folder.
void BuildInto(const BuildOptions& options, const std::string& folder, const std::string& scratch,
               PatchDescription& description) {
    const bool complete = options.fromDir.empty();
    const TreeListing newTree = ListTree(options.toDir);
    const TreeListing oldTree = complete ? TreeListing() : ListTree(options.fromDir);
    if (!complete && !IsXdelta3Available(options.xdelta3)) {
        throw Exception("Cannot run " + options.xdelta3 + ": is xdelta3 installed and on the PATH?");
    }

    std::vector<std::string> changed;
    std::vector<std::string> added;
    for (const auto& file : newTree.files) {
        const auto old = oldTree.files.find(file.first);
        if (old == oldTree.files.end()) {
            added.push_back(file.first);
        } else if (old->second != file.second ||
                   !SameFileContent(PathJoin(options.fromDir, file.first), PathJoin(options.toDir, file.first))) {
            changed.push_back(file.first);
        }
    }

    ArchivePacker packer(folder, PathJoin(scratch, "member.lzma"), options.maxArchiveSize);
    const std::string deltaFile = PathJoin(scratch, "delta.vcdiff");
    const size_t total = changed.size() + added.size();
    size_t done = 0;
    // What the updater writes besides the archives: every rebuilt and new
    // file, and the one delta it extracts at a time.
    int64_t filesSize = 0;
    int64_t largestDelta = 0;
    for (const std::string& path : changed) {
        Report(options, ++done, total, "diff", path);
        MakeCheckedDelta(PathJoin(options.fromDir, path), PathJoin(options.toDir, path), deltaFile,
                         PathJoin(scratch, "rebuilt"), options.xdelta3);
        {
            FileStream delta;
            delta.Open(deltaFile);
            largestDelta = std::max(largestDelta, delta.GetLength());
        }
        description.diffFiles.emplace_back(path, packer.Add(path, deltaFile));
        DiscardFile(deltaFile);
        filesSize += static_cast<int64_t>(newTree.files.at(path));
    }
    for (const std::string& path : added) {
        Report(options, ++done, total, "new", path);
        description.newFiles.emplace_back(path, packer.Add(path, PathJoin(options.toDir, path)));
        filesSize += static_cast<int64_t>(newTree.files.at(path));
    }
    const int64_t archivesSize = packer.Finish();
    for (const std::string& archive : packer.Archives())
        description.archives.push_back(DescribeArchive(folder, archive));
    description.version = options.version;
    description.fromVersion = options.fromVersion;

    for (const auto& file : oldTree.files) {
        if (newTree.files.count(file.first) == 0) description.deletedFiles.push_back(file.first);
    }
    // Deepest first, though deleting a folder also deletes what it holds.
    for (auto folderPath = oldTree.directories.rbegin(); folderPath != oldTree.directories.rend(); ++folderPath) {
        if (newTree.directories.count(*folderPath) == 0) description.deletedDirectories.push_back(*folderPath);
    }
    // Parents first. Every folder a new file lands in is new here unless it
    // exists already, so the applier's moves always find their folder.
    for (const std::string& folderPath : newTree.directories) {
        if (oldTree.directories.count(folderPath) == 0) description.newDirectories.push_back(folderPath);
    }
    description.hive = options.hive;
    description.registryPath = options.registryPath;
    // Bytes the update writes to the disk: the downloaded archives, the
    // rebuilt and new files prepared beside the installation, and the
    // largest delta, which is unpacked next to the archives while its file
    // is rebuilt.
    description.spaceRequirement = archivesSize + filesSize + largestDelta;
}

// A patch written into the tree it describes would list its own archives.
void CheckOutsideTree(const std::string& outDir, const std::string& tree) {
    if (tree.empty()) return;
    std::error_code error;
    const auto out = std::filesystem::weakly_canonical(ToFileSystemPath(outDir), error);
    const auto root = std::filesystem::weakly_canonical(ToFileSystemPath(tree), error);
    if (error) return;  // ListTree reports an unreadable tree
    auto outPart = out.begin();
    for (auto rootPart = root.begin(); rootPart != root.end(); ++rootPart, ++outPart) {
        if (rootPart->empty()) break;  // a trailing separator
        if (outPart == out.end() || *outPart != *rootPart) return;
    }
    throw Exception("The output folder " + outDir + " lies inside the game tree " + tree);
}

}  // namespace

std::string PatchFolderName(const std::string& version) { return kPatchBase + version; }

std::string BuildFolderName(const std::string& version) { return "build_" + version; }

void CheckVersionText(const std::string& version) {
    if (version.empty() || version.size() > 64 || version.find_first_of(" \t\r\n\\/:*?\"<>|") != std::string::npos ||
        version == "." || version == ".." || version == "-1") {
        throw Exception("Not a usable version text: \"" + version + "\"");
    }
}

void CheckVersionFollows(const std::string& site, const std::string& version) {
    std::string text;
    if (!ReadFileBytes(PathJoin(site, "version.txt"), 1024, text)) return;
    const std::string published = FirstWord(text);
    if (IsOlderVersion(version, published)) {
        throw Exception("The updater would not take version " + version + " for newer than the published " + published +
                        ".");
    }
}

std::string BuildPatch(const BuildOptions& options) {
    CheckVersionText(options.version);
    CheckVersionFollows(options.outDir, options.version);
    if (options.maxArchiveSize <= 0) throw Exception("The maximum archive size must be positive.");
    const bool complete = options.fromDir.empty();
    if (!options.fromVersion.empty()) {
        if (complete) throw Exception("A complete build starts from no version.");
        CheckVersionText(options.fromVersion);
    } else if (!complete && options.signingKey != nullptr) {
        throw Exception("A signed patch names the version it starts from (--from-version).");
    }
    CheckOutsideTree(options.outDir, options.fromDir);
    CheckOutsideTree(options.outDir, options.toDir);
    const std::string name = complete ? BuildFolderName(options.version) : PatchFolderName(options.version);
    const std::string finalFolder = PathJoin(options.outDir, name);
    const std::string folder = finalFolder + ".partial";
    const std::string scratch = finalFolder + ".scratch";
    RemoveTree(folder);
    RemoveTree(scratch);
    if (!MakeDirectories(folder) || !MakeDirectories(scratch)) throw Exception("Cannot create " + folder);
    try {
        PatchDescription description;
        BuildInto(options, folder, scratch, description);
        WritePatchDescription(description, PathJoin(folder, "patchinfo.xml"));
        // Signed before it is published: a server never holds the new
        // description without its signature.
        if (options.signingKey != nullptr) SignPatchDescription(folder, *options.signingKey);
        RemoveTree(scratch);
        RemoveTree(finalFolder);
        std::error_code error;
        std::filesystem::rename(ToFileSystemPath(folder), ToFileSystemPath(finalFolder), error);
        if (error) throw Exception("Cannot rename " + folder + " to " + finalFolder + ": " + error.message());
    } catch (...) {
        RemoveTree(folder);
        RemoveTree(scratch);
        throw;
    }
    return finalFolder;
}
