# SPDX-License-Identifier: BSD-2-Clause
"""What an agent answers, as Net-SNMP's tools see it."""
import re
import subprocess


# As Net-SNMP's tools print types.
TYPES = {'INTEGER': ('INTEGER', 'Integer32'), 'Gauge32': ('Gauge32', 'Unsigned32'),
         'Counter32': ('Counter32',), 'Counter64': ('Counter64',), 'Timeticks': ('TimeTicks',),
         'Hex-STRING': ('OCTET STRING', 'BITS'), 'STRING': ('OCTET STRING', 'BITS'),
         'OID': ('OBJECT IDENTIFIER',), 'IpAddress': ('IpAddress',)}


def parse(line):
    """(number, (type as the tools print it, value)) of "name = TYPE: value", or None."""
    answer = re.fullmatch(r'\.([\d.]+) = (?:([\w-]+): ?)?(.*)', line)
    if answer is None:
        return None
    return tuple(int(part) for part in answer[1].split('.')), (answer[2] or 'STRING', answer[3])


def walk(address, places):
    """number -> (type as the tools print it, value)."""
    answers = {}
    for place in places:
        done = subprocess.run(['snmpbulkwalk', '-v2c', '-c', 'public', '-t', '30', '-r', '2', '-m', '',
                               '-OnxU', '-Oe', address, place], check=True, stdout=subprocess.PIPE,
                              text=True)
        last = None
        for line in done.stdout.splitlines():
            answer = parse(line)
            if answer:
                last = answer[0]
                answers[last] = answer[1]
            elif last:
                answers[last] = (answers[last][0], answers[last][1] + line)
    return {oid: a for oid, a in answers.items() if not a[1].startswith('No ')}


def octets(kind, value):
    """The octets of a text, or of BITS."""
    if kind == 'Hex-STRING':
        return bytes.fromhex(value)
    return value.strip('"').encode()


def number(value):
    """A number without its unit; of TimeTicks, the hundredths."""
    return int(value.split()[0].strip('()'))


def wrong_value(syntax, kind, value):
    """Why a value is not legal, or None."""
    if syntax.base not in TYPES.get(kind, ()):
        return 'is a %s, not %s' % (kind, syntax.base)
    if syntax.base == 'BITS':
        wrong = [8 * byte + bit for byte, octet in enumerate(octets(kind, value)) for bit in range(8)
                 if octet & (0x80 >> bit) and 8 * byte + bit not in syntax.labels]
        return 'has the unknown bits %s' % wrong if wrong else None
    if syntax.base == 'OCTET STRING':
        size = len(octets(kind, value))
        return None if syntax.permits(size) else 'has %d octets' % size
    if syntax.base == 'OBJECT IDENTIFIER':
        return None if re.fullmatch(r'\.?[\d.]+', value) else 'is no object identifier'
    numeric = number(value)
    if syntax.labels:
        return None if numeric in syntax.labels else \
            'is %d, which the enumeration does not have' % numeric
    return None if syntax.permits(numeric) else 'is %d, out of range' % numeric


def plain(answer):
    """A value that can be compared with another client's: a number, octets, or a name's numbers."""
    kind, value = answer
    if kind in ('STRING', 'Hex-STRING'):
        return octets(kind, value)
    if kind == 'OID':
        return tuple(int(part) for part in value.strip('.').split('.'))
    if kind == 'IpAddress':
        return bytes(int(part) for part in value.split('.'))
    return number(value)


class Steady:
    """`Steady` compares a client's values with those of a walk before and one after it. A number that
    changes meanwhile may be any between the two; what is new or gone may be missing."""

    def __init__(self, before, after):
        self.before = {oid: plain(answer) for oid, answer in before.items()}
        self.after = {oid: plain(answer) for oid, answer in after.items()}

    def faults(self, seen):
        """What does not agree; `seen`: number -> value."""
        found = []
        for oid in sorted(set(self.before) & set(self.after) - set(seen)):
            found.append('%s is missing' % _text(oid))
        for oid, value in seen.items():
            sides = [side[oid] for side in (self.before, self.after) if oid in side]
            if not sides:
                found.append('%s: only this client sees it' % _text(oid))
            elif value not in sides and not _between(value, sides):
                found.append('%s is %r, snmpbulkwalk says %r' % (_text(oid), value, sides[0]))
        return found


def repeated(compare):
    """The faults of the best of three comparisons: a line's interval may end during one of them, and
    then its counts fall and those of all closed intervals move."""
    faults = []
    for _ in range(3):
        faults = compare()
        if not faults:
            break
    return faults


def _text(oid):
    return '.'.join(str(part) for part in oid)


def _between(value, sides):
    return isinstance(value, (int, float)) and all(isinstance(s, (int, float)) for s in sides) and \
        min(sides) <= value <= max(sides)
