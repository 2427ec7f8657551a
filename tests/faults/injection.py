# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Runs a set command again and again: each time one system call ends the run or fails, and what is left is looked at."""

import collections
import dataclasses
import functools
import json
import os
import pathlib
import re
import stat
import subprocess
import sys

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
import reports  # noqa: E402

KILL = "KILL"
OPEN = "EIO ENOMEM EMFILE EACCES EROFS ENOSPC EINTR"
LOOK = "EIO ENOMEM EACCES"
NEW_NAME = "ENOSPC EIO EROFS EDQUOT EACCES EPERM"
ERRORS = {
    "openat2": OPEN, "openat": OPEN, "read": "EIO EINTR ENOMEM", "pread64": "EIO EINTR", "write": "ENOSPC EDQUOT EIO EINTR",
    "pwrite64": "ENOSPC EIO", "fsync": "EIO ENOSPC EDQUOT EINTR", "renameat": NEW_NAME, "renameat2": NEW_NAME,
    "symlinkat": NEW_NAME, "mkdirat": NEW_NAME, "mkdir": NEW_NAME, "unlinkat": "EIO EROFS EPERM EACCES",
    "fchmod": "EPERM EIO EROFS", "fchown": "EPERM EIO EDQUOT", "ftruncate": "EIO ENOSPC EINTR", "flock": "ENOLCK EINTR EIO",
    "close": "EIO EINTR ENOSPC", "newfstatat": LOOK, "fstat": LOOK, "readlinkat": LOOK, "getdents64": "EIO ENOMEM",
    "fgetxattr": "EIO EPERM", "fsetxattr": "ENOSPC EPERM", "ioctl": "EIO", "socket": "EMFILE ENOMEM", "connect": "EACCES EIO",
    "sendmsg": "EIO ENOMEM", "recvmsg": "EIO ENOMEM",
}
WALKED = "/share/zoneinfo"  # file by file: each 20th of these calls is enough
MISSED = "did not come about"
LEFTOVER = "/.tavisk-"
MARKS = "/run/tavisk/resets"
CHANGING = ("write", "fsync", "renameat", "symlinkat", "mkdirat", "unlinkat", "ftruncate")
RESETTING = (*CHANGING, "sendmsg", "ioctl")


@dataclasses.dataclass(frozen=True)
class Command:
    """A setting with two values, the word that tells it, and its name for a reset. One that is `slow` meets one error a call."""
    setting: str
    old: str
    new: str
    slow: bool = False
    get: str = ""
    reset: str = ""

    def set(self, value):
        return ["-set" + self.setting, value]

    @property
    def look(self):
        return self.get or "-get" + self.setting


class Place:
    """Where the program runs. `top` is what it has for "/", and `work` a folder there for report and trace."""

    def __init__(self, start, program, top, work, watched):
        self._start, self._program, self._top, self._work = start, program, pathlib.Path(top), work
        self._watched = watched
        self._at(work).mkdir(parents=True, exist_ok=True)

    def _at(self, path):
        return self._top / path.lstrip("/")

    def plain(self, contents, path):
        """What of a file's contents counts."""
        return contents

    def trace(self):
        return self._at(self._work + "/trace").read_text(errors="replace")

    def report(self):
        """The lines of the last run's report; None when one of them is not whole, or not as its schema says."""
        file = self._at(self._work + "/report")
        text = file.read_text(errors="replace") if file.exists() else ""
        return None if reports.faults(text) else [json.loads(line) for line in text.split("\n")[:-1]]

    def run(self, words, *strace):
        self._at(self._work + "/report").unlink(missing_ok=True)
        return self._start_program([self._program, "-f", *words], strace)

    def reset(self, name, *strace):
        return self._start_program([self._program + "ctl", "reset", name], strace)

    def _start_program(self, words, strace):
        traced = ["strace", "-f", "-qq", "-o", self._work + "/trace", *strace] if strace else []
        command = [*self._start, f"TAVISK_REPORT={self._work}/report", *traced, *words]
        return subprocess.run(command, stdin=subprocess.DEVNULL, capture_output=True, timeout=60).returncode

    def state(self):
        """Each watched path with mode, owner and contents."""
        found, waiting = {}, list(self._watched)
        while waiting:
            path = waiting.pop()
            if not os.path.lexists(self._at(path)):
                continue
            seen = self._at(path).lstat()
            contents = ""
            if stat.S_ISDIR(seen.st_mode):
                waiting += [f"{path}/{name}" for name in os.listdir(self._at(path))]
            elif stat.S_ISLNK(seen.st_mode):
                contents = os.readlink(self._at(path))
            elif stat.S_ISREG(seen.st_mode):
                contents = self._read(path, (seen.st_ino, seen.st_size, seen.st_mtime_ns, seen.st_ctime_ns))
            found[path] = (seen.st_mode, seen.st_uid, seen.st_gid, contents)
        return found

    @functools.cache
    def _read(self, path, _stamp):
        return self.plain(self._at(path).read_bytes(), path)

    def restore(self, wanted):
        """By force, and only what differs."""
        now = self.state()
        for path in sorted(now.keys() - wanted.keys(), reverse=True):
            (self._at(path).rmdir if stat.S_ISDIR(now[path][0]) else self._at(path).unlink)()
        for path in sorted(path for path in wanted if now.get(path) != wanted[path]):
            mode, user, group, contents = wanted[path]
            if stat.S_ISDIR(mode):
                self._at(path).mkdir(exist_ok=True)
            elif stat.S_ISLNK(mode):
                self._at(path).unlink(missing_ok=True)
                os.symlink(contents, self._at(path))
                continue
            else:
                self._at(path).write_bytes(contents)
            os.chmod(self._at(path), stat.S_IMODE(mode))
            os.chown(self._at(path), user, group)


