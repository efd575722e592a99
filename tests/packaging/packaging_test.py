"""Makes the Debian packages, installs them into an empty root, and tries what is in there."""
import contextlib
import os
import pathlib
import queue
import re
import shutil
import signal
import socket
import subprocess
import sys
import tempfile
import threading
import unittest
import wave

SOURCE, BUILD = (pathlib.Path(argument) for argument in sys.argv[1:3])
LIBRARIES = "lib/" + subprocess.check_output(["dpkg-architecture", "-qDEB_HOST_MULTIARCH"], text=True).strip()
DEADLINE = 20  # seconds


def run(*command, **options):
    """Runs to success and returns what was printed."""
    done = subprocess.run([str(word) for word in command], text=True, stdout=subprocess.PIPE,
                          stderr=subprocess.STDOUT, timeout=120, check=False, **options)
    if done.returncode != 0:
        raise AssertionError(f"{command} ended with {done.returncode}:\n{done.stdout}")
    return done.stdout


def make_packages(folder):
    run("cpack", "-G", "DEB", "--config", BUILD / "CPackConfig.cmake", "-B", folder)
    return {package.name.split("_")[0]: package for package in folder.glob("*.deb")}


class Root:
    """An empty root to install packages into. Their dependencies are those of the machine that runs the test."""

    def __init__(self, path):
        self.path = path
        database = path / "var/lib/dpkg"
        for name in ("info", "updates"):
            (database / name).mkdir(parents=True)
        (database / "status").touch()
        # What the packages ask of it is done in the root, not on the machine, for which it takes no rights.
        self.programs = path / "programs"
        self.programs.mkdir()
        ldconfig = self.programs / "ldconfig"
        ldconfig.write_text(f"#!/bin/sh\nexec {shutil.which('ldconfig', path='/usr/sbin:/sbin')} -N -r {path}\n")
        ldconfig.chmod(0o755)

    def dpkg(self, *arguments):
        run("dpkg", f"--root={self.path}", f"--log={self.path}/log", "--force-depends", "--force-not-root",
            "--force-script-chrootless", *arguments,
            env={**os.environ, "PATH": f"{self.programs}:{os.environ['PATH']}:/usr/local/sbin:/usr/sbin:/sbin"})

    def files(self):
        found = {path.relative_to(self.path) for path in self.path.rglob("*") if not path.is_dir()}
        return {str(path) for path in found if not path.is_relative_to("var/lib/dpkg")} - {"log", "programs/ldconfig"}


