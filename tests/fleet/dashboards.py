# SPDX-License-Identifier: BSD-2-Clause
"""Grafana's dashboards in fleet/, and the expressions in them."""
import glob
import json
import re

VARIABLE = re.compile(r'\$\{(\w+(?:\.\w+)*)\}|\$(\w+)')
# Of Grafana itself, as it would be for scrapes that come every 2 seconds.
OWN = {'__rate_interval': '8s', '__value.text': 'text', '__all': '.*'}


def read_dashboards(tree):
    """File name -> dashboard."""
    dashboards = {}
    for path in sorted(glob.glob(tree + '/fleet/grafana/*.json')):
        with open(path, encoding='utf-8') as file:
            dashboards[path.rsplit('/', 1)[1]] = json.load(file)
    return dashboards


def variables_in(text):
    return {one or other for one, other in VARIABLE.findall(text)}


def with_variables(text, values):
    """The text as Grafana sends it when the variables have these values; one of several is a list."""
    def value(found):
        name = found[1] or found[2]
        given = values[name] if name in values else OWN[name]
        return given if isinstance(given, str) else '(%s)' % '|'.join(given)
    return VARIABLE.sub(value, text)


def targets(dashboard):
    """Every panel that asks, with each of its targets."""
    return [(panel, target) for panel in dashboard['panels'] for target in panel.get('targets', [])]


def queries(dashboard):
    """Variable -> the selector that its values come from, and the label."""
    return {variable['name']: re.fullmatch(r'label_values\((.*), (\w+)\)', variable['query']['query']).groups()
            for variable in dashboard['templating']['list'] if variable['type'] == 'query'}


def columns(panel):
    """The columns that a table puts in order, as the data call them, and all that it mentions."""
    organize = panel['transformations'][-1]['options']
    return organize['indexByName'], {**organize['excludeByName'], **organize['indexByName'], **organize['renameByName']}
