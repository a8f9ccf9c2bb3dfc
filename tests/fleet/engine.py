# SPDX-License-Identifier: BSD-2-Clause
"""A real Prometheus with the configuration in fleet/, but faster, or VictoriaMetrics with the same."""
import contextlib
import json
import os
import re
import shlex
import subprocess
import sys
import urllib.parse
import urllib.request

sys.path.insert(0, os.path.join(os.path.dirname(os.path.dirname(os.path.abspath(__file__))), 'support'))

from ports import free_port


def configure(tree, folder, targets, replaced=(), relabelled=''):
    """Writes the configuration into the folder: scrapes come every 4 seconds, and alerts fire at once.
    `targets` is what a file of discovery has. `replaced` are more pairs of texts, old and new, and
    `relabelled` are more relabelling rules of the one job."""
    with open(tree + '/fleet/prometheus/prometheus.yml', encoding='utf-8') as file:
        text = file.read()
    for old, new in (('scrape_interval: 1m', 'scrape_interval: 4s'),
                     ('scrape_timeout: 20s', 'scrape_timeout: 3s'),
                     ('evaluation_interval: 1m', 'evaluation_interval: 1s'), *replaced):
        assert old in text, old
        text = text.replace(old, new)
    with open(folder + '/prometheus.yml', 'w', encoding='utf-8') as file:
        file.write(text + relabelled)
    os.mkdir(folder + '/rules')
    for name in ('kvloam-recording.yml', 'kvloam-alerts.yml'):
        with open(tree + '/fleet/prometheus/rules/' + name, encoding='utf-8') as file:
            rules = re.sub(r'^ +for: .*\n', '', file.read(), flags=re.M)
        with open(folder + '/rules/' + name, 'w', encoding='utf-8') as file:
            file.write(rules)
    os.mkdir(folder + '/targets')
    with open(folder + '/targets/targets.yml', 'w', encoding='utf-8') as file:
        json.dump(targets, file)


@contextlib.contextmanager
def prometheus(tree, folder):
    """A Prometheus with the configuration in the folder; the base address of its pages."""
    base = '127.0.0.1:%d' % free_port()
    process = subprocess.Popen(
        ['prometheus', '--config.file=' + folder + '/prometheus.yml', '--web.listen-address=' + base,
         '--storage.tsdb.path=' + folder + '/data', '--enable-feature=extra-scrape-metrics',
         '--web.console.templates=' + tree + '/fleet/prometheus/consoles'],
        stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
    try:
        yield 'http://%s/' % base
    finally:
        process.terminate()
        process.wait()


@contextlib.contextmanager
def victoria(tree, folder):
    """The same with VictoriaMetrics: a collector, a store, and what evaluates the rules. They have the options
    of docs/fleet.md."""
    store, collector, ruler = ('127.0.0.1:%d' % free_port() for _ in range(3))
    with open(tree + '/docs/fleet.md', encoding='utf-8') as file:
        text = file.read().replace('\\\n', ' ')
    replaced = {
        r'^victoria-metrics .*': (
            ('/var/lib/victoria-metrics', folder + '/store'), ('=60s', '=4s'), ('$', ' -httpListenAddr=' + store)),
        r'^vmalert .*': (
            ('/etc/prometheus', folder), ('localhost:8428', store), ('alerts:9093', '127.0.0.1:9'),
            ('=1m', '=1s'), ('$', ' -httpListenAddr=' + ruler)),
        r'^vmagent .*': (
            ('/etc/prometheus', folder), ('s1:8428', store), (r' -remoteWrite.url=http://s2\S*', ''),
            (r' -promscrape.cluster\S*', ''),
            ('$', ' -remoteWrite.tmpDataPath=%s/queue -httpListenAddr=%s' % (folder, collector)))}
    with contextlib.ExitStack() as stack:
        for pattern, changes in replaced.items():
            command = re.search(pattern, text, re.M)[0]
            for old, new in changes:
                command, count = re.subn(old, new, command)
                assert count, old
            process = subprocess.Popen(shlex.split(command), stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
            stack.callback(process.wait)
            stack.callback(process.terminate)
        yield 'http://%s/' % store


ENGINES = {'prometheus': prometheus, 'victoria': victoria}


def ask(base, path, **parameters):
    """The data of an answer of Prometheus's API."""
    query = urllib.parse.urlencode(parameters, doseq=True)
    with urllib.request.urlopen(base + 'api/v1/' + path + '?' + query, timeout=30) as answer:
        return json.load(answer)['data']
