# SPDX-License-Identifier: BSD-2-Clause
"""A stand-in for the agent: the page's files, and answers that a test composes and changes."""

import datetime
import email.utils
import http.server
import json
import pathlib
import threading
import urllib.parse

TYPES = {".html": "text/html; charset=utf-8", ".css": "text/css", ".js": "text/javascript",
         ".svg": "image/svg+xml", ".txt": "text/plain; charset=utf-8"}
POLICY = "default-src 'self'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'"


def rfc3339(time):
    return time.astimezone(datetime.timezone.utc).strftime("%Y-%m-%dT%H:%M:%SZ")


def now():
    return datetime.datetime.now(datetime.timezone.utc)


def board(index, shelf=1, slot=None, **changes):
    serial = f"NX5{index:04}"
    return {"boardIndex": index, "board": serial, "status": "started", "secondaryStatus": "none", "name": "NX5-T1",
            "model": "NX5-T1", "family": "NX5", "firmwareName": "nx5.fw", "firmwareVersion": "4.2",
            "serialNumber": serial, "logicalId": index - 1, "errorMessage": "", "changeDate": rfc3339(now()),
            "functionalDescription": "T1 trunk board", "hardwareId": 16, "sharedMemoryAddress": "0xD0000000",
            "ioAddress": "0xE800", "irq": 11, "shelfId": shelf, "pciSlotNumber": slot or index, "busNumber": 2,
            "physicalIndex": 100 + index, **changes}


def counts(**changes):
    return {**dict.fromkeys(("es", "ses", "sefs", "uas", "css", "pcv", "les", "bes", "dm", "lcv"), 0), **changes}


def intervals(**special):
    """96 closed intervals without errors. `i5={...}` gives interval 5 counts, `i5=None` makes it invalid."""
    begin = now().replace(microsecond=0) - datetime.timedelta(seconds=300)
    result = []
    for number in range(1, 97):
        given = special.get(f"i{number}", {})
        start = begin - datetime.timedelta(seconds=900 * number)
        result.append({"number": number, **counts(**(given or {})), "validData": given is not None,
                       "start": rfc3339(start)})
    return result


def line(index, number, on, **changes):
    return {"name": f"trunk-{index}", "ifIndex": 1000 + index, "board": on["serialNumber"],
            "boardIndex": on["boardIndex"], "alias": "", "physicalIndex": None, "adminStatus": "up",
            "operStatus": "up", "timeElapsed": 300, "validIntervals": 96, "lineType": "dsx1ESF",
            "lineCoding": "dsx1B8ZS", "sendCode": "dsx1SendNoCode", "circuitIdentifier": f"T1-{index:04}",
            "loopbackConfig": "dsx1NoLoop", "lineStatus": ["dsx1NoAlarm"], "signalMode": "robbedBit",
            "transmitClockSource": "loopTiming", "fdl": ["dsx1FdlNone"], "invalidIntervals": 0, "lineLength": 40,
            "lineStatusLastChangeSeconds": 0, "lineStatusChangeTrapEnable": "enabled",
            "loopbackStatus": ["dsx1NoLoopback"], "ds1ChannelNumber": number, "channelization": "disabled",
            "lineMode": "csu", "lineBuildOut": "zerodB", "lineImpedance": "balanced100ohms",
            "current": counts(), "total": counts(), "channels": 24, "channelsInUse": 0, **changes}


def channel(on, slot, **changes):
    return {"name": f"{on['name']}-b{slot}", "ifIndex": on["ifIndex"] * 100 + slot, "board": on["board"],
            "boardIndex": on["boardIndex"], "line": on["name"], "lineIfIndex": on["ifIndex"], "timeSlot": slot,
            "channelType": "dialup", "operStatus": "idle", "channelNumber": slot, "peerAddress": "",
            "peerSubAddress": "", "callOrigin": "unknown", "infoType": "unknown", "multirate": False,
            "callSetupTimeSeconds": None, "callConnectTimeSeconds": None, "chargedUnits": 0, **changes}


def alarm(number, severity, resource, text, **changes):
    return {"number": number, "board": None, "line": None, "kind": "dsx1LossOfSignal", "severity": severity,
            "resource": resource, "boardIndex": None, "ifIndex": None, "date": rfc3339(now()),
            "beganDate": rfc3339(now()), "times": 1, "text": text, "state": "active", **changes}


