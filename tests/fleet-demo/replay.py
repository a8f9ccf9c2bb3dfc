# SPDX-License-Identifier: BSD-2-Clause
"""replay ADDRESS FOLDER: answers /NUMBER/metrics with one of the recorded scrapes in FOLDER.

Serial numbers are replaced by ones of that target, and counters move on, so that the answers cost a
monitoring engine what those of real agents do.
"""

import asyncio
import pathlib
import re
import sys
import time

sys.dont_write_bytecode = True

# A serial number of agents.py: two characters of the family, four digits of the agent, three of the board.
SERIAL = re.compile(rb'(?<=")([A-Z0-9]{2})\d{4}(\d{3})(?=")')
COUNTER = re.compile(rb"^(\w+_total(?:\{[^}]*\})?) ([\d.]+)$", re.MULTILINE)
MARK = b"@serial@"


class Scrape:
    """A `Scrape` is one recorded answer, cut where numbers and serial numbers change."""

    def __init__(self, text):
        text = SERIAL.sub(rb"\g<1>" + MARK + rb"\g<2>", text)
        self._parts, end = [], 0
        for found in COUNTER.finditer(text):
            self._parts += [text[end:found.start(2)], float(found[2])]
            end = found.end()
        self._rest = text[end:]
        self._second, self._now = None, b""

    def at(self, second, number):
        if second != self._second:
            # Every third counter moves, as on a chassis with some traffic.
            pieces = [part if isinstance(part, bytes) else b"%d" % (part + (second if index % 3 == 0 else 0))
                      for index, part in enumerate(self._parts)]
            self._second, self._now = second, b"".join(pieces) + self._rest
        # Numbers of real agents have four digits, those of stand-ins five.
        return self._now.replace(MARK, b"%05d" % number)


class Connection(asyncio.Protocol):
    """A `Connection` answers the requests of one client, one after another."""

    scrapes = []
    began = time.monotonic()

    def connection_made(self, transport):
        self._transport, self._received = transport, b""

    def data_received(self, data):
        self._received += data
        while b"\r\n\r\n" in self._received:
            request, _, self._received = self._received.partition(b"\r\n\r\n")
            found = re.match(rb"GET /(\d+)/metrics ", request)
            if not found:
                self._transport.write(b"HTTP/1.1 404 Not Found\r\nContent-Length: 0\r\n\r\n")
                continue
            number = int(found[1])
            body = self.scrapes[number % len(self.scrapes)].at(int(time.monotonic() - self.began), number)
            self._transport.write(b"HTTP/1.1 200 OK\r\nContent-Type: text/plain; version=0.0.4\r\n"
                                  b"Content-Length: %d\r\n\r\n" % len(body))
            self._transport.write(body)


async def serve(address, folder):
    Connection.scrapes = [Scrape(path.read_bytes()) for path in sorted(pathlib.Path(folder).glob("*.scrape"))]
    host, _, port = address.rpartition(":")
    server = await asyncio.get_running_loop().create_server(Connection, host, int(port), backlog=1000)
    await server.serve_forever()


asyncio.run(serve(*sys.argv[1:]))
