# SPDX-License-Identifier: BSD-2-Clause
"""The fleet by SNMP: an exporter and walks that poll it, and a receiver of its notifications."""

import concurrent.futures
import os
import pathlib
import resource
import subprocess
import time

from programs import Program, Usage, eventually, fetch, samples

SNMP_YML = pathlib.Path(__file__).parents[2] / "fleet/prometheus/snmp.yml"
MODULES = ("kvloam_interfaces", "kvloam_lines", "kvloam_boards")
PARALLEL = 16


class TrapReceiver:
    """A `TrapReceiver` is an snmptrapd that writes a line for each notification."""

    def __init__(self, folder, network, options):
        config = folder / "snmptrapd.conf"
        config.write_text("authCommunity log public\n")
        self.address = f"{network.server(60)}:1162"
        self.program = Program(folder, "snmptrapd", [
            "snmptrapd", "-f", "-Lo", "-n", "-On", "-C", "-c", config, "-F", "notification from %b\\n",
            f"udp:{self.address}"])
        self.program.wait_for_log("NET-SNMP version", options.patience)

    def count(self):
        with self.program.log.open(encoding="utf-8", errors="replace") as log:
            return sum(line.startswith("notification") for line in log)


def sweep(work, agents):
    """Does `work` for every agent, some at a time; returns the seconds and the sum of the results."""
    began = time.monotonic()
    with concurrent.futures.ThreadPoolExecutor(PARALLEL) as pool:
        total = sum(pool.map(work, agents))
    return time.monotonic() - began, total


def walk(agent):
    done = subprocess.run(["snmpbulkwalk", "-v2c", "-c", "public", "-Cr50", "-On", "-Oq", "-t", "10", "-r", "3",
                           f"{agent.address}:1161", ".1"],
                          check=True, capture_output=True, env={"PATH": os.environ["PATH"], "MIBS": ""})
    return done.stdout.count(b"\n.") + 1


def sent(agents):
    return sum(samples(agent.metrics(), "kvloam_notifications_sent_total") for agent in agents)


def measure(folder, options, network, agents, traps, programs, table):
    exporter_address = f"{network.server(61)}:9116"
    exporter = Program(folder, "snmp-exporter", ["prometheus-snmp-exporter", f"--config.file={SNMP_YML}",
                                                 f"--web.listen-address={exporter_address}", "--log.level=warn"])
    programs.append(exporter)
    exporter.wait_for_answer(f"http://{exporter_address}/metrics", options.patience)
    serving = [agent.program for agent in agents]

    def scrape(agent):
        return sum(sum(not line.startswith("#") for line in fetch(
            f"http://{exporter_address}/snmp?target={agent.address}:1161&module={module}").splitlines())
                   for module in MODULES)

    def row(title, seconds, total, what, own, by_agents):
        table.add(title, f"{seconds:.1f} s, {total / seconds:,.0f} {what} per second; per chassis "
                  f"{own / len(agents) * 1000:.0f} ms of processor, and {by_agents / len(agents) * 1000:.0f} ms "
                  "of the agent's")

    before, own = Usage(serving), exporter.processor()
    seconds, total = sweep(scrape, agents)
    row(f"SNMP exporter polls {len(agents)} agents", seconds, total, "samples", exporter.processor() - own,
        Usage(serving).processor - before.processor)
    table.add("memory of the SNMP exporter", f"{exporter.memory() / 1e6:.0f} MB")
    before, own = Usage(serving), resource.getrusage(resource.RUSAGE_CHILDREN)
    seconds, total = sweep(walk, agents)
    spent = resource.getrusage(resource.RUSAGE_CHILDREN)
    row(f"snmpbulkwalk of {len(agents)} agents, {PARALLEL} at a time", seconds, total, "objects",
        spent.ru_utime + spent.ru_stime - own.ru_utime - own.ru_stime, Usage(serving).processor - before.processor)

    sent_before, arrived_before = sent(agents), traps.count()
    began, own = time.monotonic(), traps.program.processor()
    sweep(lambda agent: agent.control("fail", "--no-wait", "1", "3") or 0, agents)

    def wrong():
        raised, arrived = sent(agents) - sent_before, traps.count() - arrived_before
        # The status changes of two boards are the least that every agent sends.
        if raised < 2 * len(agents) or arrived != raised:
            return f"{raised:.0f} sent, {arrived} arrived"
        return None
    eventually(wrong, options.patience, "notifications")
    arrived = traps.count() - arrived_before
    table.add(f"notifications of {len(agents)} agents to one snmptrapd",
              f"{arrived:,} sent within {time.monotonic() - began:.1f} s, none lost; "
              f"{(traps.program.processor() - own) / arrived * 1e6:.0f} us of processor for each")