def entry(number, event, text, **changes):
    return {"number": number, "date": rfc3339(now()), "event": event, "text": text, "board": None, "ifIndex": None,
            "line": None, "kind": None, "severity": None, "times": None, **changes}


def process(number, **changes):
    return {"id": number, "name": "callserver", "opens": 3, "closes": 1, "eventQueueSize": 100, "currentEvents": 2,
            "maxEvents": 9, "totalEvents": 12345, "handlers": 1, **changes}


def module(index, **changes):
    return {"index": index, "name": "z7sim", "purpose": "boards", "version": "1.0", "date": None, **changes}


def service(index, **changes):
    return {"index": index, "name": "service", "scmName": "svc", "status": 1, "changeDate": None, **changes}


class Refused(Exception):
    def __init__(self, status, message):
        super().__init__(message)
        self.status = status


class FakeAgent:
    """A `FakeAgent` serves lists that a test changes between `with agent.change():`. Thread-safe."""

    def __init__(self, page, boards=(), lines=()):
        self._page = pathlib.Path(page)
        self.lock = threading.RLock()
        self.boards = list(boards)
        self.lines = list(lines)
        self.intervals = {}  # ifIndex -> closed intervals; clean ones for other lines
        self.channels = []
        self.alarms = []
        self.journal = []
        self.processes = []
        self.modules = []
        self.services = []
        self.token = None
        self.broken = None  # a status with which everything is refused
        self.snapshot = 1
        self.frozen = None  # when the boards were read last, if they are not read now
        self.started = rfc3339(now() - datetime.timedelta(hours=5))
        self.hostname = "gw1"
        self.asked = []  # (path and query, status) of each request
        self._server = None
        self.start()

    def change(self):
        return Change(self)

    @property
    def address(self):
        return f"http://127.0.0.1:{self.port}"

    def start(self, port=0):
        fake = self

        class Handler(http.server.BaseHTTPRequestHandler):
            protocol_version = "HTTP/1.1"

            def do_GET(self):
                fake.handle(self)

            def log_message(self, *_):
                pass

        class Server(http.server.ThreadingHTTPServer):
            daemon_threads = True
            block_on_close = False

            def handle_error(self, *_):
                pass  # a browser that leaves

        self._server = Server(("127.0.0.1", port), Handler)
        self.port = self._server.server_port
        self.broken = None
        threading.Thread(target=self._server.serve_forever, kwargs={"poll_interval": 0.02}, daemon=True).start()

    def stop(self):
        """Ends listening, and answering on connections that are open."""
        self._server.shutdown()
        self._server.server_close()
        self.broken = -1

    def restart(self):
        self.start(self.port)

    def handle(self, request):
        if self.broken == -1:
            request.close_connection = True
            return
        parts = urllib.parse.urlsplit(request.path)
        headers = {"Content-Security-Policy": POLICY, "X-Content-Type-Options": "nosniff",
                   "Cache-Control": "no-cache"}
        if not parts.path.startswith("/api/"):
            status, kind, body = self.file(parts.path)
        else:
            kind = "application/json"
            status, body = self.answer(request, parts, headers)
        with self.lock:
            self.asked.append((request.path, status))
        request.send_response(status)
        headers.update({"Content-Type": kind, "Content-Length": str(len(body))} if status != 304 else {})
        for name, value in headers.items():
            request.send_header(name, value)
        request.end_headers()
        if status != 304:
            request.wfile.write(body)

    def file(self, path):
        path = self._page / ("index.html" if path == "/" else path.removeprefix("/page/"))
        if path.parent != self._page or not path.is_file():
            return 404, "text/plain", b"not found"
        return 200, TYPES[path.suffix], path.read_bytes()

    def answer(self, request, parts, headers):
        with self.lock:
            if self.broken:
                return self.refusal(self.broken, "the agent is broken")
            if self.token and request.headers.get("Authorization") != f"Bearer {self.token}":
                return self.refusal(401, "a token is needed")
            headers["ETag"] = f'"{self.snapshot}"'
            if request.headers.get("If-None-Match") == headers["ETag"]:
                return 304, b""
            try:
                query = dict(urllib.parse.parse_qsl(parts.query))
                content = self.resource(parts.path.removeprefix("/api/v1/").split("/"), query)
            except Refused as refused:
                del headers["ETag"]
                return self.refusal(refused.status, str(refused))
            content = {"snapshot": self.snapshot, "time": rfc3339(self.frozen or now()), "ageSeconds": 0, **content}
            return 200, json.dumps(content).encode()

    @staticmethod
    def refusal(status, message):
        return status, json.dumps({"error": {"status": status, "message": message}}).encode()

    def resource(self, path, query):
        name, *rest = [urllib.parse.unquote(part) for part in path]
        simple = {"alarms": self.alarms, "processes": self.processes, "modules": self.modules,
                  "services": self.services}
        if name in simple:
            return {name: simple[name]}
        if name == "health":
            return {"health": self.health()}
        if name == "journal":
            limit = int(query.get("limit", 200))
            if "after" not in query:
                return {"entries": self.journal[-limit:]}
            return {"entries": [one for one in self.journal if one["number"] > int(query["after"])][:limit]}
        if name == "boards" and not rest:
            return {"boards": [self.pick(one, query) for one in self.boards]}
        if name == "boards":
            found = self.find(self.boards, rest[0], "serialNumber", "boardIndex")
            return {"board": found, "devices": [], "processors": [],
                    "lines": [one for one in self.lines if one["boardIndex"] == found["boardIndex"]]}
        if name == "lines" and rest:
            found = self.find(self.lines, rest[0], "name", "ifIndex")
            return {"line": {**found, "intervals": self.intervals_of(found)}}
        if name == "lines":
            return {"lines": [self.pick(one, query) for one in self.lines if self.is_wanted(one, query)]}
        if name == "channels":
            found = self.find(self.lines, query["line"], "name", "ifIndex")
            return {"channels": [one for one in self.channels if one["lineIfIndex"] == found["ifIndex"]],
                    "signallingChannels": [], "dataLinks": []}
        raise Refused(404, "no such resource")

    @staticmethod
    def find(rows, name, *keys):
        for key in keys:
            for row in rows:
                if str(row[key]) == name:
                    return row
        raise Refused(404, f"there is no {name}")

    @staticmethod
    def is_wanted(row, query):
        return "ifIndex" not in query or str(row["ifIndex"]) in query["ifIndex"].split(",")

    def pick(self, row, query):
        if "fields" not in query:
            return row
        picked = {}
        for field in query["fields"].split(","):
            if field == "strip":
                picked[field] = [[one["es"], one["ses"], one["uas"]] if one["validData"] else None
                                 for one in self.intervals_of(row)]
            elif field in row:
                picked[field] = row[field]
            else:
                raise Refused(400, f"there is no field {field}")
        return picked

    def intervals_of(self, row):
        return self.intervals.get(row["ifIndex"]) or intervals()

    def health(self):
        return {"host": self.hostname, "agentStarted": self.started, "libraryVersion": "KVL OAM 0.9",
                "agentVersion": "0.9.0", "notificationsDropped": 0, "boardCount": len(self.boards), "boardTableLastChangeSeconds": 0,
                "boardStatusChanges": 0, "platformServiceStatus": 0, "platformServiceChangeDate": self.started,
                "faultCount": 0, "faultsRaised": 0, "faultTableLastChangeSeconds": 0, "faultsUnlisted": 0,
                "agentUpTimeSeconds": 18000.5, "notificationsSent": 12, "notificationsWaiting": 0, "notificationsUnacknowledged": 0, "requests": 4711,
                "snapshots": self.snapshot, "snapshotAge": 3, "refreshTime": 7, "longestRefreshTime": 31,
                "interfaceCount": len(self.lines), "lineCount": len(self.lines), "agentFront": "standAlone",
                "alarmCount": len(self.alarms), "alarmsRaised": 9, "alarmsSuppressed": 1,
                "channels": sum(one["channels"] for one in self.lines),
                "channelsInUse": sum(one["channelsInUse"] for one in self.lines),
                "masterState": None, "masterLosses": None, "interfaceConflicts": None, "persistence": "kept"}


class Change:
    """A `Change` holds the agent's lock while a test changes what it serves; a new snapshot follows."""

    def __init__(self, agent):
        self._agent = agent

    def __enter__(self):
        self._agent.lock.acquire()
        return self._agent

    def __exit__(self, *_):
        self._agent.snapshot += 1
        self._agent.lock.release()


def chassis(boards, lines_per_board):
    """Boards in shelves of 16 slots, and their lines."""
    made = [board(index, shelf=(index - 1) // 16 + 1, slot=(index - 1) % 16 + 1) for index in range(1, boards + 1)]
    lines = [line(one["boardIndex"] * 10 + number, number, one) for one in made
             for number in range(1, lines_per_board + 1)]
    return made, lines
