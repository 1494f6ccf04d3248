#!/usr/bin/python3
"""IronvaleUpdater.exe under Wine as a player's machine runs it, one table row per scenario: patches made by
ironvale-patch served by nginx, the window on a private Xvfb display, dialog_answer playing the player, window_driver
showing the window and boxes as the update run does.
  scenarios_wine.py BUILD_DIR [NAME...]   (the Windows build folder)"""
import os
import random
import re
import select
import shutil
import socket
import subprocess
import sys
import tempfile
import time
from pathlib import Path

from PIL import Image, ImageGrab

ROOT = Path(__file__).resolve().parents[2]
YES, NO, OK, CANCEL, RETRY = 6, 7, 1, 2, 4
ENGLISH, GERMAN, JAPANESE, POLISH, SPANISH = 0, 2, 4, 5, 7
LANGUAGES = ["English", "French", "German", "Italian", "Japanese", "Polish", "Russian", "Spanish"]
OWN = ("InstallationData.xml", "Uninstall.xml", "UpdateHistory.log", "IronvaleGame.exe")
QUIET = dict(stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)


def check(ok, message):
    if not ok:
        raise AssertionError(message)


def wait_until(condition, seconds, pause=0.05):
    end = time.monotonic() + seconds
    while not condition() and time.monotonic() < end:
        time.sleep(pause)
    return condition()


# Files edited, added and removed from version to version, a file that becomes a folder; the big game's stage two
# replaces hundreds of small files, long enough to be interrupted at many moments.
def version_tree(number, big=False):
    rng = random.Random(number)
    tree = {f"data{i % 3}/file{i}.bin": rng.randbytes(300 + i * 37) + b"v%d" % number
            for i in range(12) if (i + number) % 7}
    tree.update({"maps/level.map": b"level two"} if number >= 2 else {"maps": b"a file where 2 has a folder"})
    tree.update({f"sounds{i % 4}/v{number}_{i}.ogg": b"sound %d" % i for i in range(400 if big else 0)})
    return tree


def write_tree(root, tree):
    shutil.rmtree(root, ignore_errors=True)
    for path, content in tree.items():
        (root / path).parent.mkdir(parents=True, exist_ok=True)
        (root / path).write_bytes(content)


def read_tree(root, leave_out=()):
    return {p.relative_to(root).as_posix(): p.read_bytes() for p in sorted(root.rglob("*"))
            if p.is_file() and p.relative_to(root).parts[0] not in leave_out}


