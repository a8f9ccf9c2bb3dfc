# SPDX-License-Identifier: BSD-2-Clause
"""A small SNMP client: v2c, and v3 without authentication. Addresses are of loopback only."""

import random
import socket
import time

NULL, INTEGER, TEXT, NAME, SEQUENCE = 0x05, 0x02, 0x04, 0x06, 0x30
GET, GET_NEXT, RESPONSE, SET, GET_BULK, TRAP, REPORT = 0xA0, 0xA1, 0xA2, 0xA3, 0xA5, 0xA7, 0xA8
END_OF_VIEW = 0x82


NO_CREATION = 11


class SnmpError(Exception):
    """The agent does not answer, or answers with an error status."""

    def __init__(self, text, status=0):
        super().__init__(text)
        self.status = status


def element(tag, content):
    size = len(content)
    if size < 0x80:
        return bytes((tag, size)) + content
    octets = size.to_bytes((size.bit_length() + 7) // 8, "big")
    return bytes((tag, 0x80 | len(octets))) + octets + content


def integer(value):
    return element(INTEGER, value.to_bytes(value.bit_length() // 8 + 1, "big", signed=True))


def name(oid):
    octets = bytearray((oid[0] * 40 + oid[1],))
    for number in oid[2:]:
        part = [number & 0x7F]
        while number := number >> 7:
            part.append(number & 0x7F | 0x80)
        octets += bytes(reversed(part))
    return element(NAME, bytes(octets))


def split(octets):
    """The elements in `octets`, as pairs of tag and content."""
    at = 0
    while at < len(octets):
        tag, size = octets[at], octets[at + 1]
        at += 2
        if size >= 0x80:
            count = size & 0x7F
            size = int.from_bytes(octets[at:at + count], "big")
            at += count
        yield tag, octets[at:at + size]
        at += size


def read_name(content):
    oid, number = [content[0] // 40, content[0] % 40], 0
    for octet in content[1:]:
        number = number << 7 | octet & 0x7F
        if octet < 0x80:
            oid.append(number)
            number = 0
    return tuple(oid)


def read_value(tag, content):
    """Numbers and names as such, everything else as octets."""
    if tag == INTEGER:
        return int.from_bytes(content, "big", signed=True)
    if tag in (0x41, 0x42, 0x43, 0x46):
        return int.from_bytes(content, "big")
    return read_name(content) if tag == NAME else content


def read_pdu(tag, content):
    """A PDU's kind, number, error status, and variables: name, tag and value."""
    number, status, _, variables = [part for _, part in split(content)]
    result = []
    for _, variable in split(variables):
        (_, oid), (value_tag, value) = split(variable)
        result.append((read_name(oid), value_tag, read_value(value_tag, value)))
    return tag, int.from_bytes(number, "big"), int.from_bytes(status, "big"), result


def read_community_message(message):
    (_, whole), = split(message)
    _, _, (tag, content) = split(whole)
    return read_pdu(tag, content)


class Client:
    """A `Client` asks one agent and measures how long each answer takes.

    A request that is not answered is repeated, because UDP may lose it; that counts as slow.
    """

    def __init__(self, port, community=None, user=None, patience=10.0):
        self.community, self.user, self.patience = community, user, patience
        self.longest = 0.0
        self.requests = 0
        self._number = random.randrange(1 << 20)
        self._engine, self._boots, self._time = b"", 0, 0
        self._socket = socket.socket(socket.AF_INET, socket.SOCK_DGRAM)
        self._socket.connect(("127.0.0.1", port))
        self._socket.settimeout(patience)

    def get(self, *oids):
        return self._values(GET, [(oid, element(NULL, b"")) for oid in oids])

    def set(self, oid, value):
        return self._values(SET, [(oid, integer(value))])

    def walk(self, root, repetitions=40):
        """All names below `root` with their values."""
        at = root
        while True:
            found = self._ask(GET_BULK, [(at, element(NULL, b""))], 0, repetitions)
            for oid, tag, value in found:
                if tag == END_OF_VIEW or oid[:len(root)] != root:
                    return
                if oid <= at:
                    raise SnmpError(f"{oid} follows {at}")
                at = oid
                yield oid, value
            if not found:
                raise SnmpError(f"nothing follows {at}")

    def _values(self, kind, variables):
        return [value for _, _, value in self._ask(kind, variables)]

    def _ask(self, kind, variables, status=0, index=0):
        self._number = (self._number + 1) % (1 << 30)
        pairs = b"".join(element(SEQUENCE, name(oid) + value) for oid, value in variables)
        pdu = element(kind, integer(self._number) + integer(status) + integer(index) + element(SEQUENCE, pairs))
        if self.user and not self._engine:
            self._exchange(element(GET, integer(0) + integer(0) + integer(0) + element(SEQUENCE, b"")), discovery=True)
        began = time.monotonic()
        answer, status, result = self._exchange(pdu)
        self.longest = max(self.longest, time.monotonic() - began)
        self.requests += 1
        if answer != RESPONSE or status != 0:
            raise SnmpError(f"answer {answer:#x} with error status {status} to {variables[0][0]}", status)
        return result

    def _exchange(self, pdu, discovery=False):
        for _ in range(3):
            self._socket.send(self._message(pdu))
            try:
                while True:
                    tag, number, status, result = self._read(self._socket.recv(65536))
                    if tag == REPORT and not discovery:
                        raise SnmpError(f"report of {result[0][0]}")
                    if discovery or number == self._number:
                        return tag, status, result
            except TimeoutError:
                continue
        raise SnmpError(f"no answer within {self.patience} s, three times")

    def _message(self, pdu):
        if not self.user:
            return element(SEQUENCE, integer(1) + element(TEXT, self.community) + pdu)
        head = element(SEQUENCE, integer(1) + integer(65507) + element(TEXT, b"\4") + integer(3))
        user = self.user if self._engine else b""
        security = element(SEQUENCE, element(TEXT, self._engine) + integer(self._boots) + integer(self._time) +
                           element(TEXT, user) + element(TEXT, b"") + element(TEXT, b""))
        scoped = element(SEQUENCE, element(TEXT, self._engine) + element(TEXT, b"") + pdu)
        return element(SEQUENCE, integer(3) + head + element(TEXT, security) + scoped)

    def _read(self, message):
        if not self.user:
            return read_community_message(message)
        (_, whole), = split(message)
        _, _, (_, security), (_, scoped) = split(whole)
        (_, fields), = split(security)
        engine, boots, when = [part for _, part in split(fields)][:3]
        self._engine = engine
        self._boots, self._time = int.from_bytes(boots, "big"), int.from_bytes(when, "big")
        _, _, (tag, content) = split(scoped)
        return read_pdu(tag, content)
