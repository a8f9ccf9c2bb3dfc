# SPDX-License-Identifier: BSD-2-Clause
"""Monitoring engines: what scrapes a fleet, stores the samples and evaluates the rules."""

import json
import math
import os
import pathlib
import urllib.parse

from programs import Program, fetch, samples

RULES = pathlib.Path(__file__).with_name("rules.yml")

# How many seconds of samples VictoriaMetrics may hold in memory only, which it loses when it is killed.
UNWRITTEN = 15

SCRAPES = """\
global:
  evaluation_interval: {evaluation}s
  scrape_interval: {interval}s
  scrape_timeout: {interval}s
scrape_configs:
- job_name: kvloam
  file_sd_configs: [{{files: ['{targets}']}}]
"""

ALERTS = """\
rule_files: ['{rules}']
alerting:
  alertmanagers: [{{static_configs: [{{targets: ['{alertmanager}']}}]}}]
"""


def query(address, expression):
    """The result of an instant query."""
    answer = fetch(f"http://{address}/api/v1/query", urllib.parse.urlencode({"query": expression}).encode())
    return json.loads(answer)["data"]["result"]


def scrapes(options, path):
    return SCRAPES.format(interval=options.interval, evaluation=options.evaluation, targets=path)


def write_targets(path, targets):
    path.write_text(json.dumps(list(targets)))


def size(folder):
    return sum(os.path.getsize(os.path.join(root, name)) for root, _, names in os.walk(folder) for name in names)


class PrometheusPair:
    """A `PrometheusPair` is two Prometheus servers that do the same: each scrapes all targets and sends
    its alerts to the one Alertmanager."""

    TITLE = "two Prometheus servers"
    COPIES = 2  # how often each target is scraped
    SELECTOR = 'job="kvloam"'  # the samples of one scrape of each target

    def __init__(self, folder, options, network, targets, alertmanager, programs):
        folder.mkdir()
        self._options = options
        write_targets(folder / "targets.json", targets)
        config = folder / "prometheus.yml"
        config.write_text(scrapes(options, folder / "targets.json") +
                          ALERTS.format(rules=RULES, alertmanager=alertmanager.address))
        self._folder, self._addresses, self._servers = folder, [], []
        for number in (1, 2):
            address = f"{network.server(number)}:9090"
            self._addresses.append(address)
            self._servers.append(Program(folder, f"prometheus-{number}", [
                "prometheus", f"--config.file={config}", f"--storage.tsdb.path={folder}/data-{number}",
                f"--web.listen-address={address}", "--web.enable-admin-api", "--log.level=warn"]))
        programs += self._servers
        for server, address in zip(self._servers, self._addresses):
            server.wait_for_answer(f"http://{address}/-/ready", options.patience)

    def programs(self):
        return {"Prometheus": self._servers}

    def addresses(self):
        """Where the stores answer queries."""
        return self._addresses

    def survivor(self):
        """The store that kill() leaves, if it leaves one."""
        return self._addresses[1]

    def kill(self):
        """Kills one collector and one store; here one server is both."""
        self._servers[0].kill()
        return "one of two Prometheus servers"

    def restart(self):
        """Prometheus does not fetch what it has missed."""
        return []

    def check_complete(self, *_):
        """Nothing has all samples that the store should have."""

    def counts(self):
        """Series that are stored, and samples that have been, by one of the servers."""
        text = fetch(f"http://{self._addresses[1]}/metrics")
        return (samples(text, "prometheus_tsdb_head_series"),
                samples(text, "prometheus_tsdb_head_samples_appended_total"))

    def sizes(self):
        """Bytes of all samples, of the index, and the number of samples stored."""
        answer = json.loads(fetch(f"http://{self._addresses[1]}/api/v1/admin/tsdb/snapshot", b"", 600))
        snapshot = self._folder / "data-2" / "snapshots" / answer["data"]["name"]
        values = index = count = 0
        for block in snapshot.iterdir():
            values += size(block / "chunks")
            index += (block / "index").stat().st_size
            count += json.loads((block / "meta.json").read_text())["stats"]["numSamples"]
        return values, index, count

    def slot(self, seconds):
        """Two samples with the same slot would be one that is there twice."""
        return seconds


