# SPDX-License-Identifier: BSD-2-Clause
"""Ports for servers of tests."""

import os
import socket

# The system gives higher ports to clients, so that one of them could take a port before the server that it is
# meant for. Every process begins at another place.
FIRST, COUNT = 10000, 10000
_next = os.getpid() * 7919


def _is_free(kind, port):
    with socket.socket(socket.AF_INET, kind) as probe:
        try:
            probe.bind(("", port))
        except OSError:
            return False
    return True


def free_port():
    """A port at which nobody listens, neither by UDP nor by TCP."""
    global _next
    for _ in range(COUNT):
        port = FIRST + _next % COUNT
        _next += 1
        if _is_free(socket.SOCK_DGRAM, port) and _is_free(socket.SOCK_STREAM, port):
            return port
    raise OSError("no free port")
