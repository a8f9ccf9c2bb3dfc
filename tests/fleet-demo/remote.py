# SPDX-License-Identifier: BSD-2-Clause
"""Collectors that send everything on to stores of other kinds, by the remote write protocol."""

import time

from engines import ALERTS, RULES, UNWRITTEN, query, scrapes, write_targets
from programs import Failure, Program, eventually, fetch, samples

COLLECTOR = """\
  external_labels: {{collector: {name}}}
"""

# The collectors' names are not in their alerts, which Alertmanager so takes for the same.
SEND = """\
  alert_relabel_configs: [{{regex: collector, action: labeldrop}}]
remote_write:
- url: http://{prometheus}/api/v1/write
- url: http://{victoria}/api/v1/write
"""

# A batch that the end of the store interrupts is sent again, with samples that are there already.
STORE = """\
storage: {tsdb: {out_of_order_time_window: 10m}}
"""

# For how many scrapes the stores are away.
AWAY = 5


class RemoteWriters:
    """A `RemoteWriters` is two Prometheus servers that scrape all targets, evaluate the rules, and send all
    samples on to two stores: a Prometheus that receives, and a VictoriaMetrics. Each store has the samples of
    both collectors, which differ in the label `collector`."""

    TITLE = "two Prometheus servers that send to Prometheus and VictoriaMetrics"
    COPIES = 2
    # The samples of the collector that is not killed.
    SELECTOR = 'job="kvloam",collector="b"'

    def __init__(self, folder, options, network, targets, alertmanager, programs):
        folder.mkdir()
        self._folder, self._options, self._programs = folder, options, programs
        self._addresses = {"prometheus": f"{network.server(1)}:9090", "victoria": f"{network.server(2)}:8428"}
        self._collector_addresses = [f"{network.server(number)}:9090" for number in (11, 12)]
        (folder / "store.yml").write_text(STORE)
        self._stores = {name: self._start_store(name) for name in self._addresses}
        for name in self._stores:
            self._wait_store(name)
        write_targets(folder / "targets.json", targets)
        text = scrapes(options, folder / "targets.json")
        text += (ALERTS + SEND).format(rules=RULES, alertmanager=alertmanager.address, **self._addresses)
        self._collectors = []
        for name, address in zip("ab", self._collector_addresses):
            config = folder / f"collector-{name}.yml"
            config.write_text(text.replace("global:\n", "global:\n" + COLLECTOR.format(name=name), 1))
            self._collectors.append(self._start(
                f"collector-{name}", "prometheus", f"--config.file={config}", f"--web.listen-address={address}",
                f"--storage.tsdb.path={folder}/data-{name}", "--log.level=warn",
                # At the end, all programs stop together.
                "--storage.remote.flush-deadline=1s"))
        for collector, address in zip(self._collectors, self._collector_addresses):
            collector.wait_for_answer(f"http://{address}/-/ready", options.patience)

    def _start(self, title, *command):
        program = Program(self._folder, title, command)
        self._programs.append(program)
        return program

    def _start_store(self, name):
        address = self._addresses[name]
        if name == "prometheus":
            return self._start(
                "store-prometheus", "prometheus", f"--config.file={self._folder}/store.yml",
                f"--storage.tsdb.path={self._folder}/store", f"--web.listen-address={address}",
                "--web.enable-remote-write-receiver", "--log.level=warn")
        return self._start(
            "store-victoria", "victoria-metrics", f"-storageDataPath={self._folder}/victoria",
            f"-httpListenAddr={address}", "-dedup.minScrapeInterval=1ms",
            "-search.latencyOffset=1s", "-search.disableCache", "-memory.allowedPercent=20", "-retentionPeriod=1",
            "-loggerLevel=WARN")

    def _wait_store(self, name):
        page = "-/ready" if name == "prometheus" else "health"
        self._stores[name].wait_for_answer(f"http://{self._addresses[name]}/{page}", self._options.patience)

    def programs(self):
        return {"collectors": self._collectors, "Prometheus as a store": [self._stores["prometheus"]],
                "VictoriaMetrics as a store": [self._stores["victoria"]]}

    def addresses(self):
        return self._addresses.values()

    def survivor(self):
        """Both stores are killed."""

    def kill(self):
        self._collectors[0].kill()
        for store in self._stores.values():
            store.kill()
        return "one of two collectors, and both stores"

    def _behind(self):
        """Nothing when both stores lack the samples of some scrapes."""
        text = fetch(f"http://{self._collector_addresses[1]}/metrics")
        newest = samples(text, "prometheus_remote_storage_highest_timestamp_in_seconds")
        sent = [samples(text, "prometheus_remote_storage_queue_highest_sent_timestamp_seconds" +
                        rf'\{{[^}}]*{address}[^}}]*\}}') for address in self._addresses.values()]
        behind = min(newest - each for each in sent)
        return None if behind > AWAY * self._options.interval else f"the stores are {behind} s behind"

    def restart(self):
        """Starts the stores again when they have missed some scrapes. Returns where each answers, and how
        many seconds of samples it has lost for good."""
        eventually(self._behind, self._options.patience + 2 * AWAY * self._options.interval, "collector b")
        for name in self._stores:
            self._stores[name] = self._start_store(name)
        for name in self._stores:
            self._wait_store(name)
        return [(address, self._lost(address)) for address in self._addresses.values()]

    def _lost(self, address):
        """How many seconds of samples the store loses when it is killed."""
        return UNWRITTEN if address == self._addresses["victoria"] else 0

    def check_complete(self, address, began, killed, until, table):
        """Waits until the store has every sample of the time from `began` to `until` that the collector has, except
        for those that it may have lost when it was killed."""
        lost = self._lost(address)

        def times(where, selector):
            window = int(time.time() - began) + 1
            return {(series["metric"]["instance"], float(when))
                    for series in query(where, f"up{{{selector}}}[{window}s]")
                    for when, _ in series["values"] if began <= float(when) <= until}

        def wrong():
            nonlocal missing
            missing = sent - times(address, self.SELECTOR)
            late = [when for _, when in missing if not killed - lost <= when <= killed]
            return f"{len(late)} of {len(sent)} samples are missing: {sorted(late)[:20]}" if late else None

        sent, missing = times(self._collector_addresses[1], 'job="kvloam"'), set()
        eventually(wrong, self._options.patience, address)
        if not sent:
            raise Failure("the collector has no samples")
        table.add("samples that it lacks", f"{len(missing)} of {len(sent)}")

    def counts(self):
        """Of one collector."""
        text = fetch(f"http://{self._collector_addresses[1]}/metrics")
        return (samples(text, "prometheus_tsdb_head_series"),
                samples(text, "prometheus_tsdb_head_samples_appended_total"))

    def sizes(self):
        """The stores have the samples of two collectors: their sizes say nothing about one."""
        return 0, 0, 0

    def slot(self, seconds):
        return seconds