class Session:
    def __init__(self, build):
        self.build = Path(build).resolve()
        self.programs = self.build / "tests/support/programs"
        self.work = Path(tempfile.mkdtemp(prefix="ivl-e2e-"))
        self.env = dict(os.environ, WINEPREFIX=str(self.build / "wineprefix"), WINEDEBUG="-all")
        self.users = self.build / "wineprefix/drive_c/users" / os.environ.get("USER", "root")
        temp = self.users / "AppData/Local/Temp"
        self.log = (temp if temp.is_dir() else self.users / "Temp") / "IronvaleUpdater.log"
        self.tool = next((t for p in ("native-asan", "native", "native-release")
                          if (t := self.build.parent / p / "tools/ironvale-patch").exists()), None)
        check(self.tool, "build the native ironvale-patch first (cmake --preset native; cmake --build --preset native)")
        # No reset when the last client leaves. Wine's desktop process stays tied to the display it was started on:
        # the prefix's Wine processes end before the session begins and again before its display goes.
        self.end_wine()
        read, write = os.pipe()
        self.xvfb = subprocess.Popen(["Xvfb", "-displayfd", str(write), "-screen", "0", "1024x768x24", "-nolisten",
                                      "tcp", "-noreset"], pass_fds=[write], **QUIET)
        os.close(write)
        # The server writes the number and its line end apart, and ends with a fatal error when the second write
        # finds the reader gone: the whole line is read.
        said = b""
        while not said.endswith(b"\n"):
            said += os.read(read, 32) or b"\n"
        self.env["DISPLAY"] = ":" + said.decode().split()[0]
        os.close(read)
        self.nginx, self.port = self.start_nginx()
        # Without a window manager Wine waits for one after every closed box.
        for program in ("IronvaleUpdater.exe", "served_updater.exe", "keyed_updater.exe", "window_driver.exe"):
            self.wine("reg", "add", f"HKCU\\Software\\Wine\\AppDefaults\\{program}\\X11 Driver", "/v", "Managed",
                      "/d", "N", "/f")
        rows = (line.split("\t") for line in (ROOT / "resources/strings.tsv").read_text("utf-8").splitlines())
        self.strings = {cells[0]: cells[1:] for cells in rows if cells[0].startswith("INSTALLER_")}

    def text(self, key, language=ENGLISH):
        return self.strings[key][language] or self.strings[key][ENGLISH]

    def caption(self, language=ENGLISH, header="INSTALLER_UPDATER_HEADER"):
        return self.text("INSTALLER_GAME_NAME", language) + " - " + self.text(header, language)

    def start_nginx(self):
        (self.work / "server").mkdir()
        with socket.socket() as probe:
            probe.bind(("127.0.0.1", 0))
            port = probe.getsockname()[1]
        temp = " ".join(f"{kind}_temp_path {self.work};" for kind in ("client_body", "proxy", "fastcgi", "uwsgi", "scgi"))
        (self.work / "nginx.conf").write_text(
            f"daemon off; pid {self.work}/nginx.pid; error_log {self.work}/nginx-error.log; events {{}}\n"
            f"http {{ access_log {self.work}/access.log; {temp}\n"
            f"  server {{ listen 127.0.0.1:{port}; root {self.work}/server;\n"
            f"    location /slow/ {{ alias {self.work}/server/; limit_rate 64k; }} }} }}\n")
        nginx = subprocess.Popen(["nginx", "-c", str(self.work / "nginx.conf")], stderr=subprocess.DEVNULL)
        check(wait_until((self.work / "nginx.pid").exists, 5), "nginx did not start")  # the file comes once it listens
        return nginx, port

    def end_wine(self):
        for flag in ("-k", "-w"):  # -k signals the server; -w waits until it is gone
            subprocess.run(["/usr/lib/wine/wineserver", flag], env=self.env, stderr=subprocess.DEVNULL)

    def forget_game(self):
        for key in (["HKLM\\Software\\Halvard", "/reg:32"], ["HKCU\\Software\\Halvard"]):
            self.wine("reg", "delete", *key, "/f", check=False)

    def forget_fonts(self):  # Wine's memory of the fonts a test showed it
        for key in ("Cache", "External Fonts"):
            self.wine("reg", "delete", f"HKCU\\Software\\Wine\\Fonts\\{key}", "/f", check=False)
        for face in ("IPAGothic", "IPAPGothic", "@IPAGothic", "@IPAPGothic"):
            self.wine("reg", "delete", "HKLM\\Software\\Microsoft\\Windows NT\\CurrentVersion\\Fonts", "/v",
                      f"{face} (TrueType)", "/f", check=False)

    def close(self):
        self.forget_game()
        self.end_wine()
        for process in (self.nginx, self.xvfb):
            process.terminate()
            process.wait()
        shutil.rmtree(self.work, ignore_errors=True)

    def wine(self, *args, check=True, env=None):
        return subprocess.run([ROOT / "scripts/wine-run.sh", *map(str, args)], env=env or self.env, check=check,
                              stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)

    def start(self, program, *args, env=None, cwd=None, **pipes):
        return subprocess.Popen([ROOT / "scripts/wine-run.sh", program, *args], env=env or self.env, cwd=cwd,
                                **{**QUIET, **pipes})

    def answer(self, button, expected="", language=ENGLISH, caption=None, timeout_ms=30000, may_miss=False, choose=(),
               env=None):
        """The text of the next box, then a line of its controls ("[ID LABEL]" per button), which must hold expected
        (a string key or text), after button (0: none, it stays) is pressed; "" when none came and may_miss."""
        done = self.wine(self.programs / "dialog_answer.exe", caption or self.caption(language), button, timeout_ms,
                         *choose, check=False, env=env)
        check(done.returncode == 0 or may_miss, f"no box to answer with {button}")
        text = done.stdout.decode("utf-8", "replace").replace("\r", "") if done.returncode == 0 else ""
        expected = self.text(expected, language) if expected in self.strings else expected
        check(expected in text, f"expected '{expected}' in the box: {text}")
        return text

    def windows_path(self, path):
        return "Z:" + str(path).replace("/", "\\")

    def publish(self, old, new, version, out, key=None, start="1"):
        # The patch from tree old (version start) to new, the complete build of new, version.txt; with key, all signed
        # and the statement of the latest version beside.
        trees = self.work / "trees"
        for stale in ("version.txt", "version.txt.sig"):  # each scenario's site starts afresh, at any version
            (out / stale).unlink(missing_ok=True)
        write_tree(trees / "old", old)
        write_tree(trees / "new", new)
        signed = ["--sign-key", key] if key else []
        for how in (["--from", trees / "old", "--from-version", start, "--max-archive-size", "3000"], ["--complete"]):
            subprocess.run([self.tool, "build", *how, *signed, "--to", trees / "new", "--version", version, "--out",
                            out], check=True, **QUIET)
        latest = ["publish-version", "--key", key, "--version", version, "--expires-in", "1", out] if key else \
            ["version", "--out", out, version]
        subprocess.run([self.tool, *latest], check=True, **QUIET)
        return out / f"patch_515195_{version}"

    def run_log(self):
        # The last run's log from the empty line before its separator, each line with its CR.
        lines = self.log.read_bytes().decode(errors="replace").split("\n")
        starts = [i for i, line in enumerate(lines) if line.rstrip("\r").endswith("-" * 103)]
        return "\n".join(lines[max(starts[-1] - 1, 0) if starts else 0:])


