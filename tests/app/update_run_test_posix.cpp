// Whole runs of the updater as a process of its own, against patches made by the publisher's tool served over
// HTTP on 127.0.0.1, with the player's answers on standard input.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <functional>
#include <regex>
#include <thread>

#include "base/file_operations.h"
#include "base/paths.h"
#include "state/installation_data.h"
#include "state/registry_manager.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/child_process.h"
#include "tests/support/http_test_server.h"
#include "tools/publisher/latest_version.h"
#include "tools/publisher/patch_builder.h"
#include "tools/publisher/signing_key.h"

namespace {

// The game: it notes how it was started.
const char kGame[] = "#!/bin/sh\necho \"$@\" > \"$TMPDIR/started.txt\"\n";

Tree Version(int number) {
    Tree tree = RandomTree(1);
    for (int next = 2; next <= number; ++next) tree = NextVersion(tree, static_cast<unsigned>(next));
    return tree.File("IronvaleGame.exe", kGame);
}

void Edit(const std::string& path, const std::function<void(std::string&)>& change) {
    std::string text = ReadTextFile(path);
    change(text);
    WriteTextFile(path, text);
}

class UpdateRun : public ::testing::Test {
protected:
    // The runs see the test's own registry, temporary folder and server.
    void SetUp() override {
        setenv("IRONVALE_REGISTRY_ROOT", (temp / "registry").c_str(), 1);
        setenv("IRONVALE_TEST_UPDATE_LOCATION", server.Url("/").c_str(), 1);
        EXPECT_TRUE(MakeDirectories(temp / "tmp"));
        EXPECT_TRUE(MakeDirectories(temp / "server"));
        server.ServeFolder("/", temp / "server", {});
        const RegistryManager game(RegistryHive::LocalMachine, "SOFTWARE\\Halvard\\Ironvale");
        game.SetInstallDir(install);
        game.SetLanguage("English");
        RegistryManager(RegistryHive::LocalMachine, "SOFTWARE\\Microsoft\\DirectX")
            .WriteString("Version", "4.09.00.0904");
        Install(Version(1), "1");
    }

    void Install(const Tree& tree, const std::string& version) {
        DiscardDirectory(install);
        WriteTree(install, tree);
        chmod(PathJoin(install, "IronvaleGame.exe").c_str(), 0755);
        SetVersion(version);
    }

    void SetVersion(const std::string& version) {
        WriteTextFile(PathJoin(install, "InstallationData.xml"),
                      "<InstallationData><CurrentVersion>" + version +
                          "</CurrentVersion><PatcherVersion>3</PatcherVersion></InstallationData>");
    }

    std::string InstalledVersion() {
        InstallationData data;
        data.Load(install);
        return data.currentVersion;
    }

    // The patch from tree from (version fromVersion) to tree to, the complete build of to, version.txt; signed with
    // key when given.
    std::string Publish(const Tree& from, const Tree& to, const std::string& version, const P256PrivateKey* key,
                        const std::string& fromVersion = "1") {
        WriteTree(temp / "old", from);
        WriteTree(temp / "new", to);
        BuildOptions options;
        options.fromDir = temp / "old";
        options.toDir = temp / "new";
        options.version = version;
        options.outDir = temp / "server";
        options.maxArchiveSize = 4000;
        options.signingKey = key;
        options.fromVersion = fromVersion;
        const std::string patch = BuildPatch(options);
        options.fromDir.clear();
        options.fromVersion.clear();
        BuildPatch(options);
        WriteTextFile(temp / "server/version.txt", "  " + version + " and more words\n");
        DiscardDirectory(temp / "old");
        DiscardDirectory(temp / "new");
        published = to;
        return patch;
    }

    // The program started in folder (the test's own by default) with its own temporary folder and answers on its
    // input; Run waits for it to end as every run does, with 1, and gives its output.
    ChildProcess Start(const std::string& answers, std::vector<std::string> arguments,
                       const std::string& program = "served_updater", const std::string& folder = "") {
        WriteTextFile(temp / "answers", answers);
        const std::string path = program.find('/') == std::string::npos ? TestProgramPath(program) : program;
        const std::string script =
            "cd \"$0\" && TMPDIR='" + tmp + "' exec \"$@\" <'" + temp / "answers" + "' >'" + temp / "output" + "' 2>&1";
        arguments.insert(arguments.begin(), {"-c", script, folder.empty() ? temp.Path() : folder, path});
        return ChildProcess("/bin/sh", arguments);
    }

