"""Makes hostile media of sound files: what bit rot, half downloads and whoever means harm would hand over."""

import pathlib
import random
import struct
import subprocess

# Extension (of the container) and what makes it. The last two are refused for what they are.
SEEDS = [("wav", ""), ("wav", "-c:a pcm_f64le"), ("wav", "-c:a adpcm_ms"), ("wav", "-c:a adpcm_ima_wav"),
         ("wav", "-c:a pcm_mulaw"), ("wav", "-rf64 always"), ("w64", ""), ("aiff", "-write_id3v2 1"), ("au", ""),
         ("caf", "-c:a alac"), ("caf", "-c:a pcm_s24be"), ("flac", ""), ("mp3", ""), ("mp3", "-write_xing 0 -b:a 64k"),
         ("mp2", "-c:a mp2"), ("aac", "-c:a aac"), ("m4a", "-c:a aac"), ("m4a", "-c:a alac"), ("mov", "-c:a pcm_s16be"),
         ("mp4", "-c:a aac -movflags frag_keyframe+empty_moov"), ("ogg", "-c:a libvorbis"), ("opus", "-c:a libopus"),
         ("oga", "-c:a flac"), ("mka", "-c:a flac"), ("mka", "-c:a libmp3lame"), ("webm", "-c:a libopus"),
         ("tta", "-c:a tta"), ("wv", "-c:a wavpack"), ("wma", "-c:a wmav2"), ("ac3", "-c:a ac3")]
EXTREMES = [0, 1, 2, 0x7F, 0xFF, 0x7FFF, 0xFFFF, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF, 0xFFFFFFFE, 0x10000000,
            0x7FFFFFFFFFFFFFFF, 0x8000000000000000, 0xFFFFFFFFFFFFFFFF, 0x4000000000000000]
TABLES = [b"stsz", b"stco", b"stts", b"stsc", b"elst", b"sidx", b"trun", b"LIST", b"fact", b"data", b"fmt ", b"COMM",
          b"SSND", b"pakt", b"kuki", b"indx", b"APETAGEX", b"TAG", b"\x1c\x53\xbb\x6b", b"\x1f\x43\xb6\x75", b"OggS"]


def make_seeds(folder: pathlib.Path) -> list:
    """(extension, bytes) of short sounds with tags, and a picture where FFmpeg writes one."""
    made, picture = [], folder / "cover.png"
    ffmpeg = ["ffmpeg", "-nostdin", "-v", "quiet", "-y", "-f", "lavfi", "-i"]
    subprocess.run([*ffmpeg, "testsrc=s=60x60", "-frames:v", "1", str(picture)], check=True)
    sound = "aevalsrc=0.3*sin(2764*t+t*t)|0.2*sin(3454*t):s=44100:d=0.4"
    cover = ["-i", str(picture), "-map", "0", "-map", "1", "-c:v", "copy", "-disposition:v", "attached_pic"]
    for extension, options in SEEDS:
        path = folder / f"seed.{extension}"
        subprocess.run([*ffmpeg, sound, *(cover if extension in ("mp3", "flac", "m4a") else []), *options.split(),
                        "-metadata", "title=Title", "-metadata", "artist=Artist", str(path)], check=True)
        made.append((extension, path.read_bytes()))
    return made


def mend_ogg(data: bytearray):
    """Makes the check sums of pages right again: else a decoder passes over what was changed."""
    page = data.find(b"OggS")
    while 0 <= page and page + 27 < len(data):
        table = data[page + 27:page + 27 + data[page + 26]]
        end = page + 27 + len(table) + sum(table)
        data[page + 22:page + 26] = bytes(4)
        sum_ = 0
        for byte in data[page:end]:
            sum_ ^= byte << 24
            for _ in range(8):
                sum_ = (sum_ << 1 ^ (0x104C11DB7 if sum_ >> 31 else 0)) & 0xFFFFFFFF
        data[page + 22:page + 26] = struct.pack("<I", sum_)
        page = data.find(b"OggS", max(end, page + 4))