class Run:  # one scenario's installation, its server location and the runs on it
    def __init__(self, session, name):
        self.s = session
        self.folder = session.work / name
        self.install = self.folder / "Ironvale"
        self.outside = self.folder / "outside.txt"
        self.game_log = self.folder / "game.log"
        self.env = dict(session.env, IRONVALE_TEST_GAME_LOG=session.windows_path(self.game_log),
                        IRONVALE_TEST_UPDATE_LOCATION=f"http://127.0.0.1:{session.port}/")

    def install_version(self, tree, version, language=ENGLISH):
        write_tree(self.install, tree)
        shutil.copy(self.s.programs / "fake_game.exe", self.install / "IronvaleGame.exe")
        (self.install / "InstallationData.xml").write_text(
            f"<InstallationData><CurrentVersion>{version}</CurrentVersion><PatcherVersion>3</PatcherVersion>"
            "</InstallationData>")
        self.outside.write_text("beside the game")
        for name, value in (("Install Dir", self.s.windows_path(self.install) + "\\"), ("Language", LANGUAGES[language])):
            self.s.wine("reg", "add", "HKLM\\Software\\Halvard\\Ironvale", "/v", name, "/d", value, "/reg:32", "/f")

    def ready(self, out=None, language=ENGLISH):
        # Version 1 installed, the patch to 2 published (on the server unless out); its folder.
        self.install_version(version_tree(1), "1", language)
        return self.s.publish(version_tree(1), version_tree(2), "2", out or self.s.work / "server")

    def version(self):
        return re.search("<CurrentVersion>(.*?)<", (self.install / "InstallationData.xml").read_text())[1]

    def start(self, *args, program=None, cwd=None):
        return self.s.start(program or self.s.programs / "served_updater.exe", *args, env=self.env, cwd=cwd)

    def finish(self, process, code=1):
        try:
            check(process.wait(120) == code, f"exit code {process.returncode}, expected {code}")
        except subprocess.TimeoutExpired:
            process.kill()
            check(False, "the run did not end (a box nobody expected?)")

    def play(self, args, answers, tree, version, game=None, language=ENGLISH, **start):
        # A run whose boxes get answers (expected text, button) in turn, then the checks of expect; the boxes' texts.
        process = self.start(*args, **start)
        texts = [self.s.answer(button, expected, language) for expected, button in answers]
        self.finish(process)
        self.expect(tree, version, game)
        return texts

    def expect(self, tree, version, game=None):
        # The tree and version, nothing left over or beside touched; game: a text its command line holds, None (not
        # started) or "" (either).
        check(read_tree(self.install, OWN) == {k: v for k, v in tree.items() if k not in OWN},
              "the installed tree is not the expected version")
        check(self.version() == version and self.outside.read_text() == "beside the game",
              f"installed version {self.version()} (expected {version}), or the file beside it changed")
        check(not any((self.install / own).exists() for own in ("tempPatch", "PPF.xml", "_PPF.xml")),
              "work folder or record left over")
        if game:  # the game runs on after the updater has ended
            wait_until(self.game_log.exists, 5)
        started = self.game_log.read_text(errors="replace") if self.game_log.exists() else None
        self.game_log.unlink(missing_ok=True)
        check(game == "" or (started is None) == (game is None) and (not game or game in started),
              f"the game's start: {started}, expected {game}")


def wait_for_line(s, process, line, pause=0.005):
    wait_until(lambda: line in s.run_log() or process.poll() is not None, 120, pause)


# ------------------------------------------------------------- scenarios
def start_up(s, run):
    s.forget_game()
    process = s.start(s.build / "IronvaleUpdater.exe", "-serverDeltaTime", "-3.7", "-hostname", "test host")
    s.answer(OK)  # the language dialog: OK keeps the current one
    s.answer(OK, "INSTALLER_GAME_IS_NOT_INSTALLED")
    run.finish(process)
    s.forget_game()
    opening = ["", "-" * 103, "WinMain Enter", "Command line: -serverDeltaTime -3.7 -hostname \"test host\"",
               "Arguments: ServerDeltaTime=-3 InternallyElevated=0 loggedIn=1 SessionId= HostName=test host"]
    lines = s.run_log().split("\n")
    for i, message in enumerate(opening):
        check(i < len(lines) and re.fullmatch(r"\d{4}-[1-9]\d?-[1-9]\d? [1-9]?\d:[1-9]?\d:[1-9]?\d\.[1-9]?\d{0,2} "
                                              r"Main\(\d+\): Info: " + re.escape(message) + "\r", lines[i]),
              f"line {i} of the run: {lines[i:i + 1]}")


def patch_1_to_2(s, run, language=ENGLISH, location=None, beside=None):  # beside: the program's own folder
    run.ready(beside or location and run.folder / "served", language)
    if beside:
        shutil.copy(s.build / "IronvaleUpdater.exe", beside)
    if location is not None:
        run.env["IRONVALE_TEST_UPDATE_LOCATION"] = location
    texts = run.play([], [("INSTALLER_PATCH_CONFIRM_UPADATE", YES), ("INSTALLER_SUCCESS_PATCH", YES)],
                     version_tree(2), "2", "+webSiteHostName", language, program=beside and beside / "IronvaleUpdater.exe")
    check(f"[{YES} {s.text('INSTALLER_DIALOG_YES', language)}]" in texts[1], f"button label: {texts[1]}")
    if location is not None:
        return
    requests = [line for line in (s.work / "access.log").read_text().splitlines() if "patch_515195_2" in line]
    check(requests and all("e=" in line and "h=" in line for line in requests), f"unsigned requests: {requests}")
    check("Patch URL:http://127.0.0.1" in s.run_log(), "no Patch URL line in the log")


def interrupt_stage_two(s, run, rng):
    run.install_version(version_tree(1, big=True), "1")
    process = run.start("-latestVersion", "2")
    s.answer(YES)
    wait_for_line(s, process, "ApplyPatch Start")
    time.sleep(rng.random() * 0.5)
    process.kill()  # SIGKILL to the Wine process, as TerminateProcess ends it (a taskkill starts 0.15 s late)
    process.wait()