    std::string Run(const std::string& answers, const std::vector<std::string>& arguments = {},
                    const std::string& program = "served_updater", const std::string& folder = "") {
        const int code = Start(answers, arguments, program, folder).Wait();
        const std::string output = ReadTextFile(temp / "output");
        EXPECT_EQ(code, 1) << output;
        return output;
    }

    // The installation without the updater's records and work folder.
    Tree Game() {
        Tree tree = ReadTree(install);
        for (const char* own : {"InstallationData.xml", "Uninstall.xml", "UpdateHistory.log"}) tree.files.erase(own);
        for (auto file = tree.files.begin(); file != tree.files.end();) {
            file = file->first.rfind("tempPatch/", 0) == 0 ? tree.files.erase(file) : std::next(file);
        }
        tree.folders.erase(tree.folders.lower_bound("tempPatch"), tree.folders.upper_bound("tempPatch/~"));
        return tree;
    }

    // The game runs on after the updater ended; it gets a moment to show.
    bool GameStarted() {
        for (int wait = 0; wait < 50 && !PathExists(temp / "tmp/started.txt"); ++wait) {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
        }
        return PathExists(temp / "tmp/started.txt");
    }

    // Nothing of the batch is left: no work folder, no record, no description.
    void ExpectNoLeftovers() {
        for (const char* own : {"tempPatch", "PPF.xml", "_PPF.xml"}) {
            EXPECT_FALSE(PathExists(PathJoin(install, own))) << own;
        }
        EXPECT_FALSE(PathExists(temp / "tmp/patchinfo.xml"));
    }

    long ArchiveRequests(size_t from) {
        const std::vector<std::string> requests = server.Requests();
        return std::count_if(requests.begin() + static_cast<std::ptrdiff_t>(from), requests.end(),
                             [](const std::string& head) { return head.find(".lzma") != std::string::npos; });
    }

