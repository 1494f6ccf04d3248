// Whole runs of the updater, as a process of its own, against patches and
// builds made by the publisher's tool and served over HTTP on 127.0.0.1,
// with the player's answers on standard input.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>

#include <chrono>
#include <cstdlib>
#include <functional>
#include <random>
#include <regex>
#include <thread>

#include "base/file_operations.h"
#include "base/paths.h"
#include "state/installation_data.h"
#include "state/registry_manager.h"
#include "tests/support/batch_fixture.h"
#include "tests/support/child_process.h"
#include "tests/support/console_run.h"
#include "tests/support/http_test_server.h"
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

class UpdateRun : public ::testing::Test {
protected:
    // The runs see the test's own registry, temporary folder and server.
    void SetUp() override {
        const char* tmp = std::getenv("TMPDIR");
        savedTmp = tmp != nullptr ? tmp : "";
        setenv("IRONVALE_REGISTRY_ROOT", (temp / "registry").c_str(), 1);
        setenv("TMPDIR", (temp / "tmp").c_str(), 1);
        setenv("IRONVALE_TEST_UPDATE_LOCATION", server.Url("/").c_str(), 1);
        MakeDirectories(temp / "tmp");
        MakeDirectories(temp / "server");
        server.ServeFolder("/", temp / "server", {});
        const RegistryManager game(RegistryHive::LocalMachine, "SOFTWARE\\Halvard\\Ironvale");
        game.SetInstallDir(install);
        game.SetLanguage("English");
        RegistryManager(RegistryHive::LocalMachine, "SOFTWARE\\Microsoft\\DirectX")
            .WriteString("Version", "4.09.00.0904");
        Install(Version(1), "1");
    }

    void TearDown() override {
        if (savedTmp.empty()) {
            unsetenv("TMPDIR");
        } else {
            setenv("TMPDIR", savedTmp.c_str(), 1);
        }
    }

    void Install(const Tree& tree, const std::string& version) {
        DeleteDirectory(install, true);
        WriteTree(install, tree);
        chmod(PathJoin(install, "IronvaleGame.exe").c_str(), 0755);
        SetVersion(version);
    }

    void SetVersion(const std::string& version) {
        InstallationData data;
        data.SetDirectory(install);
        data.currentVersion = version;
        data.SetPatcherVersion(3.0f);
        data.Save();
    }

    std::string InstalledVersion() {
        InstallationData data;
        data.Load(install);
        return data.currentVersion;
    }

    // The patch from version from to version to and the complete build of
    // to, with version.txt naming to; both signed with key when given.
    std::string Publish(int from, int to, const P256PrivateKey* key = nullptr) {
        return Publish(Version(from), Version(to), std::to_string(to), key);
    }

    std::string Publish(const Tree& from, const Tree& to, const std::string& version, const P256PrivateKey* key) {
        DeleteDirectory(temp / "old", true);
        DeleteDirectory(temp / "new", true);
        WriteTree(temp / "old", from);
        WriteTree(temp / "new", to);
        BuildOptions options;
        options.fromDir = temp / "old";
        options.toDir = temp / "new";
        options.version = version;
        options.outDir = temp / "server";
        options.maxArchiveSize = 4000;
        options.signingKey = key;
        const std::string patch = BuildPatch(options);
        options.fromDir.clear();
        BuildPatch(options);
        WriteTextFile(temp / "server/version.txt", "  " + options.version + " and more words\n");
        return patch;
    }

    ConsoleRun Run(const std::string& answers, const std::vector<std::string>& arguments = {},
                   const std::string& workingFolder = "") {
        return RunConsoleProgram(TestProgramPath("served_updater"), arguments, answers, workingFolder);
    }

    // The installation without the updater's records.
    Tree Game() {
        Tree tree = ReadTree(install);
        for (const char* own : {"InstallationData.xml", "Uninstall.xml", "UpdateHistory.log"}) tree.files.erase(own);
        return tree;
    }

    // The game runs on after the updater ended; it gets a moment to show.
    bool GameStarted() {
        for (int wait = 0; wait < 50 && !PathExists(temp / "tmp/started.txt"); ++wait) {
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
        }
        return PathExists(temp / "tmp/started.txt");
    }

    // Nothing of the batch is left: no work folder, no record.
    void ExpectNoLeftovers() {
        for (const char* own : {"tempPatch", "PPF.xml", "_PPF.xml"}) {
            EXPECT_FALSE(PathExists(PathJoin(install, own))) << own;
        }
    }

