"""What a process has cost so far, by its own account in /proc."""

import pathlib


class Cost:
    def __init__(self, pid: int):
        self.cpu = 0        # seconds
        self.switches = 0   # voluntary context switches
        for task in pathlib.Path(f"/proc/{pid}/task").iterdir():
            self.cpu += int((task / "schedstat").read_text().split()[0]) / 1e9
            for line in (task / "status").read_text().splitlines():
                if line.startswith("voluntary_ctxt_switches"):
                    self.switches += int(line.split()[1])

    def since(self, before):
        self.cpu -= before.cpu
        self.switches -= before.switches
        return self


def anonymous_memory(pid: int) -> int:
    """KiB that belong to the process alone and to no file."""
    for line in pathlib.Path(f"/proc/{pid}/status").read_text().splitlines():
        if line.startswith("RssAnon"):
            return int(line.split()[1])
    return 0
