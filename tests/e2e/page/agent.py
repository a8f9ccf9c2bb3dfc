# SPDX-License-Identifier: BSD-2-Clause
"""The agent on a simulated chassis, with its page at a TCP port."""

import os
import pathlib
import subprocess
import sys
import tempfile
import time

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "support"))

from ports import free_port

PATIENCE = int(os.environ.get("KVLOAM_TEST_PATIENCE", "120"))


class AgentError(Exception):
    """A program has not done what a test needs."""


class Agent:
    """An `Agent` is a running kvloamd with its platform, in a folder of its own. It ends with `close`."""

    def __init__(self, build, boards=None, lines=4):
        """`boards`: how many the generated chassis has; None: the bundled chassis."""
        self._bin = pathlib.Path(build) / "bin"
        self._modules = pathlib.Path(build) / "lib/kvloam"
        self._temporary = tempfile.TemporaryDirectory(prefix="kvloam-page-")
        self._folder = pathlib.Path(self._temporary.name)
        (self._folder / "store").mkdir()
        (self._folder / "snmp.conf").write_text("rocommunity public 127.0.0.1\n")
        self._variables = {"PATH": os.environ["PATH"], "HOME": str(self._folder), "MIBS": "",
                           "SNMPCONFPATH": str(self._folder / "none"), "KVLSIM_SOCKET": str(self._folder / "sim.socket"),
                           "VQRXCFGPATH": str(self._folder / "store")}
        if boards is not None:
            chassis = self._folder / "chassis.yaml"
            self.kvlsim("generate", "--boards", str(boards), "--lines", str(lines), "--output", str(chassis))
            self._variables["KVLSIM_CHASSIS"] = str(chassis)
        self.port = free_port()
        self._child = None
        self.start()

    @property
    def address(self):
        return f"http://127.0.0.1:{self.port}"

    def kvlsim(self, *words):
        done = subprocess.run([self._bin / "kvlsim", *words], env=self._variables, capture_output=True, text=True,
                              timeout=PATIENCE)
        if done.returncode != 0:
            raise AgentError(f"kvlsim {' '.join(words)}: {done.stderr}")
        return done.stdout

    def start(self):
        self._log = self._folder / "log"
        with self._log.open("w") as log:
            self._child = subprocess.Popen(
                [self._bin / "kvloamd", "--port", str(free_port()), "--module", "z7sim", "--module-dir",
                 self._modules, "--snmp-config", self._folder / "snmp.conf", "--persistent-dir", self._folder / "kept",
                 "--http", f"127.0.0.1:{self.port}"],
                env=self._variables, stdin=subprocess.DEVNULL, stdout=log, stderr=log)
        self.wait_for_log("serving")

    def wait_for_log(self, text):
        """Waits until the log has `text`. Returns when it was found."""
        limit = time.monotonic() + PATIENCE
        while text not in (log := self._log.read_text()):
            if self._child.poll() is not None:
                raise AgentError(f"kvloamd has ended: {log[-2000:]}")
            if time.monotonic() > limit:
                raise AgentError(f"'{text}' is not in the log: {log[-2000:]}")
            time.sleep(0.01)
        return time.monotonic()

    def stop(self):
        if self._child is None:
            return
        self._child.terminate()
        try:
            self._child.wait(PATIENCE)
        except subprocess.TimeoutExpired:
            self._child.kill()
            self._child.wait()
        self._child = None

    def close(self):
        self.stop()
        self._temporary.cleanup()
