"""A private sound server with a null sink, test files, and a recorder that knows when it heard what."""

import os
import pathlib
import subprocess
import threading
import time

FRAME_SIZE = 4
RATE = 44100


class SoundServer:
    def __init__(self, folder: pathlib.Path):
        self.folder = folder
        self.environment = dict(os.environ, PULSE_SERVER=f"unix:{folder}/native", XDG_RUNTIME_DIR=str(folder),
                                PULSE_RUNTIME_PATH=str(folder), PULSE_STATE_PATH=str(folder), HOME=str(folder))
        self.process = subprocess.Popen(
            ["pulseaudio", "-n", "--daemonize=no", "--use-pid-file=no", "--exit-idle-time=-1",
             "-L", f"module-null-sink sink_name=out norewinds=1 format=s16le rate={RATE} channels=2",
             "-L", f"module-native-protocol-unix auth-anonymous=1 socket={folder}/native"],
            env=self.environment, stderr=subprocess.DEVNULL)
        wait_until(lambda: (folder / "native").exists(), "the sound server")

    def stop(self):
        self.process.terminate()
        self.process.wait()


class NoSoundServer:
    """Stands in for one where a service is to play in silence, away from the session's bus."""

    def __init__(self, folder: pathlib.Path):
        self.folder = folder
        self.environment = dict(os.environ, XDG_RUNTIME_DIR=str(folder), PULSE_SERVER=f"unix:{folder}/nobody",
                                HOME=str(folder), TARND_SOUND="none", DBUS_SESSION_BUS_ADDRESS="unix:path=/nowhere")

    def stop(self):
        pass


class Recorder:
    """Listens to the sink. Silence is exact zeros."""

    def __init__(self, server: SoundServer):
        self.process = subprocess.Popen(
            ["parec", "--raw", "--device=out.monitor", "--latency-msec=5", f"--rate={RATE}", "--format=s16le"],
            env=server.environment, stdout=subprocess.PIPE, bufsize=0)
        self.changed = threading.Condition()
        self.sounds = None
        self.last_sound = 0.0  # when the last sample came that was not silent
        self.since = time.monotonic()  # when that began
        threading.Thread(target=self._listen, daemon=True).start()
        self.wait(False)

    def _listen(self):
        while piece := self.process.stdout.read(1764):
            now = time.monotonic()
            sounds = piece.count(0) != len(piece)
            silent_tail = len(piece) - len(piece.rstrip(b"\0")) if sounds else 0
            with self.changed:
                if sounds:
                    self.last_sound = now - silent_tail / FRAME_SIZE / RATE
                if sounds != self.sounds:
                    self.sounds = sounds
                    self.since = now
                    self.changed.notify_all()

    def wait(self, sounds: bool) -> float:
        """When it last became so."""
        with self.changed:
            if not self.changed.wait_for(lambda: self.sounds == sounds, timeout=20):
                raise RuntimeError("nothing is heard" if sounds else "it does not fall silent")
            return self.since

    def stop(self):
        self.process.terminate()
        self.process.wait()


def wait_until(condition, what: str, limit: float = 20):
    end = time.monotonic() + limit
    while not condition():
        if time.monotonic() > end:
            raise RuntimeError(f"{what} does not come")
        time.sleep(0.0005)


FORMATS = {"flac": ["-c:a", "flac"], "m4a": ["-c:a", "aac", "-b:a", "192k"],
           "mp3": ["-c:a", "libmp3lame", "-q:a", "2"], "opus": ["-c:a", "libopus", "-b:a", "128k"]}


def make_tone(path: pathlib.Path, seconds: float):
    """A file that sounds to its last sample."""
    subprocess.run(["ffmpeg", "-nostdin", "-v", "error", "-y", "-f", "lavfi", "-i", f"anoisesrc=r={RATE}:a=0.3",
                    "-ac", "2", "-sample_fmt", "s16", "-t", str(seconds), str(path)], check=True)
    return path


def make_files(folder: pathlib.Path, seconds: float) -> dict:
    """Two tones and noise, in every format."""
    source = folder / "source.wav"
    ffmpeg = ["ffmpeg", "-nostdin", "-v", "error", "-y"]
    subprocess.run([*ffmpeg, "-f", "lavfi", "-i", f"sine=440:r={RATE}", "-f", "lavfi", "-i",
                    f"anoisesrc=r={RATE}:a=0.05", "-filter_complex", "[0][1]amerge", "-t", str(seconds), str(source)],
                   check=True)
    files = {name: folder / f"music.{name}" for name in FORMATS}
    for name, arguments in FORMATS.items():
        subprocess.run([*ffmpeg, "-i", str(source), *arguments, str(files[name])], check=True)
    return files
