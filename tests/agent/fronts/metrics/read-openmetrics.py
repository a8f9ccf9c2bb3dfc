# SPDX-License-Identifier: BSD-2-Clause
"""Reads OpenMetrics text from standard input with the parser of Prometheus's client for Python,
which is strict, and checks what the metrics of sample boards must contain."""
import sys

from prometheus_client.openmetrics.parser import text_fd_to_metric_families


def main():
    text = sys.stdin.read()
    families = {family.name: family for family in text_fd_to_metric_families(text.splitlines(True))}
    assert len(families) > 50, len(families)
    line = families['kvloam_line_errored_seconds']
    assert (line.type, line.unit) == ('counter', 'seconds'), (line.type, line.unit)
    assert {sample.labels['line'] for sample in line.samples} == {
        'nx5-1-trunk-1', 'nx5-1-trunk-2', 'nx5-2-trunk-1', 'nx5-2-trunk-2'}
    assert families['kvloam_board'].type == 'info'
    assert families['kvloam_board_status'].type == 'gauge'
    assert families['kvloam_process_opens'].samples[0].labels['process'] == 'telephony "one"'
    try:
        list(text_fd_to_metric_families(text.replace('# EOF\n', '').splitlines(True)))
    except ValueError:
        return
    raise AssertionError('the parser accepts a text without an end')


main()
