# SPDX-License-Identifier: BSD-2-Clause
"""Reads the layouts of classes from the debug information of an object file or a library."""

import dataclasses
import os
import re
import subprocess

DIE = re.compile(r" <(\d+)><([0-9a-f]+)>: Abbrev Number: \d+ \(DW_TAG_(\w+)\)")
ATTRIBUTE = re.compile(r" +<[0-9a-f]+> +DW_AT_(\w+) *: (.*)")
STRING = re.compile(r"\((?:indirect line string|indirect string|indexed string|line string)[^)]*\): ")
FILE = re.compile(r"  (\d+)\t(\d+)[ \t]+(?:0x[0-9a-f]+\t)?(.*)")
SLOT = re.compile(r"\(DW_OP_constu: (\d+)\)|\(DW_OP_lit(\d+)\)")

CLASSES = {"class_type", "structure_type"}
SCOPES = CLASSES | {"namespace", "union_type"}
# Nothing below these describes a layout.
CLOSED = {"subprogram", "lexical_block", "inlined_subroutine", "subroutine_type", "call_site"}


class UnreadableError(Exception):
    """The debug information cannot be read."""


@dataclasses.dataclass
class Base:
    name: str
    virtual: bool
    offset: int  # of a virtual base: 0, for it differs from class to class


@dataclasses.dataclass
class Field:
    name: str
    offset: int
    size: int


@dataclasses.dataclass
class Layout:
    """One class. Operations are those that the class itself declares, by their first slot in its
    own table; a destructor takes two slots."""

    name: str
    size: int
    bases: list = dataclasses.field(default_factory=list)
    operations: dict = dataclasses.field(default_factory=dict)
    fields: list = dataclasses.field(default_factory=list)


class _Die:
    def __init__(self, tag, parent):
        self.tag = tag
        self.parent = parent
        self.attributes = {}
        self.children = []

    def get(self, name):
        return self.attributes.get(name)

    def name(self):
        text = self.attributes.get("name", "")
        return _plainName(STRING.sub("", text))

    def scope(self):
        parts = []
        die = self.parent
        while die is not None and die.tag in SCOPES:
            parts.insert(0, die.name())
            die = die.parent
        return "::".join(part for part in parts if part)

    def qualifiedName(self):
        scope = self.scope()
        return scope + "::" + self.name() if scope else self.name()


def _number(text):
    return int(text.split()[-1], 0)


def _plainName(name):
    """Compilers spell the same integer types in different ways."""
    for spelled, plain in (("long long unsigned int", "unsigned long long"),
                           ("long unsigned int", "unsigned long"),
                           ("short unsigned int", "unsigned short"),
                           ("long long int", "long long"), ("long int", "long"),
                           ("short int", "short")):
        name = name.replace(spelled, plain)
    return name


def _run(*command):
    result = subprocess.run(command, capture_output=True, text=True, check=False)
    if result.returncode != 0:
        raise UnreadableError(f"{' '.join(command)} failed: {result.stderr.strip()}")
    return result.stdout