class Generator:
    """The same seed makes the same files."""

    def __init__(self, seeds: list, seed: int):
        self.seeds, self.chance = seeds, random.Random(seed)
        self.ways = [self.flip, self.flip, self.length, self.length, self.truncate, self.splice, self.repeat,
                     self.table, self.tags, self.nest]

    def place(self, data: bytearray) -> int:
        """More often near the beginning, where the headers are."""
        return self.chance.randrange(max(1, min(len(data), self.chance.choice([64, 512, 4096, 1 << 30]))))

    def flip(self, data):
        for _ in range(self.chance.choice([1, 2, 8, 64])):
            data[self.place(data)] ^= 1 << self.chance.randrange(8)

    def number(self, data, at):
        size = self.chance.choice([1, 2, 4, 8])
        value = self.chance.choice([*EXTREMES, len(data), len(data) - at, self.chance.getrandbits(64)])
        data[at:at + size] = (value & (1 << 8 * size) - 1).to_bytes(size, self.chance.choice(["big", "little"]))

    def length(self, data):
        for _ in range(self.chance.choice([1, 1, 3])):
            self.number(data, self.place(data))

    def truncate(self, data):
        at = self.place(data)
        del data[at:self.chance.choice([at + self.place(data), len(data)])]

    def splice(self, data):
        other = self.chance.choice(self.seeds)[1]
        data[self.place(data):] = other[self.chance.randrange(len(other)):]

    def repeat(self, data):
        at, size = self.place(data), self.chance.choice([1, 8, 24, 100, 1000])
        data[at:at] = data[at:at + size] * min(self.chance.choice([2, 100, 100_000]), 2_000_000 // size)

    def table(self, data):
        """A count or a size of a table that is there."""
        found = [at + len(name) for name in TABLES if (at := data.find(name)) >= 0]
        if found:
            self.number(data, self.chance.choice(found) + self.chance.choice([-8, 0, 4, 8, 12]))

    def tags(self, data):
        """Very many tags or chunks, or huge ones, in the form of the container."""
        count, size = self.chance.choice([1, 1000, 100_000]), self.chance.choice([0, 4, 10, 0x7FFFFF, 0xFFFFFFF])
        if data[:4] == b"fLaC":
            block = bytes([self.chance.choice([1, 3, 4, 5, 6])]) + struct.pack(">I", min(size, 0xFFFFFF))[1:] + bytes(min(size, 10))
            data[42:42] = block * count
        elif data[4:8] == b"ftyp":
            data[0:0] = (struct.pack(">I", 8) + self.chance.choice([b"free", b"moov", b"udta", b"moof"])) * count
        elif data[:4] in (b"RIFF", b"FORM", b"RF64"):
            data[12:12] = self.chance.choice([b"LIST", b"id3 ", b"COMM", b"junk", b"fmt "]) + struct.pack("<I", size) * count
        else:
            frames = (self.chance.choice([b"TXXX", b"APIC", b"CHAP", b"TIT2"]) + struct.pack(">IH", min(size, 4), 0) + b"\0" * 4) * count
            length = self.chance.choice([len(frames), size])
            data[0:0] = b"ID3\4\0\0" + bytes(length >> shift & 127 for shift in (21, 14, 7, 0)) + frames

    def nest(self, data):
        """Boxes in boxes, or elements in elements."""
        depth = self.chance.choice([10, 1000, 50_000])
        if data[4:8] == b"ftyp":
            name = self.chance.choice([b"moov", b"trak", b"udta", b"meta", b"ilst"])
            data[32:32] = b"".join(struct.pack(">I", 8 * n) + name for n in range(depth, 0, -1))
        else:
            at = self.place(data)
            data[at:at] = self.chance.choice([b"\x45\xb6\x01" + b"\xff" * 7, b"LIST\xff\xff\xff\x7fINFO"]) * depth

    def make(self, path: pathlib.Path) -> pathlib.Path:
        """Writes the next file; where, with its extension."""
        extension, seed = self.chance.choice(self.seeds)
        path = path.with_suffix("." + extension)
        data = bytearray(seed)
        for _ in range(self.chance.choice([1, 1, 2, 4])):
            self.chance.choice(self.ways)(data)
            data = data or bytearray(b"\0")
        if data[:4] == b"OggS" and len(data) < 40_000 and self.chance.random() < 0.7:
            mend_ogg(data)
        path.write_bytes(data)
        if self.chance.random() < 0.02:  # followed by much of nothing
            with path.open("r+b") as file:
                file.truncate(len(data) + self.chance.choice([1 << 20, 300 << 20, 5 << 30]))
        return path
