"""A file system in user space that stops answering where it is told to. For root, as it mounts."""

import contextlib
import ctypes
import errno
import mmap
import os
import pathlib
import signal
import stat
import struct

LOOKUP, FORGET, GETATTR, OPEN, READ, STATFS, RELEASE, FLUSH, INIT, OPENDIR, INTERRUPT, BATCH_FORGET = (
    1, 2, 3, 14, 15, 17, 18, 25, 26, 27, 36, 42)
HELD = {"open": OPEN, "read": READ, "stat": GETATTR, "close": FLUSH}
libc = ctypes.CDLL(None, use_errno=True)


class HangingMount:
    """One folder with one file under any name, served by a process of its own."""

    def __init__(self, folder: pathlib.Path, content: bytes):
        self.folder = folder
        self.content = content
        self.held = mmap.mmap(-1, 64)  # one byte for each operation, shared with the process
        folder.mkdir()
        self.device = os.open("/dev/fuse", os.O_RDWR | os.O_CLOEXEC)
        options = f"fd={self.device},rootmode=40000,user_id=0,group_id=0,allow_other"
        if libc.mount(b"hanging", str(folder).encode(), b"fuse.hanging", 6, options.encode()) != 0:
            raise OSError(ctypes.get_errno(), "mount")
        self.process = os.fork()
        if self.process == 0:
            self.serve()
            os._exit(0)
        os.close(self.device)

    def hold(self, *operations: int):
        """These are left unanswered from now on."""
        for operation in operations:
            self.held[operation] = 1

    def stop(self):
        """Whoever waits gets an error."""
        if self.process is None:
            return
        os.kill(self.process, signal.SIGKILL)
        os.waitpid(self.process, 0)
        self.process = None
        libc.umount2(str(self.folder).encode(), 2)

    def attributes(self, node: int) -> bytes:
        mode = stat.S_IFDIR | 0o755 if node == 1 else stat.S_IFREG | 0o644
        size = 0 if node == 1 else len(self.content)
        return struct.pack("<6Q10I", node, size, (size + 511) // 512, 0, 0, 0, 0, 0, 0, mode, 1, 0, 0, 0, 4096, 0)

    def answer(self, operation: int, node: int, body: bytes):
        """The bytes of the answer, or an error number."""
        if operation == INIT:
            return struct.pack("<IIIIHHIIHHI28x", 7, 31, 65536, 0, 0, 0, 65536, 1, 0, 0, 0)
        if operation == LOOKUP:
            return struct.pack("<4Q2I", 2, 0, 0, 0, 0, 0) + self.attributes(2)
        if operation == GETATTR:
            return struct.pack("<QII", 0, 0, 0) + self.attributes(node)
        if operation in (OPEN, OPENDIR):
            return struct.pack("<QII", 1, 0, 0)
        if operation == READ:
            offset, size = struct.unpack_from("<8xQI", body)
            return self.content[offset:offset + size]
        if operation in (FLUSH, RELEASE):
            return b""
        return errno.ENOSYS

    def serve(self):
        while True:
            try:
                request = os.read(self.device, 135168)
            except OSError:
                return
            if not request:
                return
            _, operation, unique, node = struct.unpack_from("<IIQQ", request)
            if operation in (FORGET, BATCH_FORGET, INTERRUPT) or self.held[operation]:
                continue
            answer = self.answer(operation, node, request[40:])
            error, answer = (-answer, b"") if isinstance(answer, int) else (0, answer)
            with contextlib.suppress(OSError):
                os.write(self.device, struct.pack("<IiQ", 16 + len(answer), error, unique) + answer)
