# SPDX-License-Identifier: BSD-2-Clause
"""The names that rules, consoles and dashboards may use: metrics, recorded series, and states."""
import re
import subprocess

RECORDING = 'fleet/prometheus/rules/kvloam-recording.yml'
# What an expression has besides names of metrics, once functions, texts and labels are gone.
KEYWORDS = {'and', 'or', 'unless', 'bool', 'offset', 'ignoring', 'on'}


class Names:
    """The `Names` are those of one source tree; `program` is print_metrics, which knows all metrics of
    the agent."""

    def __init__(self, tree, program):
        catalogue = subprocess.run([program, 'catalogue'], check=True, capture_output=True, text=True).stdout
        samples = subprocess.run([program, 'plain'], check=True, capture_output=True, text=True).stdout
        with open(tree + '/' + RECORDING, encoding='utf-8') as file:
            self.recorded = set(re.findall(r'record: (\S+)', file.read()))
        self.metrics = set(re.findall(r'^\| `(\w+)`', catalogue, re.M)) | self.recorded
        # Beside a master, there are two more.
        self.states = set(re.findall(r'state="(\w+)"', samples)) | {'lost', 'connected'}

    def unknown_states(self, text):
        """Values of the label `state` in the text that no metric has."""
        return [value for values in re.findall(r'\bstate!?=~?"([^"]*)"', text)
                for value in values.split('|') if value not in self.states]


def metrics_of(expression):
    """The names of metrics in an expression."""
    text = re.sub(r'"(\\.|[^"\\])*"', '', expression)
    text = re.sub(r'\{[^}]*\}|\[[^]]*\]', '', text)
    text = re.sub(r'\b(by|without|on|ignoring|group_left|group_right) *\([^)]*\)', '', text)
    return [name for name in re.findall(r'(?<![\w:.])[a-zA-Z_:][\w:]*(?! *\(|[\w:])', text) if name not in KEYWORDS]