def make_song(path):
    with wave.open(str(path), "wb") as song:
        song.setnchannels(1)
        song.setsampwidth(2)
        song.setframerate(8000)
        song.writeframes(bytes(2 * 8000 // 4))


class SoundServer:
    """A sound server of our own, which throws away what it plays and tells of every stream."""

    def __init__(self, folder):
        self.environment = {"PULSE_SERVER": f"unix:{folder}/native", "PULSE_RUNTIME_PATH": str(folder),
                            "PULSE_STATE_PATH": str(folder)}
        self.process = subprocess.Popen(
            ["pulseaudio", "-n", "--daemonize=no", "--use-pid-file=no", "--exit-idle-time=-1", "--log-target=stderr",
             "--log-level=info", "-L", "module-null-sink", "-L",
             f"module-native-protocol-unix auth-anonymous=1 socket={folder}/native"],
            stderr=subprocess.PIPE, text=True, env={**os.environ, **self.environment})
        self.lines = queue.SimpleQueue()
        self.reader = threading.Thread(target=self.read)
        self.reader.start()

    def __enter__(self):
        self.wait_for("Daemon startup complete")
        return self

    def __exit__(self, *_):
        self.process.terminate()
        self.process.wait(DEADLINE)
        self.reader.join()
        self.process.stderr.close()

    def read(self):
        for line in self.process.stderr:
            self.lines.put(line)

    def wait_for(self, text):
        while text not in self.lines.get(timeout=DEADLINE):
            pass


class TheInstalledPackages(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        # Not in /tmp, which the confined service has for itself.
        place = "/var/tmp" if BUILD.resolve().is_relative_to("/tmp") else BUILD
        cls.folder = pathlib.Path(cls.enterClassContext(tempfile.TemporaryDirectory(dir=place)))
        cls.packages = make_packages(cls.folder)
        (cls.folder / "root").mkdir()
        cls.root = Root(cls.folder / "root")
        cls.root.dpkg("--install", *cls.packages.values())
        cls.prefix = cls.root.path / "usr"
        cls.song = cls.folder / "song.wav"
        make_song(cls.song)

    def environment(self, **more):
        kept = {name: os.environ[name] for name in ("PATH", "HOME") if name in os.environ}
        return {**kept, "XDG_RUNTIME_DIR": str(self.folder), "LANG": "C.UTF-8", **more}

    @contextlib.contextmanager
    def service(self, wrapper=(), **variables):
        """The service as the service manager starts it: with its socket, from when it says that it is ready. It is silent
        unless a sound server is named."""
        variables = {"TARND_SOUND": "none"} | variables if "PULSE_SERVER" not in variables else variables
        path = self.folder / "ostrel.tarnd"
        with socket.socket(socket.AF_UNIX) as listener, \
                socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as readiness:
            listener.bind(str(path))
            listener.listen()
            readiness.bind(str(self.folder / "notify"))
            readiness.settimeout(DEADLINE)
            process = subprocess.Popen(
                ["sh", "-c", f'exec 3<&{listener.fileno()}; LISTEN_PID=$$ exec "$@"', "sh", *wrapper,
                 self.prefix / "bin/tarnd"],
                pass_fds=[listener.fileno()],
                env=self.environment(LISTEN_FDS="1", LISTEN_FDNAMES="ostrel.tarnd",
                                     NOTIFY_SOCKET=str(self.folder / "notify"), **variables))
            try:
                self.assertIn(b"READY=1", readiness.recv(4096))
                yield process
            finally:
                process.send_signal(signal.SIGTERM)
                status = process.wait(DEADLINE)
                path.unlink(missing_ok=True)
                (self.folder / "notify").unlink()
        self.assertEqual(status, 0)

    def tarnctl(self, *arguments):
        return run(self.prefix / "bin/tarnctl", *arguments, env=self.environment())

    def test_are_split_as_debian_splits_them(self):
        library = next(name for name in self.packages if re.fullmatch(r"libtarn[0-9.]+", name))
        self.assertEqual(set(self.packages), {"tarnd", "tarnctl", library, "libtarn-dev", "python3-tarn", "tarn-doc"})
        homes = {"bin/tarnd": "tarnd", "lib/systemd/user/tarnd.socket": "tarnd", "bin/tarnctl": "tarnctl",
                 f"{LIBRARIES}/libtarn.so." + library.removeprefix("libtarn"): library, f"{LIBRARIES}/libtarn.so": "libtarn-dev",
                 "include/tarn/Client.h": "libtarn-dev", "share/tarn/proto/velmo.proto": "libtarn-dev",
                 "lib/python3/dist-packages/tarn/proto/velmo.proto": "python3-tarn",
                 "share/doc/tarn/protocol.md": "tarn-doc"}
        listed = {name: run("dpkg-deb", "--contents", package) for name, package in self.packages.items()}
        for file, home in homes.items():
            holders = [name for name, content in listed.items()
                       if re.search(rf" \./usr/{re.escape(file)}(?: ->.*)?$", content, re.MULTILINE)]
            self.assertEqual(holders, [home], file)
        for name in self.packages:
            self.assertIn("No licence", (self.prefix / "share/doc" / name / "copyright").read_text())

    def test_leave_nothing_behind(self):
        path = self.folder / "purged"
        path.mkdir()
        root = Root(path)
        root.dpkg("--install", *self.packages.values())
        enabled = "etc/systemd/user/sockets.target.wants/tarnd.socket"
        self.assertIn(enabled, root.files())
        root.dpkg("--install", self.packages["tarnd"])  # again, as an upgrade does
        root.dpkg("--remove", "tarnd")
        self.assertNotIn("usr/bin/tarnd", root.files())
        root.dpkg("--install", self.packages["tarnd"])
        self.assertIn(enabled, root.files())
        root.dpkg("--purge", *self.packages)
        self.assertEqual(root.files(), set())

    @unittest.skipUnless(shutil.which("lintian"), "lintian is not installed")
    def test_satisfy_lintian(self):
        run("lintian", "--allow-root", "--fail-on", "error,warning", *self.packages.values())

    def test_serves_from_the_socket_it_is_given(self):
        with self.service():
            self.assertIn("0:00", self.tarnctl("info", self.song))
            self.assertIn("song.wav", self.tarnctl("play", self.song))

    def test_plays_as_confined_as_its_unit_says(self):
        namespaces = ("unshare", "--user", "--map-root-user", "--mount", "--net", "--ipc", "--uts")
        if subprocess.run([*namespaces, "true"], stderr=subprocess.DEVNULL, check=False).returncode != 0:
            self.skipTest("this machine does not let us make namespaces")
        unit = self.prefix / "lib/systemd/user/tarnd.service"
        confined = pathlib.Path(__file__).with_name("confined.py")
        wrapper = (*namespaces, "/usr/bin/python3", confined, unit)
        with SoundServer(self.folder) as sound, self.service(wrapper, **sound.environment) as process:
            self.assertIn("song.wav", self.tarnctl("play", self.song))
            sound.wait_for("Created input")
            status = dict(line.split(":\t", 1) for line in
                          pathlib.Path(f"/proc/{process.pid}/status").read_text().splitlines())
            self.assertEqual((status["Seccomp"], status["NoNewPrivs"], status["Umask"]), ("2", "1", "0077"))
            for capabilities in ("CapPrm", "CapEff", "CapBnd", "CapAmb"):
                self.assertEqual(int(status[capabilities], 16), 0, capabilities)
            devices = os.listdir(f"/proc/{process.pid}/root/dev")
            self.assertEqual(set(devices), {"null", "zero", "full", "random", "urandom", "tty", "shm"})
            self.assertFalse(os.listdir(f"/proc/{process.pid}/root/tmp"))
            # Well below TasksMax and MemoryMax, which it takes a service manager to enforce.
            self.assertLess(int(status["Threads"]), 32)
            self.assertLess(int(status["VmHWM"].split()[0]), 256 * 1024)
            self.play_what_only_the_client_sees()

    def play_what_only_the_client_sees(self):
        """The /tmp of the confined service is another one than the client's."""
        with tempfile.TemporaryDirectory(dir="/tmp") as folder:
            song = pathlib.Path(folder, "private.wav")
            make_song(song)
            refused = subprocess.run([self.prefix / "bin/tarnctl", "play", song], env=self.environment(), text=True,
                                     capture_output=True, timeout=DEADLINE, check=False)
            self.assertEqual(refused.returncode, 1)
            self.assertIn("could not be opened", refused.stderr)
            self.assertIn("Played everything", self.tarnctl("play", "--grant", song))

    def test_speaks_the_users_language(self):
        with self.service(LANG="de_DE.UTF-8"):
            answer = subprocess.run([self.prefix / "bin/tarnctl", "send", "playerItem.getCurrentTime identifier=x"],
                                    env=self.environment(), text=True, capture_output=True, timeout=DEADLINE,
                                    check=False)
        self.assertIn("Ein unbekannter Fehler ist aufgetreten.", answer.stdout + answer.stderr)

    def test_lets_programs_be_built_with_its_library(self):
        with self.subTest("find_package"):
            build = self.folder / "example"
            run("cmake", "-S", SOURCE / "docs/examples/cpp", "-B", build, f"-DCMAKE_PREFIX_PATH={self.prefix}")
            run("cmake", "--build", build)
            with self.service():
                self.assertIn("0.25 s", run(build / "play", self.song, env=self.environment()))
        with self.subTest("pkg-config"):
            flags = run("pkg-config", "--cflags", "--libs", "libtarn",
                        env=self.environment(PKG_CONFIG_PATH=str(self.prefix / LIBRARIES / "pkgconfig"),
                                             PKG_CONFIG_ALLOW_SYSTEM_CFLAGS="1", PKG_CONFIG_ALLOW_SYSTEM_LIBS="1"))
            self.assertIn(f"-I{self.prefix.resolve()}/include",
                          " ".join(self.resolved(flag) for flag in flags.split()))
            run("c++", "-std=c++20", SOURCE / "docs/examples/cpp/play.cpp", "-o", self.folder / "play", *flags.split())
            run("cc", "-std=c99", "-Wall", "-Werror", "-pedantic", SOURCE / "docs/examples/c/play.c", "-o", self.folder / "play",
                *flags.split(), f"-Wl,-rpath,{self.prefix / LIBRARIES}")
            with self.service():
                self.assertIn("0.25 s", run(self.folder / "play", self.song, env=self.environment()))
                self.assertIn("FAILED", run("sh", "-c", f"{self.folder / 'play'} /none || echo FAILED", env=self.environment()))

    @staticmethod
    def resolved(flag):
        return flag[:2] + str(pathlib.Path(flag[2:]).resolve())

    def test_lets_programs_be_built_from_its_messages(self):
        protos = self.prefix / "share/tarn/proto"
        run("protoc", f"--python_out={self.folder}", f"-I{protos}", "velmo.proto", "transport.proto")
        with self.service():
            run("/usr/bin/python3", SOURCE / "docs/examples/python/play.py", self.song,
                env=self.environment(PYTHONPATH=str(self.folder)))

    def test_brings_units_that_are_hardened(self):
        unit = self.prefix / "lib/systemd/user/tarnd.service"
        self.assertIn("ExecStart=/usr/bin/tarnd\n", unit.read_text())
        run("systemd-analyze", "security", "--offline=true", "--threshold=15", unit)
        # The manager looks for the program where the unit says; here it is in the root.
        units = self.folder / "units"
        units.mkdir()
        (units / "tarnd.service").write_text(unit.read_text().replace("/usr/bin", str(self.prefix / "bin")))
        shutil.copy(unit.with_name("tarnd.socket"), units)
        man = {"MANPATH": str(self.prefix / "share/man")}
        self.assertEqual(run("systemd-analyze", "verify", "--user", "--recursive-errors=no", units / "tarnd.socket",
                             units / "tarnd.service", env=self.environment(**man)), "")

    def test_brings_manual_pages_without_faults(self):
        pages = sorted((self.prefix / "share/man").rglob("*.gz"))
        self.assertEqual([page.name for page in pages], ["tarnctl.1.gz", "tarn-protocol.7.gz", "tarnd.8.gz"])
        for page in pages:
            complaints = subprocess.run(["man", "--warnings", "-E", "UTF-8", "-Tutf8", "-l", page], text=True,
                                        stdout=subprocess.DEVNULL, stderr=subprocess.PIPE, check=True,
                                        env={**os.environ, "MANWIDTH": "80"}).stderr
            self.assertEqual(complaints, "", page.name)

    def test_is_described_to_desktops(self):
        run("desktop-file-validate", self.prefix / "share/applications/ostrel.tarnctl.desktop")
        run("appstreamcli", "validate", "--no-net",
            self.prefix / "share/metainfo/ostrel.pellion.tarnctl.metainfo.xml")

    def test_completes_in_every_shell_what_the_tool_offers(self):
        verbs = re.findall(r"^  ([a-z]+) ", self.tarnctl("--help").split("Subcommands:")[1], re.MULTILINE)
        share = self.prefix / "share"
        bash = f"""compopt() {{ echo :files; }}; . {share}/bash-completion/completions/tarnctl
            COMP_WORDS=("$@"); COMP_CWORD=$(($# - 1)); _tarnctl; printf '%s\n' "${{COMPREPLY[@]}}" """
        zsh = f"""_call_program() {{ shift; eval "$@" }}; _files() {{ print :files }}
            _describe() {{ print -rl -- ${{${{(P)2}}%%:*}} }}
            words=("$@"); CURRENT=$#; . {share}/zsh/vendor-completions/_tarnctl || true"""
        fish = f"""function __fish_complete_path; echo :files; end; source {share}/fish/vendor_completions.d/tarnctl.fish
            complete -C "$argv" """
        for shell in (("bash", "-c", bash, "bash"), ("zsh", "-f", "-c", zsh, "zsh"), ("fish", "-c", fish)):
            def complete(*words):
                printed = run(*shell, "tarnctl", *words,
                              env=self.environment(PATH=f"{self.prefix}/bin:{os.environ['PATH']}"))
                return {line.split("\t")[0] for line in printed.splitlines()} - {""}

            with self.subTest(shell[0]):
                self.assertEqual(complete(""), set(verbs))
                for verb in verbs:
                    self.assertEqual(complete(verb, "--"), set(re.findall(r"--[a-z]+", self.tarnctl(verb, "--help"))))
                self.assertEqual(complete("--socket", "path", "play", ""), {":files"})
                self.assertEqual(complete("send", "asset.d"), {"asset.destroy"})
                self.assertEqual(complete("play", "--rate", ""), set())


if __name__ == "__main__":
    if not shutil.which("dpkg-shlibdeps"):
        sys.exit("dpkg-shlibdeps is missing: script/setup installs it")
    unittest.main(argv=[sys.argv[0], *sys.argv[3:]], verbosity=2)