class DebugInformation:
    """The debug information of one file, as readelf prints it."""

    def __init__(self, path):
        if not os.path.exists(path):
            raise UnreadableError(f"{path} does not exist; build it first")
        self._path = path
        self._dies = {}
        self._tops = []
        self._read(_run("readelf", "--debug-dump=info", path))
        if not self._tops:
            raise UnreadableError(f"{path} has no debug information; build it with -g")
        self._classes = {}
        for die in self._dies.values():
            if die.tag in CLASSES and "byte_size" in die.attributes and die.name():
                self._classes.setdefault(die.qualifiedName(), []).append(die)

    def _read(self, text):
        stack = []
        closed = None
        current = None
        for line in text.splitlines():
            if match := DIE.match(line):
                depth = int(match[1])
                if closed is not None and depth > closed:
                    current = None
                    continue
                closed = None
                del stack[depth:]
                current = _Die(match[3], stack[-1] if stack else None)
                self._dies[int(match[2], 16)] = current
                (stack[-1].children if stack else self._tops).append(current)
                stack.append(current)
                if match[3] in CLOSED:
                    closed = depth
            elif current is not None and (match := ATTRIBUTE.match(line)):
                current.attributes[match[1]] = match[2].strip()

    def _reference(self, die, attribute="type"):
        value = die.get(attribute)
        return self._dies.get(int(value.strip("<>"), 16)) if value else None

    def addressSize(self):
        """In bytes, of the program that the file belongs to."""
        header = _run("readelf", "--file-header", self._path)
        return 8 if re.search(r"Class: +ELF64", header) else 4

    def definitions(self, name):
        """Every definition of a class that the file has; they are one when the file is sound."""
        return [self._layout(die) for die in self._classes.get(name, [])]

    def publicClasses(self, files):
        """The classes that the given file numbers declare, as far as anyone may name them, in the
        order of their declarations: those with a name of their own, and the templates whose
        instances have virtual operations. Two dictionaries from name to (file number, line)."""
        classes, templates = {}, {}
        for name, dies in self._classes.items():
            place = self._place(dies[0])
            if place[0] not in files or not self._isReachable(dies[0]):
                continue
            if "<" not in name:
                classes[name] = place
            elif name.endswith(">") and "containing_type" in dies[0].attributes:
                templates.setdefault(name.split("<")[0], place)
        return classes, templates

    def fieldTypes(self, name):
        """The names of the classes of a class's fields."""
        dies = self._classes.get(name, [])
        return [self._stripped(self._reference(child)).qualifiedName()
                for die in dies[:1] for child in die.children if child.tag == "member"]

    def fileNames(self):
        """The path of each file number. For files of one compilation."""
        text = _run("readelf", "--debug-dump=rawline", self._path)
        directories, files, table = {}, {}, None
        for line in text.splitlines():
            if "Directory Table" in line:
                table = directories
            elif "File Name Table" in line:
                table = files
            elif table is directories and (match := re.match(r"  (\d+)\t(.*)", line)):
                directories[match[1]] = STRING.sub("", match[2])
            elif table is files and (match := FILE.match(line)):
                path = os.path.join(directories[match[2]], STRING.sub("", match[3]))
                files[match[1]] = os.path.normpath(path)
        return files

    def _isReachable(self, die):
        while die is not None and die.tag in SCOPES:
            parent = die.parent
            if parent is not None and parent.tag in CLASSES:
                default = "3" if parent.tag == "class_type" else "1"
                if die.attributes.get("accessibility", default).startswith("3"):
                    return False
            if not die.name():
                return False
            die = parent
        return True

    @staticmethod
    def _place(die):
        return (die.attributes.get("decl_file", "").split(" ")[0],
                _number(die.attributes.get("decl_line", "0")))

    def _layout(self, die):
        layout = Layout(die.qualifiedName(), _number(die.get("byte_size")))
        declared = []
        for child in die.children:
            if child.tag == "inheritance":
                virtual = child.attributes.get("virtuality", "0").startswith("1")
                offset = 0 if virtual else _number(child.get("data_member_location"))
                base = self._stripped(self._reference(child))
                layout.bases.append(Base(base.qualifiedName(), virtual, offset))
            elif child.tag == "member" and self._isField(child):
                layout.fields.append(self._field(layout.name, child))
            elif child.tag == "subprogram" and self._isOperation(child):
                declared.append(child)
        self._enterOperations(die, layout, declared)
        return layout

    @staticmethod
    def _isField(die):
        return not {"artificial", "external", "declaration"} & die.attributes.keys()

    @staticmethod
    def _isOperation(die):
        virtuality = die.attributes.get("virtuality", "0")
        return virtuality[0] in "12" and "artificial" not in die.attributes

    def _field(self, owner, die):
        if "bit_size" in die.attributes:
            raise UnreadableError(f"{owner}::{die.name()} is a bit field, whose place is not read")
        return Field(die.name(), _number(die.attributes.get("data_member_location", "0")),
                     self._size(self._reference(die)))

    def _stripped(self, die):
        while die is not None and die.tag in {"typedef", "const_type", "volatile_type",
                                              "atomic_type"}:
            die = self._reference(die)
        return die

    def _size(self, die):
        die = self._stripped(die)
        if die.tag == "array_type":
            count = 1
            for bound in die.children:
                if bound.tag == "subrange_type":
                    count *= (_number(bound.get("count")) if bound.get("count")
                              else _number(bound.get("upper_bound")) + 1)
            return count * self._size(self._reference(die))
        if die.tag in CLASSES:
            die = self._defined(die)
        if "byte_size" in die.attributes:
            return _number(die.get("byte_size"))
        if die.tag == "ptr_to_member_type":
            isFunction = self._reference(die).tag == "subroutine_type"
            return self.addressSize() * (2 if isFunction else 1)
        if die.tag.endswith("reference_type") or die.tag == "pointer_type":
            return self.addressSize()
        raise UnreadableError(f"the size of a {die.tag} is not read")

    def _spelled(self, die):
        """A type in C++."""
        if die is None:
            return "void"
        endings = {"pointer_type": "*", "reference_type": "&", "rvalue_reference_type": "&&",
                   "const_type": " const", "volatile_type": " volatile"}
        if die.tag in endings:
            return self._spelled(self._reference(die)) + endings[die.tag]
        return die.qualifiedName() or die.tag

    def _primaryBase(self, die):
        """The base whose table the class's own table begins with."""
        for child in die.children:
            if child.tag == "inheritance" and "virtuality" not in child.attributes:
                base = self._defined(self._stripped(self._reference(child)))
                if "containing_type" in base.attributes:
                    return self._defined(base)
        return None

    def _defined(self, die):
        if "byte_size" in die.attributes:
            return die
        definitions = self._classes.get(die.qualifiedName())
        if not definitions:
            raise UnreadableError(f"{self._path} has no definition of {die.qualifiedName()}")
        return definitions[0]

    def _tableOf(self, die):
        """The number of slots of a class's table and the slot of its destructor, or None."""
        base = self._primaryBase(die)
        size, destructor = self._tableOf(base) if base is not None else (0, None)
        for child in die.children:
            if child.tag != "subprogram" or not self._isOperation(child):
                continue
            if child.name().startswith("~"):
                if destructor is None:
                    destructor, size = size, size + 2
            else:
                size = max(size, self._slot(child) + 1)
        return size, destructor

    def _slot(self, operation):
        match = SLOT.search(operation.attributes.get("vtable_elem_location", ""))
        if match is None:
            raise UnreadableError(f"{self._path} does not tell the slot of "
                                  f"{operation.parent.qualifiedName()}::{operation.name()}")
        return int(match[1] or match[2])

    def _enterOperations(self, die, layout, declared):
        # Debug information leaves a destructor's slot out: it is the base's, or comes behind the
        # operations that are declared before it.
        for operation in declared:
            if operation.name().startswith("~"):
                layout.operations[self._tableOf(die)[1]] = operation.name() + "()"
                continue
            signature = STRING.sub("", operation.attributes.get("linkage_name", ""))
            result = self._spelled(self._reference(operation))
            layout.operations[self._slot(operation)] = (result, signature)


def spellOut(layouts):
    """Turns the operations' linkage names into C++, in place."""
    pending = [(layout, slot) for layout in layouts for slot, operation in layout.operations.items()
               if isinstance(operation, tuple)]
    if not pending:
        return
    mangled = "\n".join(layout.operations[slot][1] for layout, slot in pending)
    result = subprocess.run(["c++filt"], input=mangled, capture_output=True, text=True, check=True)
    for (layout, slot), text in zip(pending, result.stdout.splitlines(), strict=True):
        returned = layout.operations[slot][0]
        layout.operations[slot] = f"{returned} {text.removeprefix(layout.name + '::')}"