class VictoriaCluster:
    """A `VictoriaCluster` is three vmagent, each target scraped by two of them, two stores that each
    have all samples once, and a vmalert for each store."""

    TITLE = "three vmagent, two VictoriaMetrics"
    COPIES = 2
    SELECTOR = 'job="kvloam"'

    def __init__(self, folder, options, network, targets, alertmanager, programs):
        folder.mkdir()
        self._options, self._folder, self._programs = options, folder, programs
        self._network, self._alertmanager = network, alertmanager
        write_targets(folder / "targets.json", targets)
        (folder / "scrape.yml").write_text(
            scrapes(options, folder / "targets.json"))
        self._addresses = [f"{network.server(number)}:8428" for number in (1, 2)]
        self._stores = [self._start_store(number) for number in (0, 1)]
        for number in (0, 1):
            self._wait_store(number)
        self._collector_addresses = [f"{network.server(10 + number)}:8429" for number in range(3)]
        self._collectors = [self._start_collector(number) for number in range(3)]
        for collector, address in zip(self._collectors, self._collector_addresses):
            collector.wait_for_answer(f"http://{address}/health", options.patience)
        self._rulers = [self._start_ruler(number) for number in (0, 1)]

    def _start(self, title, *command):
        program = Program(self._folder, title, command)
        self._programs.append(program)
        return program

    def _start_store(self, number):
        return self._start(
            f"store-{number}", "victoria-metrics", f"-storageDataPath={self._folder}/store-{number}",
            f"-httpListenAddr={self._addresses[number]}", f"-dedup.minScrapeInterval={self._options.interval}s",
            "-search.latencyOffset=1s", "-search.disableCache", "-memory.allowedPercent=20", "-retentionPeriod=1",
            "-loggerLevel=WARN")

    def _wait_store(self, number):
        self._stores[number].wait_for_answer(f"http://{self._addresses[number]}/health", self._options.patience)

    def _start_ruler(self, number):
        address = f"{self._network.server(20 + number)}:8880"
        ruler = self._start(
            f"vmalert-{number}", "vmalert", f"-rule={RULES}", f"-datasource.url=http://{self._addresses[number]}",
            f"-notifier.url=http://{self._alertmanager.address}", f"-httpListenAddr={address}",
            f"-evaluationInterval={self._options.evaluation}s", "-disableAlertgroupLabel", "-loggerLevel=WARN")
        ruler.wait_for_answer(f"http://{address}/health", self._options.patience)
        return ruler

    def _start_collector(self, number):
        return self._start(
            f"collector-{number}", "vmagent", f"-promscrape.config={self._folder}/scrape.yml", "-promscrape.config.strictParse=false",
            "-promscrape.cluster.membersCount=3", f"-promscrape.cluster.memberNum={number}",
            "-promscrape.cluster.replicationFactor=2", f"-httpListenAddr={self._collector_addresses[number]}",
            *(f"-remoteWrite.url=http://{store}/api/v1/write" for store in self._addresses),
            f"-remoteWrite.tmpDataPath={self._folder}/queue-{number}", "-memory.allowedPercent=10",
            "-loggerLevel=WARN")

    def programs(self):
        return {"vmagent": self._collectors, "VictoriaMetrics": self._stores, "vmalert": self._rulers}

    def addresses(self):
        return self._addresses

    def survivor(self):
        return self._addresses[1]

    def kill(self):
        self._collectors[0].kill()
        # A vmalert that went on without its store would end alerts when the store returns without its
        # last samples. They run on one host, and fail together.
        self._stores[0].kill()
        self._rulers[0].kill()
        return "one of three vmagent, and one of two stores with its vmalert"

    def restart(self):
        """Starts the killed store again: the collectors then send what it has missed. Returns where each
        store that was killed answers, and how many seconds of samples it may have lost for good."""
        self._stores[0] = self._start_store(0)
        self._wait_store(0)
        self._rulers[0] = self._start_ruler(0)
        return [(self._addresses[0], UNWRITTEN)]

    def check_complete(self, *_):
        """Nothing has all samples that the store should have."""

    def counts(self):
        text = fetch(f"http://{self._addresses[1]}/metrics")
        return (samples(text, 'vm_cache_entries{type="storage/hour_metric_ids"}'),
                sum(samples(fetch(f"http://{address}/metrics"), "vm_promscrape_scraped_samples_sum")
                    for address in self._collector_addresses) / self.COPIES)

    def sizes(self):
        fetch(f"http://{self._addresses[1]}/internal/force_flush")
        text = fetch(f"http://{self._addresses[1]}/metrics")
        return (samples(text, r'vm_data_size_bytes{type="storage/[a-z]+"}'),
                samples(text, r'vm_data_size_bytes{type="indexdb/[a-z]+"}') or
                samples(text, r'vm_data_size_bytes{type="indexdb"}'),
                samples(text, r'vm_rows{type="storage/[a-z]+"}'))

    def slot(self, seconds):
        """The store keeps one sample for each interval."""
        return math.ceil(round(seconds * 1000) / (self._options.interval * 1000))
