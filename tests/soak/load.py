# SPDX-License-Identifier: BSD-2-Clause
"""What the agent has to bear: walkers, setters, a storm of messages, and a receiver that counts.

Each worker is a process of its own, so that it measures the agent and not the other workers.
"""

import collections
import itertools
import json
import multiprocessing
import random
import signal
import socket
import time

import snmp

IF_TABLE = (1, 3, 6, 1, 2, 1, 2, 2, 1)
IF_X_TABLE = (1, 3, 6, 1, 2, 1, 31, 1, 1, 1)
DS1_CONFIG = (1, 3, 6, 1, 2, 1, 10, 18, 6, 1)
DS1_CURRENT = (1, 3, 6, 1, 2, 1, 10, 18, 7, 1)
PHYSICAL = (1, 3, 6, 1, 2, 1, 47, 1, 1, 1, 1)
ENTITY_STATE = (1, 3, 6, 1, 2, 1, 131, 1, 1, 1)
OWN = (1, 3, 6, 1, 4, 1, 32473, 1, 1)
BOARDS = OWN + (2, 4, 1)
SNMP_TRAP_OID = (1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0)

WALKED = (BOARDS, IF_TABLE, IF_X_TABLE, DS1_CONFIG, DS1_CURRENT, PHYSICAL, ENTITY_STATE)


class Worker:
    """A `Worker` runs `work(self, ...)` in a process until it is stopped. Its counts are shared."""

    def __init__(self, title, work, *arguments):
        self.title = title
        self.requests = multiprocessing.Value("Q", 0)
        self.longest = multiprocessing.Value("d", 0)  # seconds, since it was taken last
        self.paused = multiprocessing.Event()
        self.idle = multiprocessing.Event()
        self._told, self._tell = multiprocessing.Pipe(duplex=False)
        self._process = multiprocessing.Process(target=self._run, args=(work, arguments), daemon=True)
        self._process.start()

    def _run(self, work, arguments):
        signal.signal(signal.SIGINT, signal.SIG_IGN)
        try:
            work(self, *arguments)
        except Exception as error:  # whatever it is, the run has failed
            self._tell.send(f"{type(error).__name__}: {error}")

    def rest(self):
        """Called by the work between two steps."""
        while self.paused.is_set():
            self.idle.set()
            time.sleep(0.01)
        self.idle.clear()

    def report(self, client):
        with self.requests.get_lock():
            self.requests.value = client.requests
        with self.longest.get_lock():
            self.longest.value = max(self.longest.value, client.longest)
        client.longest = 0.0

    def take_longest(self):
        with self.longest.get_lock():
            longest, self.longest.value = self.longest.value, 0.0
        return longest

    def fault(self):
        """Why the work has ended, which it never does by itself."""
        if self._told.poll():
            return f"{self.title}: {self._told.recv()}"
        return None if self._process.is_alive() else f"{self.title} has ended"

    def stop(self):
        self._process.terminate()
        self._process.join()


def walk(worker, port, pause, access):
    """Walks the agent's large tables for ever."""
    client = snmp.Client(port, **access)
    for root in itertools.cycle(WALKED):
        for count, _ in enumerate(client.walk(root)):
            if count % 40 == 0:
                worker.report(client)
                worker.rest()
                time.sleep(pause)


def set_values(worker, port, pause, access):
    """Sets trap enables of lines and interfaces, and reads each back."""
    client = snmp.Client(port, **access)
    lines = [value for _, value in client.walk(DS1_CONFIG + (1,))]
    while True:
        column = random.choice((DS1_CONFIG + (17,), IF_X_TABLE + (14,)))
        cell, value = column + (random.choice(lines),), random.choice((1, 2))
        try:
            client.set(cell, value)
        except snmp.SnmpError as error:
            # A board that is starting again has no lines.
            if error.status != snmp.NO_CREATION:
                raise
        else:
            if client.get(cell)[0] not in (value, b""):
                raise snmp.SnmpError(f"{cell} was set to {value} and has another value")
        worker.report(client)
        worker.rest()
        time.sleep(pause)


class Control:
    """The control socket of a simulated platform."""

    def __init__(self, path):
        self._socket = socket.socket(socket.AF_UNIX)
        self._socket.connect(path)
        self._file = self._socket.makefile("rw")

    def run(self, commands):
        """Sends all at once, and waits for the replies. Raises OSError when one is refused."""
        self._file.write("".join(json.dumps(command) + "\n" for command in commands))
        self._file.flush()
        replies = [json.loads(self._file.readline()) for _ in commands]
        for reply in replies:
            if not reply["ok"]:
                raise OSError(reply["error"])
        return replies


def storm(worker, path, boards, total, seconds):
    """Announces `total` messages in `seconds`, spread evenly; later ones as fast as they are taken."""
    control = Control(path)
    batch = 50
    began = time.monotonic()
    for first in range(0, total, batch):
        commands = [command for _ in range(batch) for command in messages(boards)]
        control.run(commands)
        with worker.requests.get_lock():
            worker.requests.value += len(commands)
        pause_began = time.monotonic()
        worker.rest()
        began += time.monotonic() - pause_began
        time.sleep(max(0.0, began + (first + batch) * seconds / total - time.monotonic()))
    while True:
        worker.rest()
        time.sleep(0.01)


def messages(boards):
    """The next messages: as a rule that a board is about to start or to stop, every tenth time a fault,
    and now and then that a board has stopped and started again, for which the agent compares all boards
    with the platform's."""
    board = random.randint(1, boards)
    kind = random.randrange(1000)
    if kind == 0:
        return [{"command": "event", "id": number, "board": board} for number in (0x40008, 0x40007)]
    if kind < 100:
        return [{"command": "fault", "board": board, "value": random.randrange(20), "cleared": kind % 2 == 0}]
    return [{"command": "event", "id": random.choice((0x40009, 0x4000A)), "board": board}]


class Receiver:
    """A `Receiver` counts the notifications that arrive at its port, by their names. The counts are
    shared: a process of its own receives."""

    def __init__(self, kinds):
        self._socket = socket.socket(socket.AF_INET, socket.SOCK_DGRAM)
        self._socket.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, 1 << 25)
        self._socket.bind(("127.0.0.1", 0))
        self.port = self._socket.getsockname()[1]
        self._kinds = kinds
        self._counts = multiprocessing.Array("Q", len(kinds) + 1)
        self._worker = Worker("the receiver", self._receive)

    def _receive(self, _):
        indices = {kind: index for index, kind in enumerate(self._kinds)}
        while True:
            _, _, _, variables = snmp.read_community_message(self._socket.recv(65536))
            kind = next(value for oid, _, value in variables if oid == SNMP_TRAP_OID)
            with self._counts.get_lock():
                self._counts[indices.get(kind, len(self._kinds))] += 1

    def counts(self):
        """By kind; what is of no kind counts as None."""
        with self._counts.get_lock():
            return collections.Counter(dict(zip((*self._kinds, None), self._counts)))

    def overflows(self):
        """How many notifications the kernel has dropped because the receiver was slow."""
        with open("/proc/net/udp", encoding="ascii") as table:
            for line in table:
                fields = line.split()
                if fields[1].endswith(f":{self.port:04X}"):
                    return int(fields[-1])
        raise OSError("the receiver's socket is not listed")

    def fault(self):
        return self._worker.fault()

    def stop(self):
        self._worker.stop()
        self._socket.close()
