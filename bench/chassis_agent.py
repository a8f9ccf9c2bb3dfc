# SPDX-License-Identifier: BSD-2-Clause
"""An agent of its own for measurements: `kvloamd` with boards of the simulated platform."""

import os
import pathlib
import re
import signal
import socket
import subprocess
import sys
import tempfile
import time

sys.dont_write_bytecode = True
ROOT = pathlib.Path(__file__).resolve().parent.parent
LINES = 4  # of each board


def free_port():
    with socket.socket(socket.AF_INET, socket.SOCK_DGRAM) as probe:
        probe.bind(("127.0.0.1", 0))
        return probe.getsockname()[1]


class ChassisAgent:
    """A running agent of a build, with `boards` boards of four lines. It serves once it is made, and
    ends with the `with` statement that it is used in."""

    def __init__(self, build, boards):
        self.temporary = tempfile.TemporaryDirectory(prefix="chassis-agent-")
        self.folder = pathlib.Path(self.temporary.name)
        self.control = self.folder / "control"  # the simulated platform's socket
        self.port = free_port()
        build = pathlib.Path(build).resolve()
        chassis = subprocess.run([build / "bin" / "kvlsim", "generate", "--boards", str(boards), "--lines", str(LINES)],
                                 check=True, stdout=subprocess.PIPE).stdout
        (self.folder / "chassis.yaml").write_bytes(chassis)
        (self.folder / "snmp.conf").write_text("rocommunity public 127.0.0.1\n")
        environment = {"PATH": os.environ["PATH"], "KVLSIM_CHASSIS": str(self.folder / "chassis.yaml"),
                       "KVLSIM_SOCKET": str(self.control), "VQRXCFGPATH": "", "MIBS": ""}
        began = time.monotonic()
        with (self.folder / "log").open("w") as log:
            self.process = subprocess.Popen(
                [build / "bin" / "kvloamd", "--listen", f"udp:127.0.0.1:{self.port}",
                 "--snmp-config", self.folder / "snmp.conf", "--persistent-dir", self.folder / "state",
                 "--module", "z7sim", "--module-dir", build / "lib" / "kvloam", "--http-socket", ""],
                env=environment, stdout=log, stderr=log)
        try:
            while "serving" not in (self.folder / "log").read_text():
                if self.process.poll() is not None:
                    sys.exit((self.folder / "log").read_text())
                time.sleep(0.005)
        except BaseException:
            self.close()
            raise
        self.start_time = time.monotonic() - began

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.close()

    def close(self):
        if self.process.poll() is None:
            self.process.kill()
            self.process.wait()
        self.temporary.cleanup()

    def processor_time(self):
        """In seconds, since the start."""
        fields = pathlib.Path(f"/proc/{self.process.pid}/stat").read_text().rpartition(")")[2].split()
        return (int(fields[11]) + int(fields[12])) / os.sysconf("SC_CLK_TCK")

    def memory(self):
        """In kB: resident, its proportional share, and what of that is in no file."""
        text = pathlib.Path(f"/proc/{self.process.pid}/smaps_rollup").read_text()
        return [int(re.search(rf"^{kind}:\s+(\d+)", text, re.MULTILINE).group(1)) for kind in ("Rss", "Pss", "Pss_Anon")]

    def idle_share(self, seconds):
        """What the agent uses while nothing happens, in per cent of a processor."""
        used, began = self.processor_time(), time.monotonic()
        time.sleep(seconds)
        return 100 * (self.processor_time() - used) / (time.monotonic() - began)

    def stop(self):
        """Ends the agent as an operator does. Returns how long that took, in seconds."""
        began = time.monotonic()
        self.process.send_signal(signal.SIGTERM)
        status = self.process.wait(60)
        if status != 0:
            sys.exit(f"the agent has ended with status {status}")
        return time.monotonic() - began