def calls_in(trace):
    """(name, which of that name) of each call of the first thread, from the one that opens the report."""
    first = trace.partition(" ")[0]
    counts, begun = collections.Counter(), False
    for name, words in re.findall(rf"^{first} +(\w+)\((.*)", trace, re.MULTILINE):
        counts[name] += 1
        begun = begun or '/report"' in words
        if begun and name not in ("exit", "exit_group") and not (WALKED in words and counts[name] % 20):
            yield name, counts[name]


def few_of(faults):
    """For a quick look: one of each kind at the calls that change a file, and now and then another."""
    changing = [fault for fault in faults if fault[0] in CHANGING and fault[2] in (KILL, ERRORS[fault[0]].split()[0])]
    return [*changing, *[fault for fault in faults if fault[0] not in CHANGING][::100]]


class Sweep:
    def __init__(self, place, command):
        self._place, self._command = place, command
        place.run(command.set(command.new))
        self._old, self._old_text = self._set_to(command.old)
        place.run(command.set(command.new), "-y", "-e", "trace=all")
        self._lacking = {effect["setting"] for effect in self._effects() if effect["outcome"] == "not supported"}
        self.faults = [(name, count, fault) for name, count in calls_in(place.trace())
                       for fault in (KILL, *ERRORS.get(name, "").split()[:1 if command.slow else None])]
        self._new, self._new_text = self._set_to(command.new)
        self._own = set(_differing(self._old, self._new))
        self._set_back()
        if not self._own or len(self.faults) < 50:
            raise ValueError(f"{command.setting} changes {sorted(self._own)}, at {len(self.faults)} faults")

    def _set_to(self, value):
        self._place.run(self._command.set(value))
        state = self._place.state()
        self._place.run([self._command.look])
        return state, self._place.report()[0]["output"]

    def _set_back(self):
        self._place.run(self._command.set(self._command.old))
        self._place.restore(self._old)

    def harm(self, name, count, fault):
        """What a fault left, as (kind, detail); None when the fault did not come about."""
        # With --seccomp-bpf, which is faster, strace sends no signal.
        how = [f"signal={fault}"] if fault == KILL else [f"error={fault}", "--seccomp-bpf"]
        status = self._place.run(self._command.set(self._command.new), *how[1:], "-e", f"trace={name}", "-e",
                                 f"inject={name}:{how[0]}:when={count}")
        harm = None
        if status in (137, -9) if fault == KILL else "(INJECTED)" in self._place.trace():
            state = self._place.state()
            harm = self._wrong_files(state)
            if fault != KILL:
                harm += self._wrong_report(state, status) + _leftovers(state, "left at once")
            harm += self._wrong_end()
        self._set_back()
        return harm

    def _effects(self):
        return [effect for entry in self._place.report() or [] for effect in entry["effects"]]

    def _is(self, state, wanted):
        return not self._own & set(_differing(state, wanted))

    def _wrong_files(self, state):
        return [("neither old nor new" if path in self._own else "another file changed", f"{path}: {state.get(path)}")
                for path in _differing(state, self._old, self._new)]

    def _wrong_report(self, state, status):
        entries = self._place.report()
        if entries is None:
            return [("a report that is not as its schema says", "")]
        effects = [effect for effect in self._effects() if effect["setting"] not in self._lacking]
        outcomes = {effect["outcome"] for effect in effects}
        isnt_new = not self._is(state, self._new)
        wrong = {
            "no cause": any(effect["outcome"] == "failed" and not (effect.get("on") and effect.get("why")) for effect in effects),
            "called not supported": "not supported" in outcomes,
            "called applied": isnt_new and outcomes & {"applied", "unchanged"},
            "not told": isnt_new and not outcomes and status == 0,
            "changed, and called unchanged":
                entries and not self._is(state, self._old) and not any(entry["changed"] for entry in entries)}
        return [(kind, str(effects)) for kind, is_so in wrong.items() if is_so]

    def _wrong_end(self):
        """What is wrong after the command is given again."""
        look = self._command.look
        self._place.run([look, *self._command.set(self._command.new), look])
        entries, state = self._place.report() or [], self._place.state()
        texts = [entry["output"] for entry in entries if entry.get("command") == look]
        if len(texts) != 2:
            return [("the next run fails", str(entries))]
        failed = [effect for effect in self._effects() if effect["outcome"] == "failed"]
        wrong = _differing(state, self._new)
        harm = [("a third value", texts[0])] if texts[0] not in (self._old_text, self._new_text) else []
        if wrong or failed or texts[1] != self._new_text:
            harm.append(("not completed", f"{wrong} {texts[1]!r} {failed}"))
        return harm + _leftovers(state, "left for good")


