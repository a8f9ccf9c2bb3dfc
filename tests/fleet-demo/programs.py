# SPDX-License-Identifier: BSD-2-Clause
"""Child processes of a fleet, what they use, and waiting for conditions."""

import os
import re
import subprocess
import time
import urllib.request

TICKS = os.sysconf("SC_CLK_TCK")


class Failure(Exception):
    """Something that must hold does not."""


def eventually(condition, patience, what):
    """Waits until `condition` returns nothing; it returns what is still wrong. A server that does not
    answer on a busy machine is something to wait for, too."""
    def attempt():
        try:
            return condition()
        except OSError as error:
            return str(error)
    limit = time.monotonic() + patience
    while wrong := attempt():
        if time.monotonic() > limit:
            raise Failure(f"{what}: {wrong}")
        time.sleep(0.2)


def fetch(url, data=None, timeout=60):
    """The body of the answer, as text. Raises OSError if there is none, or its status is not 200."""
    with urllib.request.urlopen(url, data, timeout) as answer:
        return answer.read().decode()


def samples(text, name):
    """Adds up the samples of the metric `name` in the text of a scrape; `name` is a pattern that may
    have labels."""
    found = re.findall(rf"^{name}(?:\{{[^}}]*\}})? (\S+)", text, re.MULTILINE)
    return sum(float(value) for value in found)


class Usage:
    """A `Usage` is what processes have used: seconds of processor time, and bytes of memory now, of
    which pages that several share are counted once."""

    def __init__(self, programs):
        self.processor = sum(program.processor() for program in programs)
        self.memory = sum(program.memory() for program in programs)


class Program:
    """A `Program` is a running child process with its log in a file."""

    def __init__(self, folder, title, command, variables=None):
        self.title = title
        self.log = folder / f"{title}.log"
        environment = {"PATH": os.environ["PATH"], "HOME": str(folder), "MIBS": "",
                       "SNMPCONFPATH": str(folder / "none"), **(variables or {})}
        for variable in ("ASAN_OPTIONS", "LSAN_OPTIONS", "TSAN_OPTIONS"):
            if variable in os.environ:
                environment[variable] = os.environ[variable]
        with self.log.open("a") as log:
            self._child = subprocess.Popen([str(word) for word in command], env=environment,
                                           stdin=subprocess.DEVNULL, stdout=log, stderr=log)

    def fault(self):
        if self._child.poll() is None:
            return None
        return f"{self.title} has ended with {self._child.returncode}: {self.log.read_text()[-2000:]}"

    def wait_for(self, condition, patience):
        """Waits until `condition` returns nothing; fails at once if the program ends."""
        def wrong():
            if fault := self.fault():
                raise Failure(fault)
            return condition()
        eventually(wrong, patience, self.title)

    def wait_for_log(self, text, patience):
        self.wait_for(lambda: None if text in self.log.read_text() else f"'{text}' is not in the log", patience)

    def wait_for_answer(self, url, patience):
        # fetch() raises OSError until there is an answer.
        self.wait_for(lambda: fetch(url, timeout=5) and None, patience)

    def processor(self):
        with open(f"/proc/{self._child.pid}/stat", encoding="ascii") as stat:
            fields = stat.read().rpartition(")")[2].split()
        return (int(fields[11]) + int(fields[12])) / TICKS

    def memory(self):
        with open(f"/proc/{self._child.pid}/smaps_rollup", encoding="ascii") as smaps:
            return 1024 * next(int(line.split()[1]) for line in smaps if line.startswith("Pss:"))

    def running(self):
        return self._child.poll() is None

    def kill(self):
        self._child.kill()
        self._child.wait()

    def terminate(self):
        if self.running():
            self._child.terminate()

    def stop(self):
        """Returns the status with which the program ends."""
        self.terminate()
        try:
            return self._child.wait(30)
        except subprocess.TimeoutExpired:
            self.kill()
            return "no end within 30 s"


def stop_all(programs):
    """Stops programs side by side; those that do not end are killed."""
    for program in programs:
        program.terminate()
    for program in programs:
        program.stop()
