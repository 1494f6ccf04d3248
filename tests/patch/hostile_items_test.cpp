// Every name of a patch description passes one check before anything is
// written or deleted, in both stages: a hostile item is refused with the
// item in the message, and neither the installation nor anything beside
// it changes, not even what the items before it would have done.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "tools/publisher/archive_writer.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

// One name of every kind the check refuses.
// clang-format off
const char* const kHostileNames[] = {
    "", ".", ".\\", "./.", "a\\..\\b", "..", "\\rooted", "/rooted", "C:\\x", "C:x", "\\\\host\\share\\x",
    "a\\\\b", "*", "dat?", "*.*", "a<b", "a>b", "a|b", "a&#34;b", "a&#9;b", "trailing.", "trailing ", "dir.\\x",
    "CON", "con.txt", "Aux\\x", "nul", "COM1", "lpt9.dat", "prn",
};
// clang-format on

// The updater's own work folder and records, which items may not reach.
const char* const kOwnNames[] = {"tempPatch", "TEMPPATCH\\patched\\x", "PPF.xml", "_ppf.xml", "InstallationData.xml"};

// Where the hostile name goes: the path of each item kind, or the archive
// name of a file item.
const char* const kItems[] = {
    R"(<FileChanges>VICTIM<diff Path="NAME" File="patch0.lzma" /></FileChanges>)",
    R"(<FileChanges>VICTIM<new Path="NAME" File="patch0.lzma" /></FileChanges>)",
    R"(<FileChanges>VICTIM<delete Path="NAME" /></FileChanges>)",
    R"(<FileChanges>VICTIM</FileChanges><DirectoryChanges><new Path="NAME" /></DirectoryChanges>)",
    R"(<FileChanges>VICTIM</FileChanges><DirectoryChanges><delete Path="NAME" /></DirectoryChanges>)",
    R"(<FileChanges>VICTIM<new Path="fine.txt" File="NAME" /></FileChanges>)",
};

std::string Replace(std::string text, const std::string& what, const std::string& with) {
    return text.replace(text.find(what), what.size(), with);
}

class HostileItems : public ::testing::Test {
protected:
    void SetUp() override {
        WriteTree(install,
                  TreeOf("victim.txt=must survive|InstallationData.xml=<InstallationData />|tempPatch/patched/"));
        WriteTree(temp / "outside", TreeOf("keep.txt=beside the game"));
        ArchiveWriter archive(PathJoin(install, "tempPatch/patch0.lzma"));
        archive.AddStoredMember("fine.txt", EncodeLzma("fine"));
        archive.Close();
    }

    // Runs one stage on a description whose first item deletes victim.txt,
    // with the work folders and the record inside the installation.
    void Run(const std::string& items, bool stageOne) {
        WriteTextFile(temp / "patchinfo.xml", "<IronvaleWestPatch>" +
                                                  Replace(items, "VICTIM", R"(<delete Path="victim.txt" />)") +
                                                  "</IronvaleWestPatch>");
        BatchRun run(temp.Path());
        run.work = {install, PathJoin(install, "tempPatch"), PathJoin(install, "tempPatch/patched"), "served",
                    "2",     {"InstallationData.xml"}};
        run.progress.SetDirectory(install);
        stageOne ? run.Prepare() : run.Apply();
    }

    TempFolder temp;
    std::string install = temp / "install";
};

TEST_F(HostileItems, AreRefusedInBothStagesBeforeAnythingChanges) {
    std::vector<std::pair<std::string, std::string>> cases;
    for (const char* item : kItems) {
        for (const char* name : kHostileNames) cases.emplace_back(item, name);
    }
    // Archive names lie in the work folder anyway.
    for (size_t item = 0; item + 1 < std::size(kItems); ++item) {
        for (const char* name : kOwnNames) cases.emplace_back(kItems[item], name);
    }
    for (const auto& [item, name] : cases) {
        for (const bool stageOne : {true, false}) {
            SCOPED_TRACE(Replace(item, "NAME", name) + (stageOne ? " in stage one" : " in stage two"));
            try {
                Run(Replace(item, "NAME", name), stageOne);
                ADD_FAILURE() << "accepted";
            } catch (const Exception& error) {
                EXPECT_EQ(error.code, 0);
                EXPECT_NE(error.message.find("Unsafe path in patch description"), std::string::npos) << error.message;
            }
            EXPECT_EQ(ReadTextFile(PathJoin(install, "victim.txt")), "must survive");
            EXPECT_EQ(ReadTextFile(temp / "outside/keep.txt"), "beside the game");
            EXPECT_FALSE(PathExists(PathJoin(install, "PPF.xml")));
            std::vector<std::string> prepared;
            CollectFiles(PathJoin(install, "tempPatch/patched"), prepared);
            EXPECT_TRUE(prepared.empty());
        }
    }
}

// Names that only look like the refused ones are ordinary files.
TEST_F(HostileItems, LookAlikesAreOrdinaryNames) {
    for (const char* name :
         {"console.txt", "COM10.dat", "lpt.txt", "a.b.c", "with space.txt", ".hidden", "x..y", "deep\\er/mixed"}) {
        SCOPED_TRACE(name);
        Run(Replace(kItems[1], "NAME", name), false);
        EXPECT_FALSE(PathExists(PathJoin(install, "victim.txt")));
        WriteTextFile(PathJoin(install, "victim.txt"), "must survive");
    }
}

}  // namespace