def _differing(state, *others):
    """The paths that are in no other state as they are in this one; but for what a run left."""
    return sorted(path for path in set(state).union(*others) if LEFTOVER not in path
                  and all(state.get(path) != other.get(path) for other in others))


def _leftovers(state, kind):
    return [(kind, path) for path in sorted(state) if LEFTOVER in path]


def _after_reset(place, command):
    """The files, and the value that is told."""
    state = place.state()
    place.run([command.look])
    return state, place.report()[0]["output"]


def wrong_resets(place, command):
    """(count of runs, what was wrong): a reset is killed before each call that changes something, and is given again."""
    place.run(command.set(command.new))
    before = place.state()
    place.reset(command.reset, "-e", "trace=" + ",".join(RESETTING))
    calls = collections.Counter(re.findall(r"^\d+ +(\w+)\(", place.trace(), re.MULTILINE))
    right = _after_reset(place, command)
    if not _differing(before, right[0]):
        return 0, [f"{command.setting}: a reset changes nothing"]
    wrong, runs = [], 0
    for name, which in [(name, which) for name, count in calls.items() for which in range(1, count + 1)]:
        place.run(command.set(command.new))
        if place.reset(command.reset, "-e", f"trace={name}", "-e", f"inject={name}:signal={KILL}:when={which}") not in (137, -9):
            continue
        runs += 1
        torn = [path for path in _differing(place.state(), before, right[0]) if not path.startswith(MARKS)]
        status = place.reset(command.reset)
        state, text = _after_reset(place, command)
        left = [path for path in _differing(state, right[0]) if path != MARKS] + [path for path in state if LEFTOVER in path]
        if status or torn or left or text != right[1]:
            wrong.append(f"{command.setting}: {name} {which}: {status} {torn} {left} {text!r}")
    return runs, wrong if runs else [f"{command.setting}: nothing was killed"]


def sweep(place, command, choose=list, done=(), tell=lambda *_: None):
    """(count of runs, the harm of each kind); (fault, harm) of `done` are counted and left out, the others are told."""
    run, done = Sweep(place, command), list(done)
    for fault in choose(run.faults):
        if not any(before == list(fault) for before, _ in done):
            tries = (run.harm(*fault) for _ in range(3))
            done.append((list(fault), next((harm for harm in tries if harm is not None), None)))
            tell(*done[-1])
    found = {}
    for fault, harm in done:
        for kind, detail in [(MISSED, "")] if harm is None else harm:
            found.setdefault(kind, []).append(f"{command.setting}: {' '.join(map(str, fault))}: {detail[:600]}")
    # No two runs make quite the same calls: a file that has just been written is read again.
    if len(found.get(MISSED, [])) * 10 < len(done):
        found.pop(MISSED, None)
    return len(done), found
