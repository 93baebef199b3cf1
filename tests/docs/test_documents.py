# SPDX-License-Identifier: Apache-2.0
"""The documents for administrators: both languages against each other, and the log lines against the sources."""

import glob
import os
import re
import unittest

TREE = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))
LEVELS = {"debug": "Debug", "info": "Info", "warning": "Warning", "critical": "Critical"}
LITERAL = re.compile(r'"((?:[^"\\\n]|\\.)*)"')
# What the documents write for something that differs from line to line.
PLACEHOLDER = re.compile(r"…|\bSTATUS\b|\bHOST:PORT\b|\bNAME TEXT\b|\bN s?\b|\"|[:,] |com\.vantor\.tarn")
# A constant text of a source, or a function that returns one.
NAMED = re.compile(r'QString (\w+)(?:\(\))?\s*(?:=|\{\s*return)[^;"]*"([^"]*)"[^;]*;')
# Lines that one function writes and another one words.
WORDED_ELSEWHERE = ("`no config.json", "`GET https://… not sent")


def read(path):
    with open(os.path.join(TREE, path), encoding="utf-8") as file:
        return file.read()


def tables(path):
    """The tables of a document, each a list of rows of cells without its heading."""
    blocks = re.findall(r"(?:^\|.*\n)+", read(path), re.MULTILINE)
    return [[[cell.strip() for cell in row.strip("|").split(" | ")] for row in block.splitlines()[2:]]
            for block in blocks]


def codes(text):
    return sorted(re.findall(r"`[^`]*`", text))


def commands(path):
    """What the document has readers run or write, without remarks."""
    return [line.split("  #")[0].rstrip() for line in re.findall(r"^    (?!TIME |时间 )(.*)", read(path), re.MULTILINE)]


def said(row):
    """What a row must say in every language: all code, and numbers and levels that are a cell by themselves."""
    return [codes(cell) or re.findall(r"^-?\d[\d,]*$|^(?:debug|info|warning|critical)\b|^-?\d+ \(\w+\)$", cell)
            for cell in row]


def log_calls():
    """(level, its texts joined) of every log call, and all texts of the sources."""
    calls, everything = [], []
    for path in glob.glob(f"{TREE}/src/**/*.cpp", recursive=True):
        source = re.sub(r"^\s*//.*$", "", read(path), flags=re.MULTILINE)
        everything += LITERAL.findall(source)
        named = NAMED.findall(source)
        for level, rest in re.findall(r'\bq(Debug|Info|Warning|Critical)\(\)((?:[^;"]|"(?:[^"\\]|\\.)*")*);', source):
            words = re.findall(r"\w+", rest)
            texts = LITERAL.findall(rest) + [text for name, text in named if name in words]
            calls.append((level, " ".join(" ".join(texts).split())))
    return calls, " ".join(" ".join(everything).split())


class Operations(unittest.TestCase):
    def test_both_languages_say_the_same(self):
        for name in ("operations", "rollout"):
            english, chinese = f"docs/{name}.md", f"docs/{name}.zh_CN.md"
            self.assertEqual([len(table) for table in tables(english)], [len(table) for table in tables(chinese)])
            for ours, theirs in zip(tables(english), tables(chinese)):
                for row, other in zip(ours, theirs):
                    with self.subTest(row=row[0]):
                        self.assertEqual(said(row), said(other))
            self.assertEqual(commands(english), commands(chinese))
            self.assertEqual(*[set(re.findall(r"`(/[a-z]+/[^`]*)`", read(path))) for path in (english, chinese)])

    def test_log_lines_are_those_of_the_sources(self):
        calls, everything = log_calls()
        rows = [row for table in tables("docs/operations.md") for row in table
                if len(row) == 3 and row[1].split(";")[0] in LEVELS]
        self.assertGreater(len(rows), 50)
        for row in rows:
            level = LEVELS[row[1].split(";")[0]]
            for line in codes(row[0]):
                pieces = [" ".join(piece.split()) for piece in PLACEHOLDER.split(line.strip("`"))]
                pieces = [piece for piece in pieces if not re.fullmatch(r"[\s:.,]*|GET( https)?|GET https://|PUT", piece)]
                texts = [text for called, text in calls if called == level]
                if line.startswith(WORDED_ELSEWHERE):
                    texts = [everything]
                with self.subTest(line=line):
                    self.assertTrue(any(all(piece in text for piece in pieces) for text in texts), pieces)