def scenario_killed(s, run):
    # The next start after each kill finishes from the record or asks again. The first record left is finished on the
    # way to 3 instead: without a question, then 3 is offered.
    s.publish(version_tree(1, big=True), version_tree(2, big=True), "2", s.work / "server")
    rng, chained = random.Random(16), False
    for trial in range(12):
        interrupt_stage_two(s, run, rng)
        if not chained and run.version() == "-1":
            chained = True
            s.publish(version_tree(2, big=True), version_tree(3, big=True), "3", s.work / "server")
            run.play([], [("3", YES), ("", NO)], version_tree(3, big=True), "3")
            history = [line.split()[-1][-14:] for line in (run.install / "UpdateHistory.log").read_text().splitlines()]
            check(history == ["patch_515195_2", "patch_515195_3"], f"history: {history}")
            continue
        process = run.start("-latestVersion", "2")
        while process.poll() is None:
            if text := s.answer(0, timeout_ms=2000, may_miss=True):
                s.answer(YES if s.text("INSTALLER_PATCH_CONFIRM_UPADATE") in text else NO)
        run.finish(process)
        run.expect(version_tree(2, big=True), "2", game="")  # up to date when killed after the version was stored
    check(chained, "no kill left a record")


def scenario_reinstall(s, run):
    # -1 without a record, one file missing, the temporary folder on another drive: the complete build's description
    # is written from memory into the work folder, never moved across drives.
    s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    drive = Path(tempfile.mkdtemp(dir="/dev/shm"))
    (s.build / "wineprefix/dosdevices/t:").symlink_to(drive)
    try:
        run.install_version(dict(sorted(version_tree(2).items())[1:]), "-1")
        run.env.update(TEMP="T:\\", TMP="T:\\")
        run.play(["-latestVersion", "2"], [("", NO)], version_tree(2), "2")
    finally:
        (s.build / "wineprefix/dosdevices/t:").unlink()
        shutil.rmtree(drive)


def scenario_repair(s, run):
    # A changed file fails its delta, and the installation holds files where the build has folders: Yes to the
    # complete build finishes it (what the build does not name stays), and the next start finds nothing to do.
    new = {**{k: v + b" in 2" for k, v in version_tree(1).items() if k != "maps"}, "maps/level.map": b"level two",
           "cfg/x.ini": b"a folder now"}  # each file a delta away from 1
    s.publish(version_tree(1), new, "2", s.work / "server")
    old = {**version_tree(1), "cfg": b"a file", "data1/file1.bin": b"changed by the player"}
    run.install_version(old, "1")
    new = {**{k: v for k, v in old.items() if not any(p.startswith(k + "/") for p in new)}, **new}
    run.play(["-latestVersion", "2"], [("", YES), ("INSTALLER_REPAIR_DOWNLOAD_BUILD", YES), ("", NO)], new, "2")
    run.play(["-latestVersion", "2"], [], new, "2", game="+webSiteHostName")
    # Read-only files the patch replaces and deletes are the patch's to change; dotted versions order by number.
    s.publish(version_tree(1), version_tree(2), "1.10", s.work / "server")
    run.install_version(version_tree(1), "1.9")
    for path in ("data1/file1.bin", "data2/file5.bin"):  # replaced, deleted
        (run.install / path).chmod(0o444)
    run.play(["-latestVersion", "1.10"], [("1.10", YES), ("", NO)], version_tree(2), "1.10")
    run.play(["-latestVersion", "1.9"], [], version_tree(2), "1.10", game="+webSiteHostName")


def scenario_killed_download(s, run):
    # Killed while nginx sends an archive at 64 KiB/s: "Cancel" then Yes in the next start removes what the kill kept;
    # after another kill, the next start asks for exactly the rest and finishes the batch.
    tree = {**version_tree(2), "noise.bin": random.Random(5).randbytes(400000)}
    archive = max(s.publish(version_tree(1), tree, "2", s.work / "server").glob("*.lzma"), key=lambda a: a.stat().st_size)
    part = run.install / "tempPatch" / archive.name
    run.env["IRONVALE_TEST_UPDATE_LOCATION"] = f"http://127.0.0.1:{s.port}/slow/"
    for cancel in (True, False):
        run.install_version(version_tree(1), "1")
        process = run.start("-latestVersion", "2")
        s.answer(YES)
        check(wait_until(lambda: part.exists() and part.stat().st_size > 100000, 60), "the archive did not arrive")
        process.kill()
        process.wait()
        kept = part.stat().st_size
        if cancel:
            cancel_in_window(s, run, ".lzma")
            continue
        run.play(["-latestVersion", "2"], [("", YES), ("", NO)], tree, "2")
        sent = re.findall(rf'"GET /slow/patch_515195_2/{archive.name}\?[^"]*" (\d+) (\d+)',
                          (s.work / "access.log").read_text())
        check(sent[-1] == ("206", str(archive.stat().st_size - kept)), f"kept {kept} bytes, then: {sent}")


def cancel_in_window(s, run, line):
    process = run.start("-latestVersion", "2")
    s.answer(YES)
    wait_for_line(s, process, line, 0.05)
    click(s, 246, 143, 435, 443)  # "Cancel"
    s.answer(YES, "INSTALLER_CONFIRM_CANCEL")
    run.finish(process)
    run.expect(version_tree(1), "1")


def click(s, left, top, x, y):  # at x, y of the window at left, top
    subprocess.run(["xdotool", "mousemove", str(left + x), str(top + y), "click", "1"], env=s.env, check=True)


