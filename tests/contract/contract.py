# SPDX-License-Identifier: BSD-2-Clause
"""The file that holds the binary contract: one block a class, one line a base, slot or field."""

import dataclasses

from layouts import Base, Field

HEAD = """\
# The binary contract: what compiled programs and board modules rely on.
#
# One block for each class of the public headers. Of two numbers, the first is that of 64-bit programs
# and the second that of 32-bit programs. Offsets and sizes are in bytes.
#
#   size S64 S32
#   base NAME O64 O32          a base class, in the order of declaration, with its offset
#   base virtual NAME          a virtual base; its offset differs from class to class
#   slot N RESULT OPERATION    a virtual operation that the class declares, with its slot in the
#                              class's own table; a destructor takes two slots
#   field NAME O64+S64 O32+S32 a data member, with its offset and size; private ones are listed
#                              because modules contain compiled inline operations and derived classes
#
# A class template is represented by one instance. scripts/update-abi writes this file; CONTRIBUTING.md
# says what may change.
"""


@dataclasses.dataclass
class Block:
    """One class as the file has it. Sizes and offsets are a pair: 64 bits, 32 bits."""

    name: str
    size: tuple = (0, 0)
    bases: list = dataclasses.field(default_factory=list)
    operations: dict = dataclasses.field(default_factory=dict)
    fields: list = dataclasses.field(default_factory=list)


class FormatError(Exception):
    """A line of the file cannot be read."""


def _pair(words):
    first, second = words
    return int(first), int(second)


def _enter(block, kind, words):
    if kind == "size":
        block.size = _pair(words)
    elif kind == "base" and words[0] == "virtual":
        block.bases.append(Base(" ".join(words[1:]), True, (0, 0)))
    elif kind == "base":
        block.bases.append(Base(" ".join(words[:-2]), False, _pair(words[-2:])))
    elif kind == "slot":
        block.operations[int(words[0].split("-")[0])] = " ".join(words[1:])
    elif kind == "field":
        name, wide, narrow = words
        offsets, sizes = zip(_pair(wide.split("+")), _pair(narrow.split("+")))
        block.fields.append(Field(name, offsets, sizes))
    else:
        raise ValueError(kind)


def read(path):
    """The blocks of the file by class name."""
    blocks = {}
    block = None
    with open(path, encoding="utf-8") as file:
        for number, line in enumerate(file, 1):
            words = line.split()
            if not words or words[0].startswith("#"):
                continue
            if words[0] == "class" and words[1:]:
                block = blocks.setdefault(" ".join(words[1:]), Block(" ".join(words[1:])))
                continue
            try:
                _enter(block, words[0], words[1:])
            except (ValueError, AttributeError, IndexError) as error:
                raise FormatError(f"{path}:{number}: '{line.strip()}' is no line of the contract; "
                                  "write it anew with scripts/update-abi") from error
    return blocks


def narrowed(block, column):
    """The block's layout for one width of programs: column 0 for 64 bits, 1 for 32."""
    bases = [Base(base.name, base.virtual, base.offset[column]) for base in block.bases]
    fields = [Field(field.name, field.offset[column], field.size[column]) for field in block.fields]
    return Block(block.name, block.size[column], bases, block.operations, fields)


def _lines(wide, narrow):
    yield f"class {wide.name}"
    yield f"    size {wide.size} {narrow.size}"
    for base, other in zip(wide.bases, narrow.bases, strict=True):
        yield (f"    base virtual {base.name}" if base.virtual
               else f"    base {base.name} {base.offset} {other.offset}")
    for slot, operation in sorted(wide.operations.items()):
        slots = f"{slot}-{slot + 1}" if operation.startswith("~") else f"{slot}"
        yield f"    slot {slots} {operation}"
    for field, other in zip(wide.fields, narrow.fields, strict=True):
        yield (f"    field {field.name} {field.offset}+{field.size} "
               f"{other.offset}+{other.size}")


def write(path, chapters):
    """Writes the file: `chapters` are pairs of a header's name and its classes' layouts, each a
    pair of the 64-bit and the 32-bit one."""
    with open(path, "w", encoding="utf-8") as file:
        file.write(HEAD)
        for header, layouts in chapters:
            file.write(f"\n# {header}\n")
            for wide, narrow in layouts:
                file.write("\n".join(_lines(wide, narrow)) + "\n")
