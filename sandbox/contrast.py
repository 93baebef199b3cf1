# SPDX-License-Identifier: Apache-2.0
"""Measures how well the texts on the gallery's pictures stand out from what is behind them.

    contrast.py [-v] PICTURE...

A picture is cut along empty rows and columns until single blocks are left. A block filled with a colour of its own (a
button, a field) is cut further inside. The contrast of each block of text is measured as WCAG 2 defines it, between the
colour behind it and the cores of its strokes. Texts need 4.5:1, the panel's links and the drawn signs 3:1; what is
disabled is exempt. The exit status is 1 when something misses its bar, or a window shows fewer texts than it should.

Measure pictures at scale 2: at scale 1 thin strokes cover no whole pixel and look paler than they are.
"""

import argparse
import collections
import os
import sys

import numpy
from PIL import Image

TEXT, LINK, SIGN, EXEMPT = 4.5, 3.0, 3.0, 0.0
# The share of a block's inked pixels that are paler than its core. A cursor has fewer pixels than the rest.
CORE = 0.9
# Lengths at scale 1: a plate's edge, what is too small for text, the smallest plate, the gaps between blocks.
EDGE, TINY, PLATE, TALL = 4, 5, 20, 60
ROW_GAP, COLUMN_GAP = 2, 5

Block = collections.namedtuple("Block", "box background ink ratio")
Verdict = collections.namedtuple("Verdict", "window box what background ink ratio bar")

_TITLE_BAR = [("window icon", (8, 8, 38, 42), SIGN), ("close button", (-44, 8, -6, 42), SIGN)]
_PANEL = _TITLE_BAR + [("link", (150, -46, 300, -18), LINK), ("tick box", (8, -46, 25, -18), SIGN),
                       ("arrow", (260, -125, 290, -95), SIGN)]
_PASSWORD = _TITLE_BAR + [("sign in the field", (-76, 96, -15, 222), SIGN)]
_CONFIRM = [("disabled button", (14, 222, 196, 262), EXEMPT)]

# By window: how many texts it shows at least, and what on it is not plain text: (name, area, bar). Negative coordinates
# count from the right and the bottom.
WINDOWS = {
    "start-up": (3, _TITLE_BAR),
    "panel-plain": (17, _PANEL),
    "panel-login": (20, _PANEL),
    "panel-network": (24, _PANEL),
    "panel-scenes": (3, []),
    "notification": (3, []),
    "notice-several": (7, _TITLE_BAR),
    "notice-one": (6, _TITLE_BAR),
    "notice-none": (6, _TITLE_BAR),
    "notice-failed": (3, _TITLE_BAR),
    "integrity": (3, _TITLE_BAR),
    "password-empty": (5, _PASSWORD + _CONFIRM),
    "password-caps-lock": (5, _PASSWORD + _CONFIRM),
    "password-mismatch": (6, _PASSWORD + _CONFIRM),
    "password-filled": (6, _PASSWORD),
    "password-old-alert": (6, _PASSWORD),
    "password-new-alert": (6, _PASSWORD),
    "password-failed": (2, _TITLE_BAR),
    "release-empty": (4, _TITLE_BAR),
    "release-filled": (4, _TITLE_BAR),
    "release-refused": (1, _TITLE_BAR),
    "release-offline": (1, _TITLE_BAR),
    "release-running": (1, _TITLE_BAR + [("spinner", (66, 54, 98, 80), EXEMPT),
                                         ("disabled button", (100, 95, 280, 145), EXEMPT)]),
    "release-reboot": (3, _TITLE_BAR),
}


def luminance(colours):
    """WCAG's relative luminance of colours given as 0 to 255 a channel."""
    channels = numpy.asarray(colours) / 255
    linear = numpy.where(channels <= 0.03928, channels / 12.92, ((channels + 0.055) / 1.055) ** 2.4)
    return linear @ (0.2126, 0.7152, 0.0722)


def contrast(one, other):
    """WCAG's contrast ratio between colours."""
    one, other = luminance(one) + 0.05, luminance(other) + 0.05
    return numpy.maximum(one, other) / numpy.minimum(one, other)


def _dominant(pixels):
    colours, counts = numpy.unique(pixels @ (0x10000, 0x100, 1), return_counts=True)
    most = int(colours[counts.argmax()])
    return numpy.array((most >> 16, most >> 8 & 0xff, most & 0xff)), counts.max() / counts.sum()


def _runs(marked, gap):
    """Where marked is true, as (start, end). Gaps shorter than this are bridged."""
    found = []
    for at in numpy.flatnonzero(marked):
        if found and at - found[-1][1] < gap:
            found[-1][1] = at + 1
        else:
            found.append([at, at + 1])
    return found


