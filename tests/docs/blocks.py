# SPDX-License-Identifier: BSD-2-Clause
"""The code blocks of a document, and the comparison of what they show with what came.

A block that begins with ```sh holds commands, one with ```console commands after "$ " and what each
prints. A comment on the line before the block may say more, separated by ";":

  <!-- not run: REASON -->        a test cannot run it; the reason is printed
  <!-- file: PATH -->             the block is the contents of this file: it is written there
  <!-- checked by: COMMAND -->    this command, with the name of a file with the block in the place of
                                  FILE, finds no fault
  <!-- printed by: COMMAND -->    the lines of the block are among what this command prints, in order
  <!-- printed in: NAME -->       the same for what the terminal of this name has shown so far
  <!-- commands in the table -->  a table follows, whose first column holds commands: they are typed
  <!-- terminal: NAME -->         it is typed in another terminal
  <!-- stays -->                  its last command keeps running in that terminal
  <!-- fails -->                  its last command ends with another status than 0
  <!-- from FILE -->              it is part of this file, which check-snippets tests

Comparison: runs of blanks count as one blank. Times of day, dates, TimeTicks, durations (a number before
ms, s, milliseconds or seconds) and process ids are not compared, other numbers are. "..." stands for any
text in a line, a line of its own "..." for any number of lines.
"""
import dataclasses
import re

DIRECTIVES = ("not run", "not compiled", "file", "checked by", "printed by", "printed in",
              "commands in the table", "terminal", "stays", "fails", "from")
COMMAND_LANGUAGES = ("sh", "console")
MASKS = [
    (r"Timeticks: \(\d+\) (\d+ days?, )?[\d:.]+", "<ticks>"),
    (r"\b\d{4}-\d\d?-\d\d?([ T,]\d\d?:\d\d?:\d\d?(\.\d+)?(Z|,?[+-]\d\d?:\d\d?)?)?", "<date>"),
    (r"\b(\d+:)?\d+:\d\d?:\d\d?(\.\d+)?\b", "<time>"),
    (r"\b\d+(\.\d+)? (ms|s|milliseconds|seconds)\b", "<duration>"),
    (r"\b(process|pid) \d+", r"\1 <process>"),
]


@dataclasses.dataclass
class Block:
    line: int
    language: str
    text: str
    directives: dict


@dataclasses.dataclass
class Command:
    line: int
    text: str
    expected: list


def directives_of(comment):
    """What a comment before a block says."""
    found = {}
    whole = comment.startswith(("not run", "not compiled", "checked by", "printed by"))
    for part in [comment] if whole else comment.split(";"):
        part = part.strip()
        name = next((d for d in DIRECTIVES if re.match(d + r"\b", part)), None)
        if name is None:
            return {"unknown": comment}
        found[name] = part[len(name):].lstrip(":").strip()
    return found


def blocks_of(text):
    """The blocks of a document, in order."""
    blocks, lines = [], text.splitlines()
    directives, at = {}, 0
    while at < len(lines):
        line = lines[at]
        fence = re.match(r"( *)```(\S*)\s*$", line)
        if fence:
            indent, start = len(fence[1]), at
            at += 1
            content = []
            while at < len(lines) and lines[at].strip() != "```":
                content.append(lines[at][indent:])
                at += 1
            blocks.append(Block(start + 1, fence[2], "\n".join(content) + "\n", directives))
            directives = {}
        elif "commands in the table" in directives and line.startswith("|"):
            start = at
            while at < len(lines) and lines[at].startswith("|"):
                at += 1
            cells = [re.match(r"\| `([^`]*)` \|", row) for row in lines[start + 2:at]]
            text = "".join(cell[1].replace("\\|", "|") + "\n" for cell in cells if cell)
            blocks.append(Block(start + 2, "sh", text, {}))
            directives = {}
            continue
        else:
            comment = re.match(r" *<!-- (.*) -->$", line)
            directives = directives_of(comment[1]) if comment else {}
        at += 1
    return blocks


def open_ended(text):
    """Whether a command goes on in the next line."""
    if text.endswith("\\"):
        return True
    here = re.findall(r"<<-?\s*['\"]?(\w+)", text)
    if here:
        return text.splitlines()[-1].strip() != here[-1]
    # Quotes that are still open. A "#" after a blank begins a comment.
    quote, at = "", 0
    while at < len(text):
        letter = text[at]
        if quote:
            quote = "" if letter == quote else quote
        elif letter in "'\"":
            quote = letter
        elif letter == "\\":
            at += 1
        elif letter == "#" and (at == 0 or text[at - 1] in " \n"):
            newline = text.find("\n", at)
            at = len(text) if newline < 0 else newline
        at += 1
    return quote != ""


def commands_of(block):
    """The commands of a block, with what is shown below each of a console."""
    commands = []
    unfinished = False
    for number, line in enumerate(block.text.splitlines(), block.line + 1):
        if unfinished:
            commands[-1].text += "\n" + line
        elif block.language == "console" and line.startswith("$ "):
            commands.append(Command(number, line[2:], []))
        elif block.language == "console":
            if not commands:
                raise ValueError(f"{number}: a console block begins with a command after \"$ \"")
            commands[-1].expected.append(line)
            continue
        elif not line.strip() or line.lstrip().startswith("#"):
            continue
        else:
            commands.append(Command(number, line, []))
        unfinished = open_ended(commands[-1].text)
    return commands


def masked(line):
    for pattern, replacement in MASKS:
        line = re.sub(pattern, replacement, line)
    return line


def line_matches(expected, actual):
    """Whether a line is what the document shows; "..." is any text, also that of a time."""
    def same(shown, came):
        parts = " ".join(shown.split()).split("...")
        return re.fullmatch(".*".join(map(re.escape, parts)), " ".join(came.split())) is not None

    return same(masked(expected), masked(actual)) or same(expected, actual)


def matches(expected, actual):
    """Whether the lines are those of the document; a line "..." is any number of lines."""
    if not expected:
        return not actual
    if expected[0].strip() == "...":
        return any(matches(expected[1:], actual[at:]) for at in range(len(actual) + 1))
    return bool(actual) and line_matches(expected[0], actual[0]) and matches(expected[1:], actual[1:])


def contains(expected, actual):
    """Whether the lines of the document are among these lines, in their order."""
    rest = iter(actual)
    return all(any(line_matches(line, other) for other in rest)
               for line in expected if line.strip() not in ("", "..."))
