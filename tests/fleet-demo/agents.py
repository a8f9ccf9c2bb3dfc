# SPDX-License-Identifier: BSD-2-Clause
"""The agents of a fleet, and the stand-in for many more."""

import pathlib
import random
import re
import socket
import subprocess
import sys
import time

from programs import Failure, Program, fetch

BOARDS = LINES = 4
REPLAY = pathlib.Path(__file__).with_name("replay.py")


class Network:
    """A `Network` is a range of loopback addresses that this run has for itself: 127.X.*.*. Every
    program gets an address of its own there, and can use its usual port."""

    def __init__(self):
        for second in random.sample(range(64, 255), 100):
            claim = socket.socket()
            try:
                claim.bind((f"127.{second}.255.254", 8160))
            except OSError:
                claim.close()
                continue
            self._claim, self._second = claim, second
            return
        raise Failure("there is no free range of loopback addresses")

    def agent(self, number):
        return f"127.{self._second}.{number // 250}.{number % 250 + 1}"

    def server(self, number):
        return f"127.{self._second}.255.{number}"


class Agent:
    """An `Agent` is a real kvloamd with a chassis, a store and a state of its own. The chassis is the one in
    the file `chassis`, or one that is generated."""

    def __init__(self, folder, build, network, number, receiver, chassis=None):
        folder.mkdir()
        self.name = f"agent-{number:05}"
        self.address = network.agent(number)
        self._tool = build / "bin/kvlsim"
        self._socket = str(folder / "socket")
        access, store = folder / "access.conf", folder / "store"
        store.mkdir()
        if not chassis:
            chassis = folder / "chassis.yaml"
            generated = subprocess.run(
                [self._tool, "generate", "--boards", str(BOARDS), "--lines", str(LINES), "--seed", str(number)],
                check=True, capture_output=True, text=True).stdout
            # Serial numbers of the generator are unique in one chassis; here they are in all.
            chassis.write_text(re.sub(r'(SERIAL_NUMBER: "..)\d{4}', rf"\g<1>{number:04}", generated))
        access.write_text("rocommunity public 127.0.0.0/8\n" +
                          (f"trap2sink {receiver} public\n" if receiver else ""))
        self.program = Program(
            folder, self.name,
            [build / "bin/kvloamd", "--module", "z7sim", "--module-dir", build / "lib/kvloam",
             "--listen", f"udp:{self.address}:1161", "--http", f"{self.address}:8161",
             "--snmp-config", access, "--persistent-dir", folder / "state"],
            {"KVLSIM_CHASSIS": str(chassis), "KVLSIM_SOCKET": self._socket, "VQRXCFGPATH": str(store)})

    def wait(self, patience):
        self.program.wait_for_log("serving", patience)

    def metrics(self):
        return fetch(f"http://{self.address}:8161/metrics")

    def control(self, *words):
        done = subprocess.run([self._tool, "--socket", self._socket, *words], capture_output=True, text=True)
        if done.returncode:
            raise Failure(f"kvlsim {' '.join(words)}: {done.stderr}")

    def target(self):
        return {"targets": [f"{self.address}:8161"], "labels": {"instance": self.name, "site": f"site-{self.name[-1]}"}}


def start_agents(folder, options, network, receiver, programs):
    """Starts agents, a few at a time, so that a small host is not flooded."""
    agents = []
    for first in range(0, options.agents, 10):
        for number in range(first, min(first + 10, options.agents)):
            agents.append(Agent(folder / f"a{number}", options.build, network, number, receiver))
            programs.append(agents[-1].program)
        for agent in agents[first:]:
            agent.wait(options.patience)
    return agents


class StandIn:
    """A `StandIn` is one process that answers for many more agents, with scrapes of real ones."""

    def __init__(self, folder, options, network, agents):
        folder.mkdir()
        for agent in agents[:5]:
            (folder / f"{agent.name}.scrape").write_text(agent.metrics())
        self.address = f"{network.server(100)}:8161"
        self._count = options.targets
        self.program = Program(folder, "stand-in", [sys.executable, REPLAY,
                                                    self.address, folder])
        self.program.wait_for_answer(f"http://{self.address}/0/metrics", options.patience)

    def targets(self):
        for number in range(self._count):
            yield {"targets": [self.address],
                   "labels": {"instance": f"replay-{number:05}", "site": f"site-{number % 10}",
                              "__metrics_path__": f"/{number}/metrics"}}


def idle_usage(agents, seconds):
    """Memory in bytes and share of a processor of one idle agent, as an average."""
    before = sum(agent.program.processor() for agent in agents)
    began = time.monotonic()
    time.sleep(seconds)
    used = (sum(agent.program.processor() for agent in agents) - before) / (time.monotonic() - began)
    return sum(agent.program.memory() for agent in agents) / len(agents), used / len(agents)