def scenario_cancel_preparation(s, run):
    # 24 MiB of random bytes take a second or two to unpack; the archive's layout: name length, name, 40-bit size, data.
    patch = run.folder / "served/patch_515195_2"
    patch.mkdir(parents=True)
    lzma = subprocess.run(["xz", "--format=lzma", "-0", "-T1", "-c"], input=random.Random(3).randbytes(24 << 20),
                          stdout=subprocess.PIPE, check=True).stdout
    (patch / "patch0.lzma").write_bytes(b"\x0fdata0\\large.bin" + len(lzma).to_bytes(5, "little") + lzma)
    (patch / "patchinfo.xml").write_bytes(described('<FileChanges><new Path="data0\\large.bin" File="patch0.lzma" />'
                                                    "</FileChanges>")(None))
    run.install_version(version_tree(1), "1")
    run.env["IRONVALE_TEST_UPDATE_LOCATION"] = "file://" + s.windows_path(run.folder / "served")
    cancel_in_window(s, run, "Decoding file: data0\\large.bin")


def scenario_locked_file(s, run):  # Retry once the file is let go; Cancel leaves stage two to the next start
    changed = next(p for p, c in version_tree(2).items() if version_tree(1).get(p, c) != c)
    for button in (RETRY, CANCEL):
        run.ready()
        holder = s.start(s.programs / "hold_file.exe", s.windows_path(run.install / changed), stdin=subprocess.PIPE,
                         stdout=subprocess.PIPE)
        check(holder.stdout.readline().strip() == b"held", "the file could not be held")
        process = run.start("-latestVersion", "2")
        s.answer(YES)
        s.answer(0, "INSTALLER_FAILED_TO_MOVE_THE_FILE")
        if button == RETRY:
            holder.stdin.close()
        s.answer(button)
        if button == CANCEL:
            s.answer(OK, "INSTALLER_ERROR_OCCURRED")
            run.finish(process)
            holder.stdin.close()
            check(run.version() == "-1" and (run.install / "PPF.xml").exists(), "a failed stage two must stay resumable")
            process = run.start("-latestVersion", "2")
        holder.wait()
        s.answer(NO)
        run.finish(process)
        run.expect(version_tree(2), "2")


def described(items):
    return lambda _: f"<IronvaleWestPatch>{items}</IronvaleWestPatch>".encode()


HOSTILE = [  # the published patch's file, its new content from the old, what the error box says
    # The program's own names by the 8.3 aliases Wine's GetShortPathNameW gives them.
    ("patchinfo.xml", described('<DirectoryChanges><delete Path="TEMP~MPE" /></DirectoryChanges>'), "Unsafe path"),
    ("patchinfo.xml", described('<FileChanges><delete Path="INST~MQ5.XML" /></FileChanges>'), "Unsafe path"),
    ("patchinfo.xml", described('<FileChanges><delete Path="UNIN~L2I.XML" /></FileChanges>'), "Unsafe path"),
    ("patchinfo.xml", described('<FileChanges><delete Path="linked\\keep.txt" /></FileChanges>'), "through the link"),
    ("patchinfo.xml", described('<FileChanges><delete Path="..\\outside.txt" /></FileChanges>'), "Unsafe path"),
    ("patchinfo.xml", lambda _: b"not XML at all", "Failed to load patch info file"),
    ("patch0.lzma", lambda data: data[:60] + bytes([data[60] ^ 0xFF]) + data[61:], "INSTALLER_ERROR_CORRUPT_DATA"),
]


def scenario_hostile(s, run):
    elsewhere = run.folder / "elsewhere"
    for name, damage, expected in HOSTILE:
        file = run.ready() / name
        file.write_bytes(damage(file.read_bytes()))
        (run.install / "Uninstall.xml").write_text("<IronvaleWestPatch />")
        write_tree(elsewhere, {"keep.txt": b"the player's"})
        (run.install / "linked").symlink_to(elsewhere)
        run.play(["-latestVersion", "2"], [("", YES), (expected, OK)], version_tree(1), "1")
        check((elsewhere / "keep.txt").exists() and (run.install / "Uninstall.xml").exists(), "a protected file went")
        (run.install / "linked").unlink()


def scenario_trust(s, run):
    # The updater trusting the two test keys (one replacing the other) on sites that ironvale-patch signed with a row's
    # key; the plain program on an unsigned site is "patch over HTTP". What the run's log must say, and the boxes.
    keys = [s.build / "test-key/private.pem", s.build / "test-key-2/private.pem", s.work / "unknown/private.pem"]
    subprocess.run([s.tool, "keygen", "--out", keys[2].parent], check=True, **QUIET)
    patch = [("INSTALLER_PATCH_CONFIRM_UPADATE", YES), ("INSTALLER_SUCCESS_PATCH", NO)]
    play = [("INSTALLER_ERROR_LATEST_VERSION_UNCONFIRMED", YES)]
    ahead = str(int(time.time()) + 3600)  # the serial accepted before, beyond the one publish-version takes
    rows = [  # logged, key, start of the patch, arguments, serial accepted before, change, boxes, version after
        ("publisher key 1 of 2", 0, "1", [], "0", None, patch, "2"),
        ("publisher key 2 of 2", 1, "1", [], "0", None, patch, "2"),
        ("expired at", 0, "1", ["-serverDeltaTime", "172800"], "0", None, play, "1"),
        ("accepted before", 0, "1", [], ahead, None, play, "1"),
        ("version.txt names 3", 0, "1", [], "0", lambda: (s.work / "server/version.txt").write_text("3\n"), play, "1"),
        ("does not match it and any publisher key", 2, "1", [], "0", None, play, "1"),
        ("older than the installed 3: refused", 0, "1", [], "0", lambda: run.install_version(version_tree(1), "3"),
         [], "3"),
        ('starts from version "7"', 0, "7", [], "0", None, [("", YES), ("INSTALLER_REPAIR_FILES_CHANGED", NO),
                                                            ("INSTALLER_ERROR_CORRUPT_DATA", OK)], "1"),
    ]
    for logged, key, start, args, serial, change, boxes, version in rows:
        run.install_version(version_tree(1), "1")
        s.wine("reg", "add", "HKLM\\Software\\Halvard\\Ironvale", "/v", "Latest Version Serial", "/d", serial,
               "/reg:32", "/f")
        s.publish(version_tree(1), version_tree(2), "2", s.work / "server", keys[key], start)
        if change:
            change()
        game = "+webSiteHostName" if boxes in (play, []) else None
        run.play(args, boxes, version_tree(2 if version == "2" else 1), version, game,
                 program=s.programs / "keyed_updater.exe")
        check(logged in s.run_log(), f"'{logged}' not in the log")