    std::string savedTmp;
    TempFolder temp;
    HttpTestServer server;
    std::string install = temp / "Ironvale";
};

TEST_F(UpdateRun, PatchesToTheLatestVersionAndStartsTheGame) {
    Publish(1, 2);
    const ConsoleRun run = Run("y\ny\n");
    EXPECT_EQ(run.exitCode, 1) << run.output;
    EXPECT_EQ(Game(), Version(2));
    EXPECT_EQ(InstalledVersion(), "2");
    ExpectNoLeftovers();
    const std::string history = ReadTextFile(PathJoin(install, "UpdateHistory.log"));
    EXPECT_EQ(history.substr(history.find(' ', history.find(' ') + 1)), " " + server.Url("/patch_515195_2\r\n"));
    // The uninstall record, started by this run, lists what the patch added.
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

// What ends a run early leaves the installation as it was; the game is
// started only when the player says so, or when there was nothing to do.
TEST_F(UpdateRun, EndsWithoutChangesWhenUpToDateDeclinedMissingOrBroken) {
    Publish(1, 2);
    const Tree old = Version(1);
    std::string changed;  // an installed file the patch rebuilds from a delta
    for (const auto& file : Version(2).files) {
        if (old.files.count(file.first) != 0 && old.files.at(file.first) != file.second) changed = file.first;
    }
    const struct {
        const char* what;
        std::vector<std::string> arguments;
        std::string answers;
        std::string installedVersion;
        std::string shown;  // in the output
        bool started;
    } cases[] = {
        {"up to date", {"-latestVersion", "2"}, "", "2", "", true},
        {"declined", {"-latestVersion", "2"}, "n\n", "1", "Do you want to update the game now?", false},
        // Versions are numbers: 9 is older than 10.
        {"9 to 10", {"-latestVersion", "10"}, "n\n", "9", "Latest version: 10", false},
        {"missing, play", {"-latestVersion", "5"}, "y\ny\n", "1", "play the installed version instead", true},
        {"missing, quit", {"-latestVersion", "5"}, "y\nn\n", "1", "play the installed version instead", false},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        Install(old, c.installedVersion);
        RemoveFile(temp / "tmp/started.txt");
        const ConsoleRun run = Run(c.answers, c.arguments);
        EXPECT_EQ(run.exitCode, 1) << run.output;
        EXPECT_NE(run.output.find(c.shown), std::string::npos) << run.output;
        EXPECT_EQ(InstalledVersion(), c.installedVersion);
        EXPECT_EQ(GameStarted(), c.started);
        EXPECT_EQ(Game(), old);
        DeleteDirectory(PathJoin(install, "tempPatch"), true);
    }
}

// An installed file changed since its version was made: the patch cannot
// rebuild it, and the complete build is offered in the same run. Without a
// build on the server, the run ends as it always did.
TEST_F(UpdateRun, AChangedInstalledFileIsOfferedTheCompleteBuild) {
    // Every file rebuilt from a delta, one added: a complete build laid
    // over the old version gives the new one.
    Tree next = Version(1);
    for (auto& file : next.files) {
        if (file.first != "IronvaleGame.exe") file.second += " in version 2";
    }
    Publish(Version(1), next.File("added/new.txt", "new"), "2", nullptr);
    Tree modded = Version(1);
    modded.files.rbegin()->second = "modded";
    const struct {
        const char* what;
        std::string answers;  // update, complete build, start the game
        std::string shown;
        std::string installedVersion;
    } cases[] = {
        {"yes", "y\ny\nn\n", "Download size: ", "2"},
        {"no", "y\nn\n", "The game data is corrupt.", "1"},
        {"no build on the server", "y\n", "Failed to apply delta file", "1"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        Install(modded, "1");
        if (std::string(c.what) == "no build on the server") DeleteDirectory(temp / "server/build_2", true);
        const ConsoleRun run = Run(c.answers, {"-latestVersion", "2"});
        EXPECT_EQ(run.exitCode, 1) << run.output;
        EXPECT_NE(run.output.find(c.shown), std::string::npos) << run.output;
        EXPECT_EQ(run.output.find("complete game instead") != std::string::npos,
                  std::string(c.what) != "no build on the server");
        EXPECT_EQ(InstalledVersion(), c.installedVersion) << run.output;
        EXPECT_EQ(Game(), c.installedVersion == "2" ? next : modded);
        ExpectNoLeftovers();
        EXPECT_FALSE(PathExists(temp / "tmp/patchinfo.xml"));
    }
}

// Descriptions and archives as a network attacker or a broken cache may
// serve them. The plain program judges archives by what a description
// declares; the one with the publisher's key built in also refuses every
// description that is not signed by that key for the version it asked for,
// before it fetches a single archive.
TEST_F(UpdateRun, ArchivesAndSignedDescriptionsAreUsedOnlyAsThePublisherMadeThem) {
    const P256PrivateKey signer = LoadSigningKey(IRONVALE_BINARY_DIR "/test-key/private.pem");
    const P256PrivateKey other = GenerateSigningKey();
    const auto edit = [](const std::string& path, const std::function<void(std::string&)>& change) {
        std::string text = ReadTextFile(path);
        change(text);
        WriteTextFile(path, text);
    };
    const struct {
        const char* what;
        bool keyed;
        std::function<void(const std::string& patch)> serve;
        bool accepted;
        size_t archiveRequests;  // when refused
    } cases[] = {
        {"plain, a description without the new elements", false,
         [&](const std::string& patch) {
             edit(PathJoin(patch, "patchinfo.xml"), [](std::string& text) {
                 text = std::regex_replace(text, std::regex("<Version>[^<]*</Version>|<Archives>[\\s\\S]*</Archives>"),
                                           "");
             });
         },
         true, 0},
        {"plain, an archive with one byte flipped", false,
         [&](const std::string& patch) {
             edit(PathJoin(patch, "patch0.lzma"), [](std::string& data) { data[9] ^= 1; });
         },
         false, 2},
        {"keyed, signed", true, [](const std::string&) {}, true, 0},
        {"keyed, one byte changed", true,
         [&](const std::string& patch) {
             edit(PathJoin(patch, "patchinfo.xml"), [](std::string& text) { text[text.find("diff") + 1] = 'o'; });
         },
         false, 0},
        {"keyed, signed by another key", true, [&](const std::string& patch) { SignPatchDescription(patch, other); },
         false, 0},
        {"keyed, unsigned", true,
         [&](const std::string& patch) { RemoveFile(PathJoin(patch, kDescriptionSignatureName)); }, false, 0},
        {"keyed, the signed description of version 2 replayed for 3", true,
         [&](const std::string& patch) {
             for (const char* name : {"patchinfo.xml", kDescriptionSignatureName}) {
                 WriteTextFile(PathJoin(patch, name), ReadTextFile(PathJoin(temp / "older", name)));
             }
         },
         false, 0},
    };
    WriteTree(temp / "older", ReadTree(Publish(1, 2, &signer)));
    DeleteDirectory(temp / "server", true);
    const std::string patch = Publish(1, 3, &signer);
    const Tree published = ReadTree(temp / "server");
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        DeleteDirectory(temp / "server", true);
        WriteTree(temp / "server", published);
        c.serve(patch);
        Install(Version(1), "1");
        const size_t before = server.Requests().size();
        const ConsoleRun run = RunConsoleProgram(TestProgramPath(c.keyed ? "keyed_updater" : "served_updater"),
                                                 {"-latestVersion", "3"}, c.accepted ? "y\nn\n" : "y\n");
        EXPECT_EQ(run.exitCode, 1) << run.output;
        EXPECT_EQ(InstalledVersion(), c.accepted ? "3" : "1") << run.output;
        EXPECT_EQ(Game(), c.accepted ? Version(3) : Version(1));
        ExpectNoLeftovers();
        if (c.accepted) continue;
        EXPECT_NE(run.output.find("The game data is corrupt."), std::string::npos) << run.output;
        const std::vector<std::string> requests = server.Requests();
        EXPECT_EQ(std::count_if(requests.begin() + static_cast<std::ptrdiff_t>(before), requests.end(),
                                [](const std::string& head) { return head.find(".lzma") != std::string::npos; }),
                  static_cast<std::ptrdiff_t>(c.archiveRequests));
    }
}

TEST_F(UpdateRun, RefusesAPatchTheDiskCannotHoldBeforeDownloadingIt) {
    const std::string patch = Publish(1, 2);
    const std::string description = PathJoin(patch, "patchinfo.xml");
    std::string text = ReadTextFile(description);
    const size_t start = text.find("<SpaceRequirement>") + 18;
    text.replace(start, text.find('<', start) - start, "9000000000000000000");
    WriteTextFile(description, text);
    const ConsoleRun run = Run("y\n", {"-latestVersion", "2"});
    EXPECT_EQ(run.exitCode, 1) << run.output;
    EXPECT_NE(run.output.find("9000000000000 MB of free space is required."), std::string::npos) << run.output;
    EXPECT_EQ(Game(), Version(1));
    for (const std::string& request : server.Requests()) EXPECT_EQ(request.find(".lzma"), std::string::npos);
}

// The updater killed at seeded moments of a whole run, then started again
// until it reports success: the new version, complete, and nothing left.
TEST_F(UpdateRun, KilledAtAnyMomentTheNextStartsFinishTheUpdate) {
    Publish(1, 2);
    std::mt19937 random(1206);
    long long fullRun = 0;
    for (int trial = 0; trial <= 24; ++trial) {
        Install(Version(1), "1");
        const auto start = std::chrono::steady_clock::now();
        if (trial == 0) {
            ASSERT_EQ(Run("y\nn\n", {"-latestVersion", "2"}).exitCode, 1);
            fullRun =
                std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - start).count();
        } else {
            WriteTextFile(temp / "answers", "y\nn\n");
            ChildProcess child("/bin/sh", {"-c", "exec \"$0\" -latestVersion 2 < \"$1\" >/dev/null 2>&1",
                                           TestProgramPath("served_updater"), temp / "answers"});
            std::this_thread::sleep_for(std::chrono::microseconds(random() % fullRun));
            child.Kill();
            child.Wait();
            // The next start (and the one after, should that one be needed).
            for (int again = 0; again == 0 || (again < 3 && InstalledVersion() != "2"); ++again) {
                Run("y\nn\n", {"-latestVersion", "2"});
            }
        }
        SCOPED_TRACE("trial " + std::to_string(trial));
        EXPECT_EQ(InstalledVersion(), "2");
        EXPECT_EQ(Game(), Version(2));
        ExpectNoLeftovers();
    }
}

