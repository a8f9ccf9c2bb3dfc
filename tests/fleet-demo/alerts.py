# SPDX-License-Identifier: BSD-2-Clause
"""Alertmanager, and what it notifies."""

import http.server
import json
import threading
import time

from programs import Program

CONFIG = """\
route:
  receiver: fleet
  group_by: ['...']
  group_wait: 0s
  group_interval: 1s
  repeat_interval: 4h
receivers:
- name: fleet
  webhook_configs: [{{url: 'http://{receiver}/', send_resolved: true}}]
"""


class Receiver:
    """A `Receiver` is an HTTP server that Alertmanager notifies of alerts. Thread-safe."""

    def __init__(self, address):
        self.address = f"{address}:8080"
        self._lock = threading.Lock()
        self._firing = {}
        receiver = self

        class Handler(http.server.BaseHTTPRequestHandler):
            def do_POST(self):
                body = json.loads(self.rfile.read(int(self.headers["Content-Length"])))
                receiver.note(body["alerts"])
                self.send_response(200)
                self.send_header("Content-Length", "0")
                self.end_headers()

            def log_message(self, *_):
                pass

        self._server = http.server.ThreadingHTTPServer((address, 8080), Handler)
        threading.Thread(target=self._server.serve_forever, daemon=True).start()

    def note(self, alerts):
        with self._lock:
            for alert in alerts:
                if alert["status"] == "firing":
                    key = (alert["labels"]["alertname"], alert["labels"].get("instance", ""))
                    self._firing.setdefault(key, []).append(time.monotonic())

    def firing(self):
        """When each alert was notified, by the alert's name and the instance."""
        with self._lock:
            return {key: list(times) for key, times in self._firing.items()}

    def stop(self):
        self._server.shutdown()


class Alertmanager:
    """An `Alertmanager` is the program of that name; every alert is a group of its own, so that the
    receiver learns of each at once."""

    def __init__(self, folder, options, address, receiver):
        folder.mkdir()
        self.address = f"{address}:9093"
        config = folder / "alertmanager.yml"
        config.write_text(CONFIG.format(receiver=receiver.address))
        self.program = Program(folder, "alertmanager", [
            "prometheus-alertmanager", f"--config.file={config}", f"--storage.path={folder}/data",
            f"--web.listen-address={self.address}", "--cluster.listen-address="])
        self.program.wait_for_answer(f"http://{self.address}/-/ready", options.patience)
