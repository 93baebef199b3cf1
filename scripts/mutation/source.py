# SPDX-License-Identifier: Apache-2.0
"""Splits C++ into tokens and finds statements, conditions and the functions they are in.

No parser: it knows what clang-format leaves, and a place that it misjudges gives a mutant that does not compile."""
import re
from typing import NamedTuple

TOKEN = re.compile(r"""
      (?P<comment>//[^\n]*|/\*.*?\*/)
    | (?P<directive>^[ \t]*\#(?:\\\n|[^\n])*)
    | (?P<raw>(?:u8|u|U|L)?R"(?P<mark>[^()\\\s]*)\(.*?\)(?P=mark)")
    | (?P<text>(?:u8|u|U|L)?"(?:\\.|[^"\\\n])*")
    | (?P<char>(?:u8|u|U|L)?'(?:\\.|[^'\\\n])+')
    | (?P<number>\b\d[\w.']*)
    | (?P<name>[A-Za-z_]\w*)
    | (?P<operator><<=|>>=|->|\+\+|--|<<|>>|<=|>=|==|!=|&&|\|\||::|[-+*/%&|^]=|[^\s\w])
""", re.VERBOSE | re.DOTALL | re.MULTILINE)

TYPES = {"namespace", "class", "struct", "union", "extern"}
# What may stand between the parameters of a function, or a word of the language, and the body.
BEFORE_BODY = {")", "]", "{", "}", ";", ":", "else", "do", "try", "const", "override", "final", "noexcept", "mutable"}


class Token(NamedTuple):
    """A piece of source; `kind` is the name of its group in TOKEN."""
    kind: str
    text: str
    start: int
    end: int


class Statement(NamedTuple):
    """Indices of the first token and of the semicolon."""
    first: int
    last: int


class Frame:
    """An open bracket: `kind` is scope (members, declarations), body (statements), list or paren."""

    def __init__(self, kind, function, opened, keyword=""):
        self.kind = kind
        self.function = function
        self.opened = opened
        self.keyword = keyword
        self.begin = opened + 1


def tokens_of(source):
    """The tokens of the source without comments and directives."""
    found = (Token(match.lastgroup if match.lastgroup != "mark" else "raw", match.group(), match.start(), match.end())
             for match in TOKEN.finditer(source))
    return [token for token in found if token.kind not in ("comment", "directive")]


class Outline:
    """`statements` and `conditions` (pairs of indices) of a source, and the name of the `function` of each token."""

    def __init__(self, source):
        self.tokens = tokens_of(source)
        self.statements = []
        self.conditions = []
        self.function = []
        self._frames = [Frame("scope", "", -1)]
        for index, token in enumerate(self.tokens):
            self.function.append(self._frames[-1].function)
            self._step(index, token.text if token.kind in ("operator", "name") else "")

    def _step(self, index, text):
        frame = self._frames[-1]
        if text == "{":
            self._frames.append(self._block(index))
        elif text in ("(", "["):
            self._frames.append(Frame("paren", frame.function, index, self._text(index - 1)))
        elif text in ("}", ")", "]") and len(self._frames) > 1:
            self._close(index)
        elif text == ";":
            if frame.kind == "body":
                self.statements.append(Statement(frame.begin, index))
            frame.begin = index + 1
        elif frame.kind == "body" and self._ends_label(index, text):
            frame.begin = index + 1

    def _text(self, index):
        return self.tokens[index].text if 0 <= index < len(self.tokens) else ""

    def _ends_label(self, index, text):
        if text in ("else", "do", "try"):
            return True
        head = self._text(self._frames[-1].begin)
        return text == ":" and (head == "case" or (head == "default" and index == self._frames[-1].begin + 1))

    def _block(self, index):
        frame = self._frames[-1]
        head = [token.text for token in self.tokens[frame.begin:index]]
        before = self._text(index - 1)
        if frame.kind in ("scope", "body") and "enum" in head:
            return Frame("list", frame.function, index)
        if frame.kind in ("scope", "body") and TYPES.intersection(head) and "(" not in head:
            return Frame("scope", frame.function, index)
        if frame.kind == "scope":
            is_body = "(" in head and (before in BEFORE_BODY or "->" in head) and before not in ("]", ":")
            return Frame("body", self._name(head), index) if is_body else Frame("list", frame.function, index)
        # A list follows a comma, an equals sign or a type; within brackets only a lambda has a body.
        allowed = BEFORE_BODY if frame.kind == "body" else {")", "]", "mutable"}
        is_body = before in allowed and not (before == "]" and self._text(index - 2).isdigit())
        return Frame("body" if is_body else "list", frame.function, index)

    @staticmethod
    def _name(head):
        """The name before the parameters: what follows the last "::"."""
        return head[head.index("(") - 1] if head.index("(") > 0 else ""

    def _close(self, index):
        closed = self._frames.pop()
        frame = self._frames[-1]
        if closed.kind == "paren" and closed.keyword in ("if", "while"):
            self.conditions.append((closed.opened, index))
        if closed.kind == "paren" and closed.keyword in ("if", "while", "for", "switch"):
            frame.begin = index + 1
        # Behind a lambda or a list the statement goes on.
        followed = self._text(index + 1) in (";", ",", ")", "}", "(", ".", "->", "[", "]", ":", "{")
        if closed.kind in ("body", "scope") and (frame.kind != "paren") and not followed:
            frame.begin = index + 1
        elif closed.kind == "body" and frame.kind in ("scope", "body") and self._is_whole(frame, closed):
            frame.begin = index + 1

    def _is_whole(self, frame, closed):
        """Whether the block that was closed is a statement or function of its own, not a lambda within one."""
        return self._text(closed.opened - 1) != "]" and "=" not in [
            token.text for token in self.tokens[frame.begin:closed.opened]]
