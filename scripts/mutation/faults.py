# SPDX-License-Identifier: Apache-2.0
"""The faults that can be planted in a source, and how some are drawn."""
import fnmatch
import re
from typing import NamedTuple

from . import source

COMPARISONS = {"==": ["!="], "!=": ["=="], "<": ["<=", ">="], "<=": ["<", ">"], ">": [">=", "<="], ">=": [">", "<"]}
LOGIC = {"&&": "||", "||": "&&"}
ASSIGNMENTS = {"=", "+=", "-=", "*=", "/=", "%=", "|=", "&=", "^=", "<<=", ">>="}
# Words a statement that can be deleted may begin with, and those that it may not.
PREFIXES = {"emit", "delete", "++", "--", "*", "(", "::"}
NO_EXPRESSION = {"return", "using", "typedef", "static", "const", "constexpr", "case", "default", "goto", "throw",
                 "static_assert", "friend", "Q_UNUSED", "struct", "class", "enum", "union"}
CHARACTER = re.compile(r"\\(?:x[0-9a-fA-F]+|u[0-9a-fA-F]{4}|[0-7]{1,3}|.)|.", re.DOTALL)
INTEGER = re.compile(r"(0[xX][0-9a-fA-F]+|\d+)([uUlL]*)$")


class Fault(NamedTuple):
    """Replaces source[start:end] of the file (below the tree) by `text`."""
    file: str
    kind: str
    start: int
    end: int
    text: str

    def apply(self, content):
        """The content with the fault in it."""
        return content[:self.start] + self.text + content[self.end:]

    def line(self, content):
        """The number of the line it changes."""
        return content.count("\n", 0, self.start) + 1

    def lines(self, content):
        """The lines it changes, before and after."""
        begin = content.rfind("\n", 0, self.start) + 1
        end = content.find("\n", self.end)
        changed = self.apply(content)
        shift = len(changed) - len(content)
        return content[begin:end].strip(), changed[begin:end + shift].strip()


def _changed_number(text, rng):
    match = INTEGER.match(text.replace("'", ""))
    if not match:
        return f"({text} * 2)" if text[0] != "0" or len(text) > 3 else f"({text} + 1)"
    number = int(match.group(1), 0 if match.group(1)[:2] in ("0x", "0X") else 8 if text[0] == "0" else 10)
    changed = number + (1 if number == 0 else rng.choice([1, -1]))
    return f"{changed}{match.group(2)}"


def _changed_text(text, rng):
    """The literal with one letter more, at any place that leaves its escapes whole."""
    begin = text.index('"') + 1
    end = len(text) - 1
    if "R" in text[:begin]:
        begin = text.index("(") + 1
        end = text.rindex(")")
    pieces = CHARACTER.findall(text[begin:end])
    pieces.insert(rng.randrange(len(pieces) + 1), "x")
    return text[:begin] + "".join(pieces) + text[end:]


def _changed_character(text):
    letter = text[-2]
    if len(text) == 3 and letter.isalnum() and letter not in "zZ9":
        return f"'{chr(ord(letter) + 1)}'"
    return "'x'"


class Points:
    """Every fault that can be planted in one file."""

    def __init__(self, file, content, excluded, rng):
        self.file = file
        self.content = content
        self.rng = rng
        self.outline = source.Outline(content)
        self.tokens = self.outline.tokens
        self.excluded = excluded
        self.faults = []
        for index, token in enumerate(self.tokens):
            self._token(index, token)
        for opened, closed in self.outline.conditions:
            self._condition(opened, closed)
        for statement in self.outline.statements:
            self._statement(statement)

    def _add(self, kind, index, start, end, text):
        place = f"{self.file}:{self.outline.function[index]}"
        if not any(fnmatch.fnmatchcase(place, pattern) for pattern in self.excluded):
            self.faults.append(Fault(self.file, kind, start, end, text))

    def _token(self, index, token):
        before = self.tokens[index - 1].text if index else ""
        # Templates have no blanks around their brackets, and references none before their name.
        apart = self.content[token.start - 1:token.start].isspace() and self.content[token.end:token.end + 1].isspace()
        change = None
        if token.text in COMPARISONS and apart and before not in ("operator", "template"):
            change = "comparison", self.rng.choice(COMPARISONS[token.text])
        elif token.text in LOGIC and apart:
            change = "logic", LOGIC[token.text]
        elif token.kind == "number":
            change = "constant", _changed_number(token.text, self.rng)
        elif token.text in ("true", "false"):
            change = "constant", "false" if token.text == "true" else "true"
        elif token.kind == "char":
            change = "constant", _changed_character(token.text)
        elif token.kind in ("text", "raw") and before != "extern":
            change = "text", _changed_text(token.text, self.rng)
        if change:
            self._add(change[0], index, token.start, token.end, change[1])

    def _condition(self, opened, closed):
        start, end = self.tokens[opened].end, self.tokens[closed].start
        condition = self.content[start:end]
        # "if (type name = ...)" and "if (init; condition)" cannot be put in brackets.
        texts = [token.text for token in self.tokens[opened + 1:closed]]
        if ";" in texts:
            start = self.tokens[opened + 1 + len(texts) - texts[::-1].index(";") - 1].end
            condition = self.content[start:end]
        elif "=" in texts:
            return
        self._add("condition", opened, start, end, f"!({condition.strip()})")

    def _statement(self, statement):
        words = self.tokens[statement.first:statement.last + 1]
        if len(words) < 2:
            return
        if words[0].text == "return":
            self._return(statement, words)
        elif words[0].text in ("break", "continue") or self._is_expression(words):
            self._add("deleted", statement.first, words[0].start, words[-1].end, ";")

    def _is_expression(self, words):
        """Whether the words are a call, an assignment or a stream: two names in a row declare something."""
        if words[0].text in NO_EXPRESSION:
            return False
        if words[0].text in PREFIXES:
            return True
        depth = 0
        for previous, word in zip([None] + words, words):
            if word.text in ("[", "]"):
                depth += 1 if word.text == "[" else -1
            elif depth == 0 and (word.text in ("(", "<<", ">>", "++", "--") or word.text in ASSIGNMENTS):
                return previous is not None and not (word.text == "(" and previous.kind != "name")
            elif depth == 0 and word.kind == "name" and previous is not None and previous.text not in (
                    "::", ".", "->"):
                return False
            elif depth == 0 and word.kind != "name" and word.text not in ("::", ".", "->"):
                return False
        return False

    def _return(self, statement, words):
        start, end = words[1].start, words[-2].end
        value = self.content[start:end]
        if value in ("true", "false"):
            changed = "false" if value == "true" else "true"
        elif value in ("{}", "nullptr", "0", "-1", "std::nullopt", "QString()") or words[1].kind == "number":
            return
        elif {"&&", "||", "==", "!=", "<", ">", "<=", ">=", "!"}.intersection(word.text for word in words):
            changed = f"!({value})"
        else:
            changed = "{}"
        self._add("return", statement.first, start, end, changed)


def draw(files, excluded, rng):
    """Yields the faults of the files (a mapping from name to content) in random order, each kind as often as others."""
    kinds = {}
    for name in sorted(files):
        for fault in Points(name, files[name], excluded, rng).faults:
            kinds.setdefault(fault.kind, []).append(fault)
    for faults in kinds.values():
        rng.shuffle(faults)
    while kinds:
        kind = rng.choice(sorted(kinds))
        yield kinds[kind].pop()
        if not kinds[kind]:
            del kinds[kind]