// The three modes the game's uninstaller calls touch the installation only:
// never a file of the same name where the program was started, never a
// recorded name outside the installation.
TEST_F(UpdateRun, UninstallerModesStayInsideTheInstallationAndTheDocuments) {
    WriteTree(temp / "cwd", TreeOf("corvid.dll=decoy"));
    for (const bool present : {false, true}) {
        if (present) WriteTextFile(PathJoin(install, "corvid.dll"), "component");
        EXPECT_EQ(Run("", {"-kdl_gl_remove", "-silent", "-delete_corvid"}, temp / "cwd").exitCode, 1);
        EXPECT_EQ(GameStarted(), present);
        EXPECT_FALSE(PathExists(PathJoin(install, "corvid.dll")));
        EXPECT_EQ(ReadTextFile(temp / "cwd/corvid.dll"), "decoy");
    }
    EXPECT_EQ(ReadTextFile(temp / "tmp/started.txt"), "-kdl_gl_remove -silent\n");

    setenv("XDG_DOCUMENTS_DIR", (temp / "documents").c_str(), 1);
    for (const bool yes : {false, true}) {
        WriteTree(temp / "documents", TreeOf("Ironvale/saves/slot1.sav=progress|keep.txt=mine"));
        EXPECT_EQ(Run(yes ? "y\n" : "n\n", {"-doRemoveSettings", "true"}).exitCode, 1);
        EXPECT_EQ(PathExists(temp / "documents/Ironvale"), !yes);
        EXPECT_TRUE(PathExists(temp / "documents/keep.txt"));
    }
    unsetenv("XDG_DOCUMENTS_DIR");

    // A record someone edited to list a file beside the game and the game's
    // folder itself.
    const std::string recorded = Version(1).files.rbegin()->first;
    WriteTextFile(temp / "beside.txt", "beside the game");
    WriteTextFile(PathJoin(install, "Uninstall.xml"),
                  "<IronvaleWestPatch><FileChanges><new Path=\"" + PathJoin(install, recorded) + "\" /><new Path=\"" +
                      temp / "beside.txt" + "\" /></FileChanges><DirectoryChanges><new Path=\"" + install +
                      "\" /></DirectoryChanges><RegistryHive>HKEY_LOCAL_MACHINE</RegistryHive></IronvaleWestPatch>");
    WriteTextFile(PathJoin(install, "GL.ini"), "settings");
    EXPECT_EQ(Run("", {"-doUninstallCleanup", "true"}).exitCode, 1);
    EXPECT_FALSE(PathExists(PathJoin(install, recorded)));
    EXPECT_FALSE(PathExists(PathJoin(install, "GL.ini")));
    EXPECT_EQ(ReadTextFile(temp / "beside.txt"), "beside the game");
    EXPECT_TRUE(PathExists(PathJoin(install, "IronvaleGame.exe")));
}

}  // namespace
