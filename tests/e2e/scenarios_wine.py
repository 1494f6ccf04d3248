#!/usr/bin/env python3
"""IronvaleUpdater.exe under Wine the way a player's machine runs it.

The installed game is registered in the Wine registry, patches and builds
come from the publisher's ironvale-patch, nginx serves them on 127.0.0.1
(or the program's own folder, or a file:// location), the window is on a
private Xvfb display, and dialog_answer plays the player. Every scenario is
one row of SCENARIOS; each checks the exit code, the boxes shown, the final
tree byte for byte, the installed version, the log and what was left.

  scenarios_wine.py BUILD_DIR [NAME...]   (the Windows build folder)
"""
import os
import random
import shutil
import signal
import socket
import subprocess
import sys
import tempfile
import time
from pathlib import Path

ROOT = Path(__file__).resolve().parents[2]
YES, NO, OK, CANCEL, RETRY = 6, 7, 1, 2, 4


def fail(message):
    raise AssertionError(message)


# ---------------------------------------------------------------- the game
def version_tree(number, big=False):
    """The game at a version: files edited, added and removed from one version
    to the next, a file that becomes a folder, and the game's executable. The
    big game replaces hundreds of small files, so its stage two takes long
    enough to be interrupted at many moments."""
    rng = random.Random(number)
    tree = {}
    for i in range(12):
        if (i + number) % 7 == 0:
            continue  # removed in this version (back in others)
        tree[f"data{i % 3}/file{i}.bin"] = bytes(rng.randrange(256) for _ in range(300 + i * 37)) + b"v%d" % number
    if number >= 2:
        tree["maps/level.map"] = b"level two"
    else:
        tree["maps"] = b"a file where version 2 has a folder"
    for i in range(400 if big else 0):
        tree[f"sounds{i % 4}/v{number}_{i}.ogg"] = b"sound %d of version %d" % (i, number)
    return tree


