# SPDX-License-Identifier: BSD-2-Clause
"""Reads MIB modules: objects, notifications, groups and compliance statements, as smidump sees them."""
import os
import subprocess
import tempfile
import xml.etree.ElementTree as ElementTree

SETTABLE = ('read-write', 'read-create')
ACCESS = {'noaccess': 'not-accessible', 'notifyonly': 'accessible-for-notify',
          'readonly': 'read-only', 'readwrite': 'read-write'}
# Base types of SNMPv2-SMI, whose own ranges smidump does not print.
RANGES = {'Integer32': (-2**31, 2**31 - 1), 'Unsigned32': (0, 2**32 - 1), 'Gauge32': (0, 2**32 - 1),
          'Counter32': (0, 2**32 - 1), 'TimeTicks': (0, 2**32 - 1), 'Counter64': (0, 2**64 - 1)}


class Syntax:
    """A `Syntax` is a type without names: base type, ranges of a number or of a size, labels."""

    def __init__(self, base, ranges=(), labels=None):
        self.base = base
        self.ranges = list(ranges)
        self.labels = labels or {}

    def permits(self, number):
        """Whether a number, or the size of a text, is in one of the ranges."""
        ranges = self.ranges or [RANGES.get(self.base, (0, 65535))]
        return any(low <= number <= high for low, high in ranges)


class Object:
    """An `Object` is a scalar or a column."""

    def __init__(self, module, name, oid, syntax, access, status, entry=None, unit=''):
        self.module, self.name, self.oid, self.syntax = module, name, oid, syntax
        self.access, self.status, self.entry, self.unit = access, status, entry, unit


class Entry:
    """An `Entry` is a table's row: its number and the names of its index objects."""

    def __init__(self, name, oid, index):
        self.name, self.oid, self.index = name, oid, index


class Group:
    """A `Group` is a group of objects or notifications."""

    def __init__(self, module, name, oid, members, status):
        self.module, self.name, self.oid, self.members, self.status = (
            module, name, oid, members, status)


class Modules:
    """The `Modules` are all modules of some folders."""

    def __init__(self, folders, search):
        self.objects, self.entries, self.groups, self.notifications = {}, {}, {}, {}
        # Current compliance statements: name -> (module, its mandatory groups, group -> condition)
        self.statements = {}
        self.names = []
        self._types = {}
        trees = {}
        with tempfile.NamedTemporaryFile('w', suffix='.conf') as configuration:
            configuration.write('path ' + ':'.join(search) + '\n')
            configuration.flush()
            for folder in search:
                for file in sorted(os.listdir(folder)):
                    if file.endswith('.txt') and not file.startswith('SNMPv2-SMI') \
                            and not file.startswith('SNMPv2-CONF'):
                        path = os.path.join(folder, file)
                        tree = _dump(configuration.name, path)
                        name = tree.find('module').get('name')
                        self._read_types(name, tree)
                        if folder in folders:
                            trees[name] = tree
        self._augmenting = {}
        for name, tree in trees.items():
            self.names.append(name)
            self._read(name, tree)
        for entry, base in self._augmenting.items():
            self.entries[entry].index = self.entries[base].index

    def _read_types(self, module, tree):
        for typedef in tree.iter('typedef'):
            if typedef.get('name'):
                self._types[typedef.get('name')] = self._typedef(typedef)

    def _typedef(self, node):
        base = {'Enumeration': 'INTEGER', 'OctetString': 'OCTET STRING',
                'ObjectIdentifier': 'OBJECT IDENTIFIER', 'Bits': 'BITS'}.get(
                    node.get('basetype'), node.get('basetype'))
        labels = {int(n.get('number')): n.get('name') for n in node.findall('namednumber')}
        ranges = [(int(r.get('min')), int(r.get('max'))) for r in node.findall('range')]
        parent = node.find('parent')
        if parent is not None:
            inherited = self._syntax_of_type(parent.get('name'))
            return Syntax(inherited.base, ranges or inherited.ranges, labels or inherited.labels)
        return Syntax(base, ranges, labels)

    def _syntax_of_type(self, name):
        builtin = {'ObjectIdentifier': 'OBJECT IDENTIFIER', 'OctetString': 'OCTET STRING',
                   'Enumeration': 'INTEGER', 'Bits': 'BITS'}
        return self._types.get(name) or Syntax(builtin.get(name, name))

    def _syntax(self, node):
        syntax = node.find('syntax')
        named = syntax.find('type')
        if named is not None:
            return self._syntax_of_type(named.get('name'))
        return self._typedef(syntax.find('typedef'))

    def _object(self, module, node, entry=None):
        access = ACCESS[node.findtext('access')]
        if access == 'read-write' and node.get('create') == 'true':
            access = 'read-create'
        self.objects[node.get('name')] = Object(module, node.get('name'), _oid(node), self._syntax(node),
                                                access, node.get('status'), entry,
                                                node.findtext('units') or '')

    def _read(self, module, tree):
        for node in tree.iter('scalar'):
            self._object(module, node)
        for row in tree.iter('row'):
            linkage = row.find('linkage')
            index = [i.get('name') for i in linkage.findall('index')]
            entry = Entry(row.get('name'), _oid(row), index)
            self.entries[entry.name] = entry
            if linkage.find('augments') is not None:
                self._augmenting[entry.name] = linkage.find('augments').get('name')
            for column in row.findall('column'):
                self._object(module, column, entry)
        for node in tree.iter('notification'):
            self.notifications[node.get('name')] = (
                module, _oid(node), [o.get('name') for o in node.findall('objects/object')])
        for node in tree.iter('group'):
            self.groups[node.get('name')] = Group(
                module, node.get('name'), _oid(node), [m.get('name') for m in node.iter('member')],
                node.get('status'))
        for node in tree.iter('compliance'):
            if node.get('status') != 'current':
                continue
            conditions = {o.get('name'): ' '.join(o.findtext('description').split()).rstrip('.')
                          for o in node.iter('option')}
            self.statements[node.get('name')] = (
                module, {m.get('name') for m in node.iter('mandatory')}, conditions)


def _oid(node):
    return tuple(int(part) for part in node.get('oid').split('.'))


def _dump(configuration, path):
    dumped = subprocess.run(['smidump', '-c', configuration, '-f', 'xml', path], check=True,
                            stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True)
    return ElementTree.fromstring(dumped.stdout)


def text(oid):
    return '.'.join(str(part) for part in oid)


def ours(root):
    """Our modules in a source tree."""
    mibs = os.path.join(os.path.abspath(root), 'mibs')
    standard = os.path.join(mibs, 'standard')
    return Modules([mibs, standard], [os.path.join(mibs, 'base'), standard, mibs])
