# SPDX-License-Identifier: BSD-2-Clause
"""What is served of each MIB module, why the rest is not, and the texts that say so."""
import os
import re
import textwrap

# In the order of the documents.
MODULES = ('KVL-OAM-MIB', 'SNMPv2-MIB', 'SNMP-FRAMEWORK-MIB', 'IF-MIB', 'DS1-MIB', 'DS0-MIB', 'ISDN-MIB',
           'EtherLike-MIB', 'ENTITY-MIB', 'NOTIFICATION-LOG-MIB',
           'ALARM-MIB', 'ENTITY-STATE-MIB')
# What the SNMP library serves, not our description.
LIBRARY = ('SNMPv2-MIB', 'SNMP-FRAMEWORK-MIB')
STATES = ('not served', 'not yet', 'read-only', 'some rows', 'at times', 'not here')
BEGIN, END = '<!-- begin: written by scripts/update-mibs -->\n', '<!-- end -->\n'


class Conformance:
    """The `Conformance` is the content of mibs/conformance.ini."""

    def __init__(self, root, modules):
        self.modules = modules
        self.groups = {}   # name -> why it is not served
        self.groups_not_yet = []
        self.statements = {}  # compliance statement -> why it is not ours
        self.objects = {}  # name -> state -> reason
        self.faults = []
        module = None
        with open(os.path.join(root, 'mibs', 'conformance.ini')) as file:
            for number, line in enumerate(file, 1):
                line = line.strip()
                if not line or line.startswith('#'):
                    continue
                section = re.fullmatch(r'\[(.*)\]', line)
                entry = re.fullmatch(r'(\w+) (%s): (\S.*\.)' % '|'.join(STATES), line)
                if section:
                    module = section[1]
                    if module not in MODULES:
                        self._fault(number, 'no module ' + module)
                elif not entry:
                    self._fault(number, 'not "<name> <state>: <reason>.": ' + line)
                else:
                    self._enter(number, module, *entry.groups())

    def _fault(self, number, message):
        self.faults.append('mibs/conformance.ini:%d: %s' % (number, message))

    def _enter(self, number, module, name, state, reason):
        known = self.modules.groups.get(name) or self.modules.objects.get(name)
        if name in self.modules.statements and self.modules.statements[name][0] == module:
            self.statements[name] = reason
        elif known is None or known.module != module:
            self._fault(number, '%s has no %s' % (module, name))
        elif name in self.modules.groups:
            if state not in ('not served', 'not yet'):
                self._fault(number, 'a group can only be "not served" or "not yet"')
            self.groups[name] = reason
            if state == 'not yet':
                self.groups_not_yet.append(known)
        elif state in self.objects.setdefault(name, {}):
            self._fault(number, '%s is %s twice' % (name, state))
        else:
            self.objects[name][state] = reason

    def current(self, module):
        """All current groups of a module, by number."""
        return sorted((g for g in self.modules.groups.values()
                       if g.module == module and g.status == 'current'), key=lambda g: g.oid)

    def required(self, module):
        """The compliance statements that apply: mandatory groups, and conditions of others."""
        mandatory, conditions = set(), {}
        for name, (of, groups, others) in self.modules.statements.items():
            if of == module and name not in self.statements:
                mandatory |= groups
                conditions.update(others)
        return mandatory, conditions

    def claimed(self, module):
        """The groups that the agent serves, perhaps with exceptions."""
        return [g for g in self.current(module) if g.name not in self.groups]

    def members(self, module):
        """The objects, not notifications, of the claimed groups, by number."""
        names = {m for g in self.claimed(module) for m in g.members if m in self.modules.objects}
        return sorted((self.modules.objects[n] for n in names), key=lambda o: o.oid)

    def statement(self, described):
        """The part of the capability statement that lists modules, groups and variations."""
        lines = []
        for module in MODULES:
            if not self.claimed(module):
                continue
            lines += ['    SUPPORTS ' + module, '        INCLUDES {']
            lines.append(',\n'.join(' ' * 16 + g.name for g in self.claimed(module)))
            lines.append('            }')
            for each in self.members(module):
                states = self.objects.get(each.name, {})
                if module not in LIBRARY and each.name not in described:
                    access = 'not-implemented'
                    reason = states.get('not served') or states.get('not yet')
                else:
                    access, reason = 'read-only', states.get('read-only')
                if reason:
                    lines += ['        VARIATION ' + each.name, '            ACCESS ' + access]
                    lines += _description(reason)
        return '\n'.join(lines) + '\n'

    def tables(self):
        """The tables of the documents."""
        lines = []
        for module in MODULES:
            lines += ['### ' + module, '', '| group | number | mandatory | served |', '|---|---|---|---|']
            required, conditions = self.required(module)
            for group in self.current(module):
                condition = conditions.get(group.name, 'No')
                mandatory = 'yes' if group.name in required else condition[0].lower() + condition[1:]
                why = self.groups.get(group.name)
                lines.append('| %s | %d | %s | %s |' % (group.name, group.oid[-1], mandatory,
                                                        'no: ' + why if why else 'yes'))
            for name, reason in self.statements.items():
                if self.modules.statements[name][0] == module:
                    lines += ['', '%s does not apply: %s' % (name, reason)]
            exceptions = [(o.name, state, self.objects[o.name][state]) for o in self.members(module)
                          for state in STATES if state in self.objects.get(o.name, {})]
            if exceptions:
                lines += ['', '| object | exception | reason |', '|---|---|---|']
                lines += ['| %s | %s | %s |' % e for e in exceptions]
            lines.append('')
        return '\n'.join(lines)


def _description(reason):
    one = ' ' * 12 + 'DESCRIPTION "%s"' % reason
    if len(one) <= 100:
        return [one]
    lines = textwrap.wrap('"%s"' % reason, 84)
    return [' ' * 12 + 'DESCRIPTION'] + [' ' * 16 + line for line in lines]


def described(program_output):
    """The agent's description: name -> (number, type, table, range that can be set)."""
    objects = {}
    for line in program_output.splitlines():
        if line.split()[0] not in ('scalar', 'column'):
            continue
        kind, name, number, value_type, *rest = line.split()
        oid = tuple(int(part) for part in number.split('.'))
        settable = (int(rest[1]), int(rest[2])) if len(rest) == 3 else None
        objects[name] = (oid, value_type, rest[0] if kind == 'column' else None, settable)
    return objects


def named(program_output, which='names'):
    """The names of the numbers of described enumerations: name -> {number: its name}."""
    return {name: {int(number): text for number, text in (each.split('=') for each in numbers)}
            for kind, name, *numbers in map(str.split, program_output.splitlines()) if kind == which}


def details(program_output, kind):
    """What the program prints of one kind: name -> text."""
    lines = (line.split(' ', 2) for line in program_output.splitlines())
    return {line[1]: line[2] for line in lines if line[0] == kind}


def updated(root, conformance, described_objects):
    """File -> what it should contain."""
    statement = os.path.join(root, 'mibs', 'capabilities', 'KVL-OAM-CAPABILITIES-MIB.txt')
    page = os.path.join(root, 'docs', 'mibs.md')
    with open(statement) as file:
        text = file.read()
    begin, end = text.index('    SUPPORTS '), text.index('    ::= { kvlCapabilities 1 }')
    contents = {statement: text[:begin] + conformance.statement(described_objects) + text[end:]}
    with open(page) as file:
        text = file.read()
    begin, end = text.index(BEGIN) + len(BEGIN), text.index(END)
    contents[page] = text[:begin] + '\n' + conformance.tables() + text[end:]
    return contents