def scenario_component_removal(s, run):
    decoy = run.folder / "cwd/corvid.dll"
    for present in (True, False):
        run.install_version(version_tree(1), "1")
        if present:
            (run.install / "corvid.dll").write_text("component")
        write_tree(decoy.parent, {"corvid.dll": b"not the installation's"})
        run.play(["-kdl_gl_remove", "-silent", "-delete_corvid"], [], version_tree(1), "1",
                 "-kdl_gl_remove -silent" if present else None, cwd=decoy.parent)
        check(decoy.exists(), "the decoy corvid.dll where the program was started must stay")


def scenario_settings_removal(s, run):
    saves = (s.users / "Documents" if (s.users / "Documents").exists() else s.users / "My Documents") / "Ironvale"
    for button in (NO, YES):
        write_tree(saves, {"saves/slot1.sav": b"progress"})
        process = run.start("-doRemoveSettings", "true")
        s.answer(button, caption=s.caption(header="INSTALLER_DIALOG_UNINSTALL"))
        run.finish(process)
        check(saves.exists() == (button == NO), f"saved games after {button}")


def scenario_uninstall_cleanup(s, run):
    run.install_version({**version_tree(1), "corvid.dll": b"", "GL.ini": b"", "pb/pb.dll": b""}, "1")
    listed = [p for p in version_tree(1) if "/" in p][:3]
    files = "".join(f'<new Path="{s.windows_path(run.install / p)}" />' for p in listed)
    files += f'<new Path="{s.windows_path(run.outside)}" /><new Path="{s.windows_path(run.install)}\\*" />'
    (run.install / "Uninstall.xml").write_text(
        f"<IronvaleWestPatch><FileChanges>{files}</FileChanges><RegistryHive>HKEY_LOCAL_MACHINE</RegistryHive>"
        "</IronvaleWestPatch>")
    run.finish(run.start("-doUninstallCleanup", "true"))
    left = read_tree(run.install)
    check(not any(p in left for p in listed + ["corvid.dll", "GL.ini", "pb/pb.dll"]) and len(left) >= 3 and
          run.outside.read_text() == "beside the game", "only what the record lists inside the installation may go")
    # Without installation data the record's files go all the same; a linked "pb" never takes its target along.
    write_tree(run.folder / "elsewhere", {"pb.dll": b"not the game's"})
    (run.install / "pb").symlink_to(run.folder / "elsewhere")
    (run.install / "InstallationData.xml").unlink()
    (run.install / listed[0]).write_bytes(b"back")
    run.finish(run.start("-doUninstallCleanup", "true"))
    check(not (run.install / listed[0]).exists() and (run.folder / "elsewhere/pb.dll").exists(), "mode 3 without data")


def scenario_elevated_copy(s, run):
    sid = "S-1-5-21-4242-4242-4242-1002"
    s.forget_game()
    for name, value in (("Install Dir", "C:\\Games\\Ironvale\\"), ("Language", "Polish")):
        s.wine("reg", "add", f"HKU\\{sid}\\Software\\Halvard\\Ironvale", "/v", name, "/d", value, "/f")
    try:
        process = s.start(s.programs / "run_elevated.exe", s.windows_path(s.build / "IronvaleUpdater.exe"),
                          "-doRemoveSettings", "true", "-internallyElevated", "1", "-SID", sid)
        s.answer(NO, "INSTALLER_REMOVE_SAVES_AND_SETTINGS", POLISH, s.caption(POLISH, "INSTALLER_DIALOG_UNINSTALL"))
        run.finish(process)
    finally:
        s.wine("reg", "delete", f"HKU\\{sid}", "/f", check=False)


def scenario_second_copy(s, run):
    # The updater's own first box, before any window, in a box whose OK differs from the system's in Spanish; its log
    # line, and the exit code -1.
    run.install_version(version_tree(1), "1", SPANISH)
    holder = s.start(s.programs / "hold_instance.exe", "60000", stdout=subprocess.PIPE)
    check(holder.stdout.readline().strip() == b"held", "the holder did not take the mutex")
    process = s.start(s.build / "IronvaleUpdater.exe")
    s.answer(OK, f"[{OK} Aceptar]", SPANISH)
    run.finish(process, 255)
    holder.kill()
    holder.wait()
    check(": Error: There is already another updater instance running." in s.log.read_text(errors="replace")
          .splitlines()[-1], "no log line")