class Session:
    def __init__(self, build):
        self.build = Path(build).resolve()
        self.programs = self.build / "tests/support/programs"
        self.work = Path(tempfile.mkdtemp(prefix="ivl-e2e-"))
        self.env = dict(os.environ, WINEPREFIX=str(self.build / "wineprefix"), WINEDEBUG="-all")
        self.log = self.find_log()
        self.tool = self.native_tool()
        self.xvfb = self.start_display()
        self.nginx, self.port = self.start_nginx()
        # Without a window manager Wine waits for one after every closed box.
        for program in ("IronvaleUpdater.exe", "served_updater.exe"):
            self.wine("reg", "add", f"HKCU\\Software\\Wine\\AppDefaults\\{program}\\X11 Driver", "/v", "Managed",
                      "/t", "REG_SZ", "/d", "N", "/f")
        self.strings = {}
        for line in (ROOT / "resources/strings.tsv").read_text(encoding="utf-8").splitlines():
            cells = line.split("\t")
            if cells[0].startswith("INSTALLER_"):
                self.strings[cells[0]] = cells[1:]

    def text(self, key, language=0):
        return self.strings[key][language] or self.strings[key][0]

    def caption(self, language=0):
        return self.text("INSTALLER_GAME_NAME", language) + " - " + self.text("INSTALLER_UPDATER_HEADER", language)

    def find_log(self):
        users = self.build / "wineprefix/drive_c/users" / os.environ.get("USER", "root")
        for temp in (users / "Temp", users / "AppData/Local/Temp"):
            if temp.is_dir():
                return temp / "IronvaleUpdater.log"
        return users / "Temp/IronvaleUpdater.log"

    def native_tool(self):
        for preset in ("native-asan", "native", "native-release"):
            tool = ROOT / "build" / preset / "tools/ironvale-patch"
            if tool.exists():
                return tool
        subprocess.run(["cmake", "--preset", "native"], cwd=ROOT, check=True, stdout=subprocess.DEVNULL)
        subprocess.run(["cmake", "--build", "--preset", "native", "--target", "ironvale-patch"], cwd=ROOT,
                       check=True, stdout=subprocess.DEVNULL)
        return ROOT / "build/native/tools/ironvale-patch"

    def start_display(self):
        # No reset when the last client leaves: Wine's later windows would fail.
        read, write = os.pipe()
        xvfb = subprocess.Popen(
            ["Xvfb", "-displayfd", str(write), "-screen", "0", "1024x768x24", "-nolisten", "tcp", "-noreset"],
            pass_fds=[write], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        os.close(write)
        number = os.read(read, 32).decode().split()[0]
        os.close(read)
        self.env["DISPLAY"] = ":" + number
        return xvfb

    def start_nginx(self):
        served = self.work / "server"
        served.mkdir()
        with socket.socket() as probe:
            probe.bind(("127.0.0.1", 0))
            port = probe.getsockname()[1]
        config = self.work / "nginx.conf"
        config.write_text(f"""daemon off; pid {self.work}/nginx.pid; error_log {self.work}/nginx-error.log;
events {{}}
http {{
  access_log {self.work}/access.log; client_body_temp_path {self.work}; proxy_temp_path {self.work};
  fastcgi_temp_path {self.work}; uwsgi_temp_path {self.work}; scgi_temp_path {self.work};
  server {{ listen 127.0.0.1:{port}; root {served};
    location /slow/ {{ alias {served}/; limit_rate 64k; }} }}
}}
""")
        nginx = subprocess.Popen(["nginx", "-c", str(config)], stderr=subprocess.DEVNULL)
        for _ in range(100):
            with socket.socket() as client:
                if client.connect_ex(("127.0.0.1", port)) == 0:
                    return nginx, port
            time.sleep(0.05)
        fail("nginx did not start")

    def close(self):
        self.wine("reg", "delete", "HKCU\\Software\\Halvard", "/f", check=False)
        self.wine("reg", "delete", "HKLM\\Software\\Halvard", "/reg:32", "/f", check=False)
        for process in (self.nginx, self.xvfb):
            process.terminate()
            process.wait()
        shutil.rmtree(self.work, ignore_errors=True)

    # ------------------------------------------------------------ helpers
    def wine(self, *args, check=True, **options):
        return subprocess.run([str(ROOT / "scripts/wine-run.sh"), *map(str, args)], env=self.env, check=check,
                              stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, **options)

    def start(self, program, *args, env=None, cwd=None):
        return subprocess.Popen([str(ROOT / "scripts/wine-run.sh"), str(program), *args], env=env or self.env,
                                cwd=cwd, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    def answer(self, button, timeout_ms=30000, language=0, caption=None):
        """Waits for a box of the run, presses button (0: none) and returns its text."""
        done = self.wine(self.programs / "dialog_answer.exe", caption or self.caption(language), button, timeout_ms,
                         check=False)
        if done.returncode != 0:
            fail(f"no box to answer with {button}")
        return done.stdout.decode("utf-8", "replace").replace("\r", "")

    def peek(self, timeout_ms):
        """The text of a box of the run that is open now (it stays), or ""."""
        done = self.wine(self.programs / "dialog_answer.exe", self.caption(), 0, timeout_ms, check=False)
        return done.stdout.decode("utf-8", "replace").replace("\r", "") if done.returncode == 0 else ""

    def windows_path(self, path):
        return "Z:" + str(path).replace("/", "\\")

    def publish(self, old, new, version, out, extra=()):
        """ironvale-patch: the patch from tree old to tree new, the complete
        build of new, and version.txt."""
        out.mkdir(parents=True, exist_ok=True)
        trees = self.work / "trees"
        shutil.rmtree(trees, ignore_errors=True)
        for name, tree in (("old", old), ("new", new)):
            write_tree(trees / name, tree)
        quiet = dict(check=True, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        subprocess.run([self.tool, "build", "--from", trees / "old", "--to", trees / "new", "--version", version,
                        "--out", out, "--max-archive-size", "3000", *extra], **quiet)
        subprocess.run([self.tool, "build", "--complete", "--to", trees / "new", "--version", version, "--out", out],
                       **quiet)
        subprocess.run([self.tool, "version", "--out", out, version], **quiet)
        return out / f"patch_515195_{version}"

    def run_log(self):
        """The log lines of the last run."""
        lines = self.log.read_text(errors="replace").splitlines()
        starts = [i for i, line in enumerate(lines) if line.endswith("-" * 103)]
        return "\n".join(lines[starts[-1] if starts else 0:])


def write_tree(root, tree):
    shutil.rmtree(root, ignore_errors=True)
    root.mkdir(parents=True)
    for path, content in tree.items():
        target = root / path
        target.parent.mkdir(parents=True, exist_ok=True)
        target.write_bytes(content)


def read_tree(root, leave_out=()):
    tree = {}
    for path in sorted(root.rglob("*")):
        relative = path.relative_to(root).as_posix()
        if path.is_file() and relative.split("/")[0] not in leave_out:
            tree[relative] = path.read_bytes()
    return tree


OWN = ("InstallationData.xml", "Uninstall.xml", "UpdateHistory.log", "IronvaleGame.exe")


class Run:
    """One scenario's installation, server content and run."""

    def __init__(self, session, name):
        self.s = session
        self.folder = session.work / name
        self.install = self.folder / "Ironvale"
        self.outside = self.folder / "outside.txt"
        self.game_log = self.folder / "game.log"
        self.env = dict(session.env, IRONVALE_TEST_GAME_LOG=session.windows_path(self.game_log))

    def install_version(self, tree, version, language="English"):
        write_tree(self.install, tree)
        shutil.copy(self.s.programs / "fake_game.exe", self.install / "IronvaleGame.exe")
        self.set_version(version)
        self.outside.write_text("beside the game")
        key = "HKLM\\Software\\Halvard\\Ironvale"
        self.s.wine("reg", "add", key, "/v", "Install Dir", "/t", "REG_SZ", "/d",
                    self.s.windows_path(self.install) + "\\", "/reg:32", "/f")
        self.s.wine("reg", "add", key, "/v", "Language", "/t", "REG_SZ", "/d", language, "/reg:32", "/f")

    def set_version(self, version):
        (self.install / "InstallationData.xml").write_text(
            f'<?xml version="1.0" ?>\n<InstallationData>\n    <CurrentVersion>{version}</CurrentVersion>\n'
            "    <PatcherVersion>3</PatcherVersion>\n</InstallationData>\n")

    def version(self):
        text = (self.install / "InstallationData.xml").read_text()
        return text.split("<CurrentVersion>")[1].split("<")[0]

    def serve(self, location):
        self.env["IRONVALE_TEST_UPDATE_LOCATION"] = location

    def start(self, *args, program=None, cwd=None):
        return self.s.start(program or self.s.programs / "served_updater.exe", *args, env=self.env, cwd=cwd)

    def finish(self, process, code=1, timeout=120):
        try:
            ended = process.wait(timeout)
        except subprocess.TimeoutExpired:
            process.kill()
            fail("the run did not end (a box nobody expected?)")
        if ended != (code & 0xFF):
            fail(f"exit code {ended}, expected {code}")

    def expect(self, tree, version, game=None, leftovers=False):
        if read_tree(self.install, OWN) != {k: v for k, v in tree.items() if k not in OWN}:
            fail("the installed tree is not the expected version")
        if self.version() != version:
            fail(f"installed version {self.version()}, expected {version}")
        if self.outside.read_text() != "beside the game":
            fail("the file beside the installation changed")
        left = [own for own in ("tempPatch", "PPF.xml", "_PPF.xml") if (self.install / own).exists()]
        if left and not leftovers:
            fail(f"left over: {left}")
        # The game runs on after the updater has ended.
        for _ in range(100 if game else 0):
            if self.game_log.exists():
                break
            time.sleep(0.05)
        started = self.game_log.read_text(errors="replace") if self.game_log.exists() else None
        if game == "":  # either way
            return
        if game is None and started is not None:
            fail(f"the game was started: {started}")
        if game is not None and (started is None or game not in started):
            fail(f"the game was not started with '{game}': {started}")


def kill_run(session, name="served_updater.exe"):
    session.wine("taskkill", "/f", "/im", name, check=False)


def terminate(process):
    """Ends the program at once, as TerminateProcess does: SIGKILL to the
    Wine process that runs it (a taskkill would start 0.15 s late)."""
    process.send_signal(signal.SIGKILL)
    process.wait()


# ------------------------------------------------------------- scenarios
def plain_patch(s, run, language=0, signed=True):
    """The patch from 1 to 2 over HTTP: the question, the update, the offer
    to start the game (Yes), in the language of the registry."""
    s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    run.install_version(version_tree(1), "1", ["English", "", "German", "", "Japanese"][language])
    run.serve(f"http://127.0.0.1:{s.port}/")
    process = run.start()
    asked = run.s.answer(YES, language=language)
    if s.text("INSTALLER_PATCH_CONFIRM_UPADATE", language) not in asked or "1" not in asked:
        fail(f"update question: {asked}")
    done = s.answer(YES, language=language)
    if s.text("INSTALLER_SUCCESS_PATCH", language) not in done:
        fail(f"success box: {done}")
    run.finish(process)
    run.expect(version_tree(2), "2", game="+webSiteHostName")
    if signed:
        requests = [line for line in (s.work / "access.log").read_text().splitlines() if "patch_515195_2" in line]
        if not requests or any("e=" not in line or "h=" not in line for line in requests):
            fail(f"unsigned patch requests: {requests}")


def scenario_patch_http(s, run):
    plain_patch(s, run)
    if "Patch URL:http://127.0.0.1" not in s.run_log():
        fail("no Patch URL line in the log")


def scenario_german(s, run):
    plain_patch(s, run, language=2, signed=False)


def scenario_japanese(s, run):
    plain_patch(s, run, language=4, signed=False)


def interrupted_at_minus_one(s, run):
    """Version 1 being patched to 2: stage two killed half-way leaves -1 and
    its record behind."""
    s.publish(version_tree(1, big=True), version_tree(2, big=True), "2", s.work / "server")
    run.install_version(version_tree(1, big=True), "1")
    run.serve(f"http://127.0.0.1:{s.port}/")
    for delay in (0.05, 0.1, 0.2, 0.4):
        process = run.start("-latestVersion", "2")
        s.answer(YES)
        while "ApplyPatch Start" not in s.run_log() and process.poll() is None:
            time.sleep(0.005)
        time.sleep(delay)
        terminate(process)
        if run.version() == "-1":
            return
        run.install_version(version_tree(1, big=True), "1")
    fail("no kill landed in stage two")


def scenario_chain_resume(s, run):
    interrupted_at_minus_one(s, run)
    s.publish(version_tree(2, big=True), version_tree(3, big=True), "3", s.work / "server")
    process = run.start()
    # The record is finished without a question; then the newer version.
    asked = s.answer(YES)
    if "2" not in asked or "3" not in asked:
        fail(f"second pass question: {asked}")
    s.answer(NO)
    run.finish(process)
    run.expect(version_tree(3, big=True), "3")
    history = (run.install / "UpdateHistory.log").read_text().splitlines()
    if len(history) != 2 or not history[0].endswith("patch_515195_2") or not history[1].endswith("patch_515195_3"):
        fail(f"history: {history}")


def scenario_reinstall(s, run):
    s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    damaged = dict(version_tree(2))
    damaged.pop(sorted(damaged)[0])
    run.install_version(damaged, "-1")
    run.serve(f"http://127.0.0.1:{s.port}/")
    process = run.start("-latestVersion", "2")
    s.answer(NO)  # start the game?
    run.finish(process)
    run.expect(version_tree(2), "2")
    if "build_2" not in s.run_log():
        fail("the complete build was not fetched")


def scenario_terminate(s, run):
    """TerminateProcess at seeded moments of stage two, then a clean start."""
    rng = random.Random(16)
    s.publish(version_tree(1, big=True), version_tree(2, big=True), "2", s.work / "server")
    run.serve(f"http://127.0.0.1:{s.port}/")
    for trial in range(12):
        run.install_version(version_tree(1, big=True), "1")
        process = run.start("-latestVersion", "2")
        s.answer(YES)
        while "ApplyPatch Start" not in s.run_log() and process.poll() is None:
            time.sleep(0.005)
        time.sleep(rng.random() * 0.5)
        terminate(process)
        # The next start asks again unless it finishes from the record.
        process = run.start("-latestVersion", "2")
        while process.poll() is None:
            text = s.peek(2000)
            if text:
                s.answer(YES if s.text("INSTALLER_PATCH_CONFIRM_UPADATE") in text else NO)
        if process.returncode != 1:
            fail(f"trial {trial}: the second start ended with {process.returncode}")
        # Killed after the new version was stored, the second start finds
        # it up to date and starts the game.
        run.expect(version_tree(2, big=True), "2", game="")
        run.game_log.unlink(missing_ok=True)


def cancel_in_window(s, run, wait_for):
    process = run.start("-latestVersion", "2")
    s.answer(YES)
    while wait_for not in s.run_log() and process.poll() is None:
        time.sleep(0.05)
    # The window is centred on the 1024 x 768 screen; "Cancel" is at (435, 443) in it.
    subprocess.run(["xdotool", "mousemove", str((1024 - 532) // 2 + 435), str((768 - 481) // 2 + 443), "click", "1"],
                   env=s.env, check=True)
    asked = s.answer(YES)
    if s.text("INSTALLER_CONFIRM_CANCEL") not in asked:
        fail(f"cancel question: {asked}")
    run.finish(process)
    run.expect(version_tree(1), "1")


def scenario_cancel_download(s, run):
    """A slow server: "Cancel" while the archive of a large new file arrives."""
    new = dict(version_tree(2))
    new["data0/noise.bin"] = random.Random(5).randbytes(400000)
    s.publish(version_tree(1), new, "2", s.work / "server")
    run.install_version(version_tree(1), "1")
    run.serve(f"http://127.0.0.1:{s.port}/slow/")
    cancel_in_window(s, run, ".lzma")


def scenario_cancel_preparation(s, run):
    """A new file of incompressible bytes takes a second or two to unpack:
    "Cancel" meanwhile. Its archive member is made by xz (quickly, in the
    archive's own layout: name length, name, 40-bit size, LZMA data)."""
    patch = run.folder / "served" / "patch_515195_2"
    patch.mkdir(parents=True)
    lzma = subprocess.run(["xz", "--format=lzma", "-0", "-T1", "-c"], input=random.Random(3).randbytes(24 << 20),
                          stdout=subprocess.PIPE, check=True).stdout
    name = b"data0\\large.bin"
    (patch / "patch0.lzma").write_bytes(bytes([len(name)]) + name + len(lzma).to_bytes(5, "little") + lzma)
    describe(patch, '<FileChanges><new Path="data0\\large.bin" File="patch0.lzma" /></FileChanges>')
    run.install_version(version_tree(1), "1")
    run.serve("file://" + s.windows_path(run.folder / "served"))
    cancel_in_window(s, run, "Decoding file: data0\\large.bin")


def scenario_missing_patch_play(s, run):
    s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    run.install_version(version_tree(1), "1")
    run.serve(f"http://127.0.0.1:{s.port}/")
    process = run.start("-latestVersion", "7")
    s.answer(YES)
    asked = s.answer(YES)
    if s.text("INSTALLER_ERROR_PLAY_OLD_VERSION") not in asked:
        fail(f"play-old question: {asked}")
    run.finish(process)
    run.expect(version_tree(1), "1", game="+webSiteHostName")


def scenario_locked_file(s, run):
    s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    changed = next(p for p, c in version_tree(2).items() if p in version_tree(1) and version_tree(1)[p] != c)
    for button in (RETRY, CANCEL):
        run.install_version(version_tree(1), "1")
        run.serve(f"http://127.0.0.1:{s.port}/")
        holder = subprocess.Popen([str(ROOT / "scripts/wine-run.sh"), str(s.programs / "hold_file.exe"),
                                   s.windows_path(run.install / changed)], env=s.env, stdin=subprocess.PIPE,
                                  stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
        if holder.stdout.readline().strip() != b"held":
            fail("the file could not be held")
        process = run.start("-latestVersion", "2")
        s.answer(YES)
        asked = s.answer(0)
        if s.text("INSTALLER_FAILED_TO_MOVE_THE_FILE") not in asked:
            fail(f"retry question: {asked}")
        if button == RETRY:
            holder.stdin.close()
            holder.wait()
        s.answer(button)
        if button == RETRY:
            s.answer(NO)
            run.finish(process)
            run.expect(version_tree(2), "2")
        else:
            failed = s.answer(OK)
            if s.text("INSTALLER_ERROR_OCCURRED") not in failed:
                fail(f"error box: {failed}")
            run.finish(process)
            holder.stdin.close()
            holder.wait()
            if run.version() != "-1" or not (run.install / "PPF.xml").exists():
                fail("a failed stage two must stay resumable")
            process = run.start("-latestVersion", "2")
            s.answer(NO)  # finished from the record: start the game?
            run.finish(process)
            run.expect(version_tree(2), "2")


HOSTILE = {
    "traversal": '<FileChanges><delete Path="..\\outside.txt" /></FileChanges>',
    "the installation": '<DirectoryChanges><delete Path=".\\" /></DirectoryChanges>',
    "wildcard": '<FileChanges><delete Path="*.*" /></FileChanges>',
}


def hostile_patch(s, run, damage, expected):
    patch = s.publish(version_tree(1), version_tree(2), "2", s.work / "server")
    damage(patch)
    run.install_version(version_tree(1), "1")
    run.serve(f"http://127.0.0.1:{s.port}/")
    process = run.start("-latestVersion", "2")
    s.answer(YES)
    failed = s.answer(OK)
    if expected not in failed:
        fail(f"error box: {failed}")
    run.finish(process)
    run.expect(version_tree(1), "1")


def describe(patch, items):
    (patch / "patchinfo.xml").write_text(f"<IronvaleWestPatch>{items}</IronvaleWestPatch>")


def flip(archive, at):
    data = bytearray(archive.read_bytes())
    data[at] ^= 0xFF
    archive.write_bytes(bytes(data))


def scenario_hostile(s, run):
    for name, items in HOSTILE.items():
        hostile_patch(s, run, lambda patch: describe(patch, items), "Unsafe path")
    hostile_patch(s, run, lambda patch: (patch / "patchinfo.xml").write_text("not XML at all"),
                  "Failed to load patch info file")
    hostile_patch(s, run, lambda patch: (patch / "patch0.lzma").write_bytes((patch / "patch0.lzma").read_bytes()[:40]),
                  s.text("INSTALLER_ERROR_OCCURRED"))
    hostile_patch(s, run, lambda patch: flip(patch / "patch0.lzma", 60), s.text("INSTALLER_ERROR_OCCURRED"))


def scenario_up_to_date(s, run):
    run.install_version(version_tree(2), "2")
    run.serve(f"http://127.0.0.1:{s.port}/")
    process = run.start("-latestVersion", "2", "-hostname", "play.example.com")
    run.finish(process)
    run.expect(version_tree(2), "2", game="+webSiteHostName play.example.com")


def scenario_program_folder(s, run):
    beside = run.folder / "updater"
    s.publish(version_tree(1), version_tree(2), "2", beside)
    shutil.copy(s.build / "IronvaleUpdater.exe", beside)
    run.install_version(version_tree(1), "1")
    process = run.start(program=beside / "IronvaleUpdater.exe")
    s.answer(YES)
    s.answer(NO)
    run.finish(process)
    run.expect(version_tree(2), "2")


def scenario_file_location(s, run):
    s.publish(version_tree(1), version_tree(2), "2", run.folder / "served")
    run.install_version(version_tree(1), "1")
    run.serve("file://" + s.windows_path(run.folder / "served"))
    process = run.start("-latestVersion", "2")
    s.answer(YES)
    s.answer(NO)
    run.finish(process)
    run.expect(version_tree(2), "2")


def scenario_component_removal(s, run):
    for present in (True, False):
        run.install_version(version_tree(1), "1")
        if present:
            (run.install / "corvid.dll").write_text("component")
        decoy = run.folder / "cwd" / "corvid.dll"
        decoy.parent.mkdir(exist_ok=True)
        decoy.write_text("not the installation's")
        process = run.start("-kdl_gl_remove", "-silent", "-delete_corvid", cwd=decoy.parent)
        run.finish(process)
        run.expect(version_tree(1), "1", game="-kdl_gl_remove -silent" if present else None)
        if (run.install / "corvid.dll").exists() or decoy.read_text() != "not the installation's":
            fail("corvid.dll: the installation's must go, the decoy must stay")
        run.game_log.unlink(missing_ok=True)


def scenario_settings_removal(s, run):
    users = s.build / "wineprefix/drive_c/users" / os.environ.get("USER", "root")
    saves = (users / "Documents" if (users / "Documents").exists() else users / "My Documents") / "Ironvale"
    caption = s.text("INSTALLER_GAME_NAME") + " - " + s.text("INSTALLER_DIALOG_UNINSTALL")
    for button, kept in ((NO, True), (YES, False)):
        (saves / "saves").mkdir(parents=True, exist_ok=True)
        (saves / "saves" / "slot1.sav").write_text("progress")
        process = run.start("-doRemoveSettings", "true")
        asked = s.answer(button, caption=caption)
        if s.text("INSTALLER_REMOVE_SAVES_AND_SETTINGS") not in asked:
            fail(f"question: {asked}")
        run.finish(process)
        if saves.exists() != kept:
            fail(f"saved games {'removed' if kept else 'kept'} after {button}")


def scenario_uninstall_cleanup(s, run):
    run.install_version(version_tree(1), "1")
    for name in ("corvid.dll", "GL.ini", "pb/pb.dll"):
        (run.install / name).parent.mkdir(exist_ok=True)
        (run.install / name).write_text(name)
    listed = [p for p in version_tree(1) if "/" in p][:3]
    files = "".join(f'<new Path="{s.windows_path(run.install / p)}" />' for p in listed)
    files += f'<new Path="{s.windows_path(run.outside)}" /><new Path="{s.windows_path(run.install)}\\*" />'
    (run.install / "Uninstall.xml").write_text(
        f"<IronvaleWestPatch><FileChanges>{files}</FileChanges><RegistryHive>HKEY_LOCAL_MACHINE</RegistryHive>"
        "<RegistryPath>SOFTWARE\\Halvard\\Ironvale</RegistryPath></IronvaleWestPatch>")
    process = run.start("-doUninstallCleanup", "true")
    run.finish(process)
    remaining = read_tree(run.install)
    if any(p in remaining for p in listed + ["corvid.dll", "GL.ini", "pb/pb.dll"]):
        fail("the recorded files and components must be removed")
    if len(remaining) < 3 or run.outside.read_text() != "beside the game":
        fail("only what the record lists inside the installation may go")


def scenario_elevated_copy(s, run):
    """RunElevated ("runas"; Wine grants it without a prompt) starts the
    updater as the rights check would, with -SID: the copy reads the
    starting user's key under HKEY_USERS (its language: Polish) and its
    exit code comes back."""
    sid = "S-1-5-21-4242-4242-4242-1002"
    key = f"HKU\\{sid}\\Software\\Halvard\\Ironvale"
    s.wine("reg", "delete", "HKLM\\Software\\Halvard", "/reg:32", "/f", check=False)
    s.wine("reg", "add", key, "/v", "Install Dir", "/t", "REG_SZ", "/d", "C:\\Games\\Ironvale\\", "/f")
    s.wine("reg", "add", key, "/v", "Language", "/t", "REG_SZ", "/d", "Polish", "/f")
    try:
        process = s.start(s.programs / "run_elevated.exe", s.windows_path(s.build / "IronvaleUpdater.exe"),
                          "-doRemoveSettings", "true", "-internallyElevated", "1", "-SID", sid)
        polish = 5
        asked = s.answer(NO, caption=s.text("INSTALLER_GAME_NAME", polish) + " - " +
                         s.text("INSTALLER_DIALOG_UNINSTALL", polish))
        if s.text("INSTALLER_REMOVE_SAVES_AND_SETTINGS", polish) not in asked:
            fail(f"the copy asked: {asked}")
        run.finish(process)
    finally:
        s.wine("reg", "delete", f"HKU\\{sid}", "/f", check=False)


SCENARIOS = [
    # name                   what it shows
    ("patch over HTTP", scenario_patch_http),  # signed addresses, both questions, the game started
    ("chain 1 to 3", scenario_chain_resume),  # a record of an interrupted run resumed, then the newest
    ("reinstall", scenario_reinstall),  # -1 without a record: the complete build
    ("terminate", scenario_terminate),  # TerminateProcess in stage two, then a clean start
    ("cancel download", scenario_cancel_download),  # "Cancel" then Yes while an archive arrives
    ("cancel preparation", scenario_cancel_preparation),  # ... while a large file is unpacked
    ("missing patch", scenario_missing_patch_play),  # the play-old question; Yes starts the game
    ("locked file", scenario_locked_file),  # the retry question: Retry, then Cancel
    ("hostile", scenario_hostile),  # refused patches leave everything as it was
    ("German", scenario_german),
    ("Japanese", scenario_japanese),
    ("up to date", scenario_up_to_date),  # no question, the game started
    ("program folder", scenario_program_folder),  # relative locations beside the program
    ("file location", scenario_file_location),
    ("component removal", scenario_component_removal),  # mode 1 with and without corvid.dll
    ("settings removal", scenario_settings_removal),  # mode 2 answered No and Yes
    ("uninstall clean-up", scenario_uninstall_cleanup),  # mode 3 inside the installation only
    ("elevated copy", scenario_elevated_copy),  # runas with -SID: the starting user's key
]


def main():
    build = sys.argv[1]
    wanted = sys.argv[2:]
    session = Session(build)
    failures = 0
    began = time.monotonic()
    try:
        for name, scenario in SCENARIOS:
            if wanted and name not in wanted:
                continue
            start = time.monotonic()
            try:
                scenario(session, Run(session, name.replace(" ", "_")))
                print(f"ok    {name} ({time.monotonic() - start:.1f} s)", flush=True)
            except AssertionError as error:
                failures += 1
                print(f"FAIL  {name} ({time.monotonic() - start:.1f} s): {error}", flush=True)
                kill_run(session)
    finally:
        session.close()
    print(f"e2e scenarios: {time.monotonic() - began:.0f} s, {failures} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