    Tree published;  // the tree the last patch leads to
    TempFolder temp;
    HttpTestServer server;
    std::string install = temp / "Ironvale";
    std::string tmp = temp / "tmp";  // the program's temporary folder
};

TEST_F(UpdateRun, PatchesToTheLatestVersionAndStartsTheGame) {
    Publish(Version(1), Version(2), "2", nullptr);
    WriteTextFile(PathJoin(install, "Uninstall.xml"), "unreadable");
    Run("y\ny\n");
    EXPECT_EQ(ReadTextFile(PathJoin(install, "Uninstall.xml.bad")), "unreadable");  // kept aside, and a new one begun
    EXPECT_TRUE(RemoveFile(PathJoin(install, "Uninstall.xml.bad")));
    EXPECT_EQ(Game(), Version(2));
    EXPECT_EQ(InstalledVersion(), "2");
    ExpectNoLeftovers();
    const std::string history = ReadTextFile(PathJoin(install, "UpdateHistory.log"));
    EXPECT_EQ(history.substr(history.find(' ', history.find(' ') + 1)), " " + server.Url("/patch_515195_2\r\n"));
    // The new uninstall record lists what the patch added.
    const std::string record = ReadTextFile(PathJoin(install, "Uninstall.xml"));
    for (const auto& file : Version(2).files) {
        if (Version(1).files.count(file.first) == 0) {
            EXPECT_NE(record.find(GetFileName(file.first)), std::string::npos) << file.first;
        }
    }
    EXPECT_EQ(ReadTextFile(temp / "tmp/started.txt"), "+webSiteHostName updates.ironvale-game.com\n");
    // The patch's own addresses carry the signature; the version file's does not.
    for (const std::string& request : server.Requests()) {
        const bool signedRequest = request.find("&h=") != std::string::npos || request.find("?e=") != std::string::npos;
        EXPECT_EQ(signedRequest, request.find("version.txt") == std::string::npos) << request;
    }
}

// Runs that end without the patch, or take it only as the publisher made it: the installation stays as it was,
// nothing is fetched unless the run goes on, the game starts only when the player says so or nothing was to do. A
// file changed since its version was made gets the complete build offered. The plain program judges archives by
// what a description declares; the keyed one also refuses every description not signed by its key for the version
// it asked for, before it fetches a single archive.
TEST_F(UpdateRun, EndsAsThePlayerTheServerAndThePublisherDecide) {
    const P256PrivateKey signer = LoadSigningKey(IRONVALE_BINARY_DIR "/test-key/private.pem");
    const P256PrivateKey other = GenerateSigningKey();
    WriteTree(temp / "older", ReadTree(Publish(Version(1), Version(3), "3", &signer)));
    const std::string patch = temp / "server/patch_515195_2";
    Tree rebuilt = Version(1);  // every file from a delta, so the build laid over 1 gives 2
    for (auto& file : rebuilt.files) {
        if (file.first != "IronvaleGame.exe") file.second += " in version 2";
    }
    rebuilt.File("added/new.txt", "new");
    Tree modded = Version(1);
    modded.files.rbegin()->second = "modded";
    const auto replace = [&](const char* pattern, const char* with) {
        return [=] {
            Edit(PathJoin(patch, "patchinfo.xml"),
                 [&](std::string& text) { text = std::regex_replace(text, std::regex(pattern), with); });
        };
    };
    TempFolder memory("/dev/shm");  // another volume than the installation's
    const auto changed = [&](bool build) {
        Publish(Version(1), rebuilt, "2", nullptr);
        Install(modded, "1");
        if (!build) DiscardDirectory(temp / "server/build_2");
    };
    const std::string corrupt = "The game data is corrupt.";
    const struct {
        const char* what;
        std::function<void()> prepare;  // after version 1 installed, the signed patch to 2 published
        std::string latest;
        std::string answers;
        std::string shown;      // in the output
        std::string version;    // installed after the run
        bool started, offered;  // the game, the complete build
        int archives;           // requested; -1: some
        const char* program = "served_updater";
        bool kept = false;  // the first archive, for a later run
    } cases[] = {
        {"up to date", [&] { SetVersion("2"); }, "2", "", "", "2", true, false, 0},
        {"9 to 10, declined: what an earlier run kept goes too",
         [&] {
             SetVersion("9");
             WriteTree(PathJoin(install, "tempPatch"), TreeOf("patch0.lzma=part|download-records/patch0.lzma=x"));
         },
         "10", "n\n", "Latest version: 10", "9", false, false, 0},
        {"missing, play", nullptr, "5", "y\ny\n", "play the installed version instead", "1", true, false, 0},
        {"missing, quit", nullptr, "5", "y\nn\n", "play the installed version instead", "1", false, false, 0},
        // What arrived before the missing archive is kept for the next start.
        {"an archive missing", [&] { EXPECT_TRUE(RemoveFile(PathJoin(patch, "patch1.lzma"))); }, "2", "y\nn\n",
         "could not be downloaded", "1", false, false, 2, "served_updater", true},
        {"no room", replace("<SpaceRequirement>\\d+", "<SpaceRequirement>9000000000000000000"), "2", "y\n",
         "9000000000000 MB of free space is required.", "1", false, false, 0},
        {"changed, the build taken", [&] { changed(true); }, "2", "y\ny\nn\n", "Download size: ", "2", false, true, -1},
        {"changed, the build declined", [&] { changed(true); }, "2", "y\nn\n", corrupt, "1", false, true, -1},
        {"changed over a conflicting tree, the build taken",
         [&] {
             Publish(Version(1), Tree(rebuilt).File("cfg/x.ini", "a folder now"), "2", nullptr);
             Install(Tree(modded).File("cfg", "a file"), "1");
         },
         "2", "y\ny\nn\n", "Download size: ", "2", false, true, -1},
        {"the temporary folder on another volume, the complete build",
         [&] { tmp = memory.Path(), Install(Version(2), "-1"); }, "2", "n\n", "", "2", false, false, -1},
        {"changed, no build to offer", [&] { changed(false); }, "2", "y\n", "Failed to apply delta file", "1", false,
         false, -1},
        {"plain, a description without the new elements",
         replace("<Version>[^<]*</Version>|<Archives>[\\s\\S]*</Archives>", ""), "2", "y\nn\n", "", "2", false, false,
         -1},
        {"plain, an archive with one byte flipped",
         [&] { Edit(PathJoin(patch, "patch0.lzma"), [](std::string& data) { data[9] ^= 1; }); }, "2", "y\n", corrupt,
         "1", false, false, 2},
        {"keyed, signed", nullptr, "2", "y\nn\n", "", "2", false, false, -1, "keyed_updater"},
        // The signature covers the very bytes the program reads.
        {"keyed, changed after signing", replace("diff", "doff"), "2", "y\n", corrupt, "1", false, false, 0,
         "keyed_updater"},
        {"keyed, signed by another key", [&] { SignPatchDescription(patch, other); }, "2", "y\n", corrupt, "1", false,
         false, 0, "keyed_updater"},
        {"keyed, unsigned", [&] { EXPECT_TRUE(RemoveFile(PathJoin(patch, kDescriptionSignatureName))); }, "2", "y\n",
         corrupt, "1", false, false, 0, "keyed_updater"},
        {"keyed, the signed description of version 3 replayed for 2",
         [&] {
             for (const char* name : {"patchinfo.xml", kDescriptionSignatureName}) {
                 WriteTextFile(PathJoin(patch, name), ReadTextFile(PathJoin(temp / "older", name)));
             }
         },
         "2", "y\n", corrupt, "1", false, false, 0, "keyed_updater"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        tmp = temp / "tmp";
        DiscardDirectory(temp / "server");
        Publish(Version(1), Version(2), "2", &signer);
        Install(Version(1), "1");
        if (c.prepare) c.prepare();
        const Tree before = Game();
        const std::string versionBefore = InstalledVersion();
        DiscardFile(temp / "tmp/started.txt");
        const size_t requests = server.Requests().size();
        const std::string output = Run(c.answers, {"-latestVersion", c.latest}, c.program);
        EXPECT_NE(output.find(c.shown), std::string::npos) << output;
        EXPECT_EQ(output.find("complete game instead") != std::string::npos, c.offered);
        EXPECT_EQ(InstalledVersion(), c.version);
        EXPECT_EQ(Game(), c.version != versionBefore ? published : before);
        EXPECT_EQ(GameStarted(), c.started);
        const long archives = ArchiveRequests(requests);
        EXPECT_TRUE(c.archives < 0 ? archives > 0 : archives == c.archives) << archives;
        EXPECT_EQ(PathExists(PathJoin(install, "tempPatch/patch0.lzma")), c.kept);
        if (!c.kept) ExpectNoLeftovers();
    }
}

// What an interrupted stage two left is data, not instructions: a record naming folders beside the installation, a
// version its description does not lead to, or a description the keyed program cannot verify is never followed; the
// next start installs the complete build, and nothing outside the installation changes.
TEST_F(UpdateRun, ResumesAnInterruptedPatchOnlyFromItsOwnCheckedState) {
    const P256PrivateKey signer = LoadSigningKey(IRONVALE_BINARY_DIR "/test-key/private.pem");
    const auto record = [&](const char* element, const std::string& value) {
        return [=] {
            Edit(PathJoin(install, "PPF.xml"), [&](std::string& text) {
                text = std::regex_replace(text, std::regex("<" + std::string(element) + ">[^<]*<"),
                                          "<" + std::string(element) + ">" + value + "<");
            });
        };
    };
    const std::string documents = temp / "documents";
    const struct {
        const char* what;
        std::function<void()> tamper;
        const char* program;
        bool resumed;
    } cases[] = {
        {"as it was left", nullptr, "keyed_updater", true},
        {"prepared files beside the game", record("PatchedFilesPath", documents), "served_updater", false},
        {"both work folders beside the game",
         [&] {
             record("PatchPath", documents)();
             record("PatchedFilesPath", documents)();
         },
         "served_updater", false},
        {"a version its description does not lead to", record("Version", "3"), "served_updater", false},
        {"the description changed since it was checked",
         [&] { Edit(PathJoin(install, "tempPatch/patchinfo.xml"), [](std::string& t) { t += "<!-- -->"; }); },
         "keyed_updater", false},
        {"an unsigned description", [&] { EXPECT_TRUE(RemoveFile(PathJoin(install, "tempPatch/patchinfo.xml.sig"))); },
         "keyed_updater", false},
        // No move has run yet: prepared again from the archives kept in the work folder, then resumed.
        {"the prepared files lost", [&] { EXPECT_TRUE(DeleteDirectory(PathJoin(install, "tempPatch/patched"), true)); },
         "served_updater", true},
    };
    Publish(Version(1), Version(2), "2", &signer);
    std::string removed;  // a file the patch deletes: while it cannot be deleted, stage two asks and stops
    for (const auto& file : Version(1).files) {
        if (Version(2).files.count(file.first) == 0) removed = PathJoin(install, file.first);
    }
    ASSERT_FALSE(removed.empty());
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        Install(Version(1), "1");
        SetImmutable(removed, true);
        const std::string output = Run("y\nc\n", {"-latestVersion", "2"}, c.program);  // Cancel at the question
        SetImmutable(removed, false);
        EXPECT_NE(output.find("Failed to delete the file:"), std::string::npos) << output;
        ASSERT_EQ(InstalledVersion(), "-1");
        WriteTree(documents, TreeOf("letter.txt=mine|saves/slot1.sav=progress"));
        if (c.tamper) c.tamper();
        const size_t requests = server.Requests().size();
        Run("n\n", {"-latestVersion", "2"}, c.program);
        EXPECT_EQ(InstalledVersion(), "2");
        // The complete build leaves what it does not name, the files the patch had yet to delete among them.
        Tree game = Game();
        if (!c.resumed) {
            for (const auto& file : Version(1).files) {
                if (Version(2).files.count(file.first) == 0) game.files.erase(file.first);
            }
            game.folders = Version(2).folders;
        }
        EXPECT_EQ(game, Version(2));
        EXPECT_EQ(ReadTree(documents), TreeOf("letter.txt=mine|saves/slot1.sav=progress"));
        EXPECT_EQ(ArchiveRequests(requests) == 0, c.resumed);  // the complete build fetches its archives
        ExpectNoLeftovers();
    }
}

// While another copy holds the single-instance guard a second start is refused, but never the elevated copy. (The
// refusal's box and log line, and the start without a game, are checked under Wine.)
TEST_F(UpdateRun, KeepsASecondCopyOutButNotTheElevatedOne) {
    const std::string updater = IRONVALE_BINARY_DIR "/IronvaleUpdater";
    DiscardDirectory(temp / "registry/HKEY_LOCAL_MACHINE/SOFTWARE/Halvard");
    const int guard = open((temp / "tmp/IronvaleUpdater.lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
    ASSERT_EQ(flock(guard, LOCK_EX | LOCK_NB), 0);
    EXPECT_EQ(Start("", {"-hostname", "test host"}, updater).Wait(), 255);
    Run("\n", {"-internallyElevated", "1"}, updater);
    close(guard);
    // The fixed names in the shared temporary folder are never opened through a link someone put there.
    WriteTextFile(temp / "victim.txt", "another user's");
    for (const char* name : {"IronvaleUpdater.log", "IronvaleUpdater.lock"}) {
        DiscardFile(PathJoin(temp / "tmp", name));
        ASSERT_EQ(symlink((temp / "victim.txt").c_str(), PathJoin(temp / "tmp", name).c_str()), 0);
    }
    Start("", {}, updater).Wait();
    EXPECT_EQ(ReadTextFile(temp / "victim.txt"), "another user's");
}

// The keyed program takes the latest version only as the publisher's signed, unexpired statement beside version.txt
// names it, by either of its keys, with a serial not below the one it accepted before; it never goes back, and takes
// a signed patch only for the version it starts from. The plain program and a server without statements go on as
// before.
TEST_F(UpdateRun, TakesOnlyAConfirmedLatestVersionAndNeverGoesBack) {
    const P256PrivateKey first = LoadSigningKey(IRONVALE_BINARY_DIR "/test-key/private.pem");
    const P256PrivateKey second = LoadSigningKey(IRONVALE_BINARY_DIR "/test-key-2/private.pem");
    const P256PrivateKey unknown = GenerateSigningKey();
    const RegistryManager game(RegistryHive::LocalMachine, "SOFTWARE\\Halvard\\Ironvale");
    // Every run is told that the server's clock is two hours ahead of ours.
    const int64_t inOneHour = std::time(nullptr) + 3600, inThree = inOneHour + 7200;
    const auto installed3 = [&] { SetVersion("3"); };
    const auto startsAt7 = [&] { Publish(Version(1), Version(2), "2", &first, "7"); };
    const std::string unconfirmed = "The latest version of the game could not be confirmed.";
    const struct {
        const char* what;
        VersionStatement statement;  // beside version.txt "2" (none without a version), signed as the patch by key
        const P256PrivateKey* key;
        std::function<void()> prepare;  // after version 1 installed and the patch to 2 published
        std::string answers, shown;     // shown: in the output or the run's log
        std::string version, serial;    // after the run; the serial accepted before is 100
        bool started;
        const char* program = "keyed_updater";
    } cases[] = {
        {"valid", {"2", 200, inThree}, &first, nullptr, "y\nn\n", "", "2", "200", false},
        {"by the second key, the same serial", {"2", 100, inThree}, &second, nullptr, "y\nn\n", "", "2", "100", false},
        {"expired by the server's clock", {"2", 200, inOneHour}, &first, nullptr, "y\n", unconfirmed, "1", "100", true},
        {"an older serial", {"2", 99, inThree}, &first, nullptr, "y\n", unconfirmed, "1", "100", true},
        {"a future serial", {"2", inThree + 86400, inThree}, &first, nullptr, "y\n", unconfirmed, "1", "100", true},
        {"unlike version.txt", {"3", 200, inThree}, &first, nullptr, "n\n", unconfirmed, "1", "100", false},
        {"by an unknown key", {"2", 200, inThree}, &unknown, nullptr, "y\n", unconfirmed, "1", "100", true},
        {"no statement", {}, &first, nullptr, "y\n", unconfirmed, "1", "100", true},
        {"older than installed", {"2", 200, inThree}, &first, installed3, "", "installed 3: refused", "3", "200", true},
        {"a patch made for 7", {"2", 200, inThree}, &first, startsAt7, "y\nn\n", "complete game", "1", "200", false},
        {"plain, no statement", {}, nullptr, nullptr, "y\nn\n", "", "2", "100", false, "served_updater"},
    };
    const std::string log = temp / "tmp/IronvaleUpdater.log";
    WriteTextFile(log, "");
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        DiscardDirectory(temp / "server");
        Publish(Version(1), Version(2), "2", c.key);
        Install(Version(1), "1");
        game.WriteString("Latest Version Serial", "100");
        if (!c.statement.version.empty()) {
            WriteTextFile(temp / "server/version.txt.sig", SignVersionStatement(c.statement, *c.key));
        }
        if (c.prepare) c.prepare();
        const Tree before = Game();
        DiscardFile(temp / "tmp/started.txt");
        const size_t logged = ReadTextFile(log).size();
        std::string output = Run(c.answers, {"-serverDeltaTime", "7200"}, c.program);
        output += ReadTextFile(log).substr(logged);
        EXPECT_NE(output.find(c.shown), std::string::npos) << output;
        EXPECT_EQ(InstalledVersion(), c.version);
        EXPECT_EQ(Game(), c.version == "2" ? published : before);
        std::string serial;
        EXPECT_TRUE(game.ReadString("Latest Version Serial", serial));
        EXPECT_EQ(serial, c.serial);
        EXPECT_EQ(GameStarted(), c.started);
        ExpectNoLeftovers();
    }
}

}  // namespace