KEY_BAR_LEFT, BAR_ROW, KEY = 26, 443, (236, 0, 140)


def window_shows(s, left, top, length):
    # Within ten seconds the screen shows the window at left, top with its bar length px long, title, status and
    # "Cancel" drawn, and the screen behind every colour-key pixel with no pink fringe; else the screen is kept.
    picture = Image.open(ROOT / "resources/pictures/background.png").convert("RGB")
    drawn = picture.load()
    differs = lambda a, b: sum(abs(x - y) for x, y in zip(a, b)) > 48
    # The window's region leaves out its outermost pixels; the screen's corner is never covered by it.
    inside = [(x, y) for y in range(1, picture.height - 1) for x in range(1, picture.width - 1)]
    for _ in range(40):
        screen = ImageGrab.grab(xdisplay=s.env["DISPLAY"]).convert("RGB")
        shown = screen.load()
        at = lambda x, y: shown[left + x, top + y]
        changed = lambda x0, y0, x1, y1: sum(differs(at(x, y), drawn[x, y]) for x in range(x0, x1)
                                             for y in range(y0, y1))
        bar = next((x for x in range(KEY_BAR_LEFT, KEY_BAR_LEFT + 340) if not differs(at(x, BAR_ROW), drawn[x, BAR_ROW])),
                   999) - KEY_BAR_LEFT
        keyed = [at(x, y) for x, y in inside if drawn[x, y] == KEY]
        seen = dict(bar=bar, title=changed(11, 5, 260, 26), status=changed(22, 408, 322, 428),
                    cancel=changed(395, 433, 475, 452), keyed=len(keyed),
                    keyed_opaque=sum(pixel != shown[0, 0] for pixel in keyed),
                    pinkish=sum(r >= 150 and g <= 90 and b >= 70 for r, g, b in (at(x, y) for x, y in inside)))
        if (bar == length and seen["title"] > 100 and seen["status"] > 100 and seen["cancel"] > 50 and keyed and
                not seen["keyed_opaque"] and not seen["pinkish"]):
            return
        time.sleep(0.25)
    screen.save(s.build / "test-results/window_wine-failed.png")
    check(False, f"the window with a bar {length} px long is not drawn right: {seen}")


class Driver:  # window_driver; with fonts, it knows only the fonts in those folders
    def __init__(self, s, fonts=None):
        self.s, self.log, self.env, self.reply = s, s.log.parent / "window_driver.log", s.env, None
        self.log.write_text("")
        if fonts:
            # Wine finds fonts through fontconfig and remembers them in its registry and in every running Wine process.
            s.forget_fonts()
            s.end_wine()
            self.env = dict(s.env, FONTCONFIG_FILE=str(s.work / "fonts.conf"))
            (s.work / "fonts.conf").write_text("<fontconfig>" + "".join(f"<dir>{f}</dir>" for f in fonts) +
                                               f"<cachedir>{s.work}/fontcache</cachedir></fontconfig>")
        self.process = s.start(s.programs / "window_driver.exe", env=self.env, stdin=subprocess.PIPE,
                               stdout=subprocess.PIPE, text=True)

    def send(self, command, reply=None, **box):
        # The reply must be the one given; box: how to answer the box the command puts up, whose controls are returned.
        self.process.stdin.write(command + "\n")
        self.process.stdin.flush()
        seen = self.s.answer(**box, env=self.env) if box else ""
        check(select.select([self.process.stdout], [], [], 60)[0], f"no answer to {command}")
        self.reply = self.process.stdout.readline().strip()
        check(reply in (None, self.reply), f"'{command}' answered '{self.reply}', expected '{reply}'")
        return seen.split("\n")[-2].strip() if box else ""

    def close(self):
        self.process.stdin.close()
        self.process.wait()
        return self.log.read_text(errors="replace")