class Picture:
    """A picture and the blocks on it."""

    def __init__(self, path):
        self.window, self.theme, scale = os.path.splitext(os.path.basename(path))[0].rsplit("-", 2)
        self.scale = float(scale)
        with Image.open(path) as image:
            self.pixels = numpy.asarray(image.convert("RGB")).astype(int)

    def blocks(self):
        """The blocks that stand out, each with its colours."""
        height, width, _ = self.pixels.shape
        return list(self._cut(self._inside((0, 0, width, height)), None))

    def _inside(self, box):
        edge = round(EDGE * self.scale)
        return box[0] + edge, box[1] + edge, box[2] - edge, box[3] - edge

    def _cut(self, box, background):
        left, top, right, bottom = box
        part = self.pixels[top:bottom, left:right]
        if min(part.shape[:2]) < TINY * self.scale:
            return
        if background is None:
            background, _ = _dominant(part)
        inked = (abs(part - background) > 2).any(axis=2)
        rows = _runs(inked.any(axis=1), ROW_GAP * self.scale)
        columns = _runs(inked.any(axis=0), COLUMN_GAP * self.scale)
        if not rows:
            return
        if len(rows) > 1 or rows[0] != [0, bottom - top]:
            for start, end in rows:
                yield from self._cut((left, top + start, right, top + end), background)
        elif len(columns) > 1 or columns[0] != [0, right - left]:
            for start, end in columns:
                yield from self._cut((left + start, top, left + end, bottom), background)
        else:
            yield from self._block(box, part, background)

    def _block(self, box, part, background):
        """A block that cannot be cut: a plate with things on it, a frame around things, or a thing."""
        colour, share = _dominant(part)
        height = part.shape[0] / self.scale
        if height > TALL or height > PLATE and share > 0.4 and (abs(colour - background) > 2).any():
            yield from self._cut(self._inside(box), colour)
            return
        if height > PLATE:
            # A plate of no single colour, such as a button of the desktop's style.
            left, top, right, bottom = self._inside(box)
            part = self.pixels[top:bottom, left:right]
            background, _ = _dominant(part)
        ratios = contrast(part.reshape(-1, 3), background)
        ink = ratios > 1.15
        if ink.any():
            core = numpy.quantile(ratios[ink], CORE, method="lower")
            colour = part.reshape(-1, 3)[(ratios == core).argmax()]
            yield Block(box, tuple(background), tuple(colour), float(core))

    def verdicts(self):
        """What is on the picture, each with its bar, and what is missing."""
        expected, areas = WINDOWS[self.window]
        height, width = (extent / self.scale for extent in self.pixels.shape[:2])
        found = []
        for block in self.blocks():
            x, y = ((block.box[at] + block.box[at + 2]) / 2 / self.scale for at in (0, 1))
            what, bar = "text", TEXT
            for name, (left, top, right, bottom), its_bar in areas:
                if left % width <= x <= (right % width or width) and top % height <= y <= (bottom % height or height):
                    what, bar = name, its_bar
            logical = tuple(round(at / self.scale) for at in block.box)
            found.append(Verdict(self.window, logical, what, block.background, block.ink, block.ratio, bar))
        texts = sum(verdict.what in ("text", "link") for verdict in found)
        if texts < expected:
            found.append(Verdict(self.window, (), f"{texts} of {expected} texts found", (), (), 0.0, TEXT))
        return found


def failures(paths):
    """What misses its bar on the pictures; windows that are not measured are left out."""
    pictures = [picture for picture in map(Picture, paths) if picture.window in WINDOWS]
    return [verdict for picture in pictures for verdict in picture.verdicts() if verdict.ratio < verdict.bar]


def _colour(channels):
    return "#" + "".join(f"{int(channel):02x}" for channel in channels) if channels else "-"


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("-v", "--verbose", action="store_true", help="every block, not only the worst of each kind")
    parser.add_argument("pictures", nargs="+")
    options = parser.parse_args()
    missed = False
    print(f"{'window':22}{'theme':7}{'what':20}{'number':>6}  {'lowest':>6}  {'bar':>4}  text on background, where")
    for path in options.pictures:
        picture = Picture(path)
        if picture.window not in WINDOWS:
            continue
        kinds = collections.defaultdict(list)
        for at, verdict in enumerate(picture.verdicts()):
            kinds[(verdict.what, at if options.verbose else 0)].append(verdict)
        for (what, _), verdicts in kinds.items():
            worst = min(verdicts, key=lambda verdict: verdict.ratio)
            miss = worst.ratio < worst.bar
            missed |= miss
            print(f"{picture.window:22}{picture.theme:7}{what:20}{len(verdicts):6}  {worst.ratio:6.2f}  "
                  f"{worst.bar or '-':>4}  {_colour(worst.ink)} on {_colour(worst.background)} {worst.box}"
                  f"{'  MISSED' if miss else ''}")
    return 1 if missed else 0


if __name__ == "__main__":
    sys.exit(main())