def scenario_window(s, run):
    # The window, its boxes and fonts in German, whose button labels differ from the system's, clicked and dragged
    # with xdotool; the screen read back.
    key = "HKCU\\Software\\Halvard\\Ironvale"
    s.forget_game()
    for name, value in (("Install Dir", "C:\\Games\\Ironvale"), ("Language", "German")):
        s.wine("reg", "add", key, "/v", name, "/d", value, "/f")
    try:
        driver, yes_no = Driver(s), f"[{YES} Ja] [{NO} Nein]"
        check(driver.send("language", "Polish", button=OK, language=GERMAN, choose=["Polish"]) ==
              "[1 OK] [2 Abbrechen] {English French German Italian Japanese Polish Russian Spanish} German",
              f"the language dialog: {driver.reply}")
        check("REG_SZ    Polish" in s.wine("reg", "query", key, "/v", "Language").stdout.decode(), "not stored")
        check(driver.send("retry", "cancel", button=CANCEL, expected="INSTALLER_FAILED_TO_MOVE_THE_FILE",
                          language=GERMAN) == f"[{RETRY} Wiederholen] [{CANCEL} Abbrechen]", "the retry buttons")
        driver.send("start", "started")
        driver.send("rect", "246 143")  # centred on the 1024 x 768 screen
        for progress, length in ((0, 0), (500, 165)):
            driver.send(f"progress {progress}", "ok")
            window_shows(s, 246, 143, length)
        # A drag from the title line moves the window by the pointer's way; the next picture waits for the screen to
        # show it there, where clicks go.
        subprocess.run(["xdotool", "mousemove", "346", "158", "mousedown", "1", "mousemove", "396", "188", "mouseup",
                        "1"], env=s.env, check=True)
        check(wait_until(lambda: driver.send("rect") == "" and driver.reply == "296 173", 10), "the drag")
        driver.send("progress 1000", "ok")
        window_shows(s, 296, 173, 330)
        # A question of the main thread owned by the window, then the confirmations of the window's thread (with its
        # own hook) answered No: the run goes on, and the bar still follows it.
        check(driver.send("ask Weiter?", "no", button=NO, expected="Weiter?", language=GERMAN) == yes_no, "ask")
        for spot, question in (((435, 443), "INSTALLER_CONFIRM_CANCEL"), ((515, 15), "INSTALLER_CONFIRM_QUIT")):
            click(s, 296, 173, *spot)  # "Cancel", the close spot
            check(s.answer(NO, question, GERMAN).split("\n")[-2].strip() == yes_no, "the confirmation's buttons")
            driver.send("state", "cancels=0 window=1")
        driver.send("progress 0", "ok")
        window_shows(s, 296, 173, 0)
        # Yes: cancelled once, the LZMA loop's flag set, the window gone.
        click(s, 296, 173, 515, 15)
        s.answer(YES, "INSTALLER_CONFIRM_QUIT", GERMAN)
        driver.send("state", "cancels=1 window=0")
        driver.close()

        # Japanese. No Japanese font: no font is made, and each request searches again. A Japanese font, none of the
        # candidates: the system's choice for an empty face name at the default size, made once; the boxes, which the
        # hook gives that font, keep their labels.
        s.wine("reg", "add", key, "/v", "Language", "/d", "Japanese", "/f")
        driver = Driver(s, ["/usr/share/fonts/truetype/dejavu"])
        driver.send("dialogfont", "none")
        driver.send("dialogfont", "none")
        check(driver.close().count("Trace: Finding dialog font") == 2, "a missing font must be searched again")
        driver = Driver(s, ["/usr/share/fonts/truetype/dejavu", "/usr/share/fonts/opentype/ipafont-gothic"])
        driver.send("dialogfont", "'' 14 400")
        check(driver.send("ask OK?", "yes", button=YES, expected="OK?", language=JAPANESE) ==
              f"[{YES} はい] [{NO} いいえ]", "the Japanese labels")
        log = driver.close()
        check(log.count("Trace: Finding dialog font") == 1 and "Info: Created font: IPAGothic" in log, "font choice")
    finally:
        s.forget_fonts()
        s.forget_game()
        s.end_wine()  # no Wine process keeps the fonts it was shown


SCENARIOS = [
    ("start-up", start_up),  # no game: the language dialog, the not-installed box, the log's exact format
    ("patch over HTTP", patch_1_to_2),  # signed addresses, both questions in the registry's language, the game started
    ("killed", scenario_killed),  # SIGKILL (as TerminateProcess) at seeded moments of stage two, a chain 1 to 3
    ("reinstall", scenario_reinstall),  # -1 without a record: the complete build, the temporary folder on T:
    ("repair", scenario_repair),  # the complete build over a conflicting tree; read-only files; dotted versions
    # SIGKILL in stage one: a cancel in the next start removes what it kept, or the next start fetches only the rest
    ("killed download", scenario_killed_download),
    ("cancel preparation", scenario_cancel_preparation),  # "Cancel" then Yes while a large file is unpacked
    ("locked file", scenario_locked_file),  # the retry question: Retry, then Cancel
    ("hostile", scenario_hostile),  # refused patches leave everything as it was
    ("trust", scenario_trust),  # the latest version's statement, two keys, never back, a patch made for another version
    ("German", lambda s, run: patch_1_to_2(s, run, GERMAN)),
    ("Japanese", lambda s, run: patch_1_to_2(s, run, JAPANESE)),
    ("program folder", lambda s, run: patch_1_to_2(s, run, location="", beside=run.folder / "updater")),
    ("component removal", scenario_component_removal),  # mode 1: corvid.dll in the installation, not where started
    ("settings removal", scenario_settings_removal),  # mode 2 answered No and Yes
    ("uninstall clean-up", scenario_uninstall_cleanup),  # mode 3: what the record lists inside the installation only
    # RunElevated ("runas", granted by Wine) as the rights check starts it: the copy reads the starting user's key
    # under HKEY_USERS by -SID (its language: Polish), its exit code comes back.
    ("elevated copy", scenario_elevated_copy),
    ("second copy", scenario_second_copy),  # the instance-running box
    ("window", scenario_window),  # the progress window, its boxes and fonts, as window_driver shows them
]


def main():
    session = Session(sys.argv[1])
    failures, began = 0, time.monotonic()
    try:
        for name, scenario in SCENARIOS:
            if sys.argv[2:] and name not in sys.argv[2:]:
                continue
            start = time.monotonic()
            try:
                scenario(session, Run(session, name.replace(" ", "_")))
                print(f"ok    {name} ({time.monotonic() - start:.1f} s)", flush=True)
            except AssertionError as error:
                failures += 1
                print(f"FAIL  {name} ({time.monotonic() - start:.1f} s): {error}", flush=True)
                session.wine("taskkill", "/f", "/im", "served_updater.exe", check=False)
    finally:
        session.close()
    print(f"e2e scenarios: {time.monotonic() - began:.0f} s, {failures} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
