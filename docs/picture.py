#!/usr/bin/python3
"""Draws a part of demo.sh's output in a terminal as SVG.

usage: picture.py <OUTPUT >PICTURE   where OUTPUT is what demo.sh prints on a terminal
"""
import io
import re
import sys

from rich.console import Console
from rich.text import Text

COLUMNS = 130

# The sections to show: how many of their lines, and which of them to leave out.
SECTIONS = {
    "The SIMs of the device": (99, None),
    "Countries": (10, None),
    "Notifications to the client services": (99, "activate|number|policy|off|calls"),
    "A push message": (99, "calls"),
    "Flight mode": (99, None),
}

# Like rich's own form, but with fonts of the reader's machine only.
FORM = """<svg viewBox="0 0 {width} {height}" xmlns="http://www.w3.org/2000/svg">
<style>
.{unique_id}-matrix {{ font-family: monospace; font-size: {char_height}px; line-height: {line_height}px; }}
.{unique_id}-title {{ font-size: 18px; font-weight: bold; font-family: sans-serif; }}
{styles}
</style>
<defs>
<clipPath id="{unique_id}-clip-terminal"><rect x="0" y="0" width="{terminal_width}" height="{terminal_height}" /></clipPath>
{lines}
</defs>
{chrome}
<g transform="translate({terminal_x}, {terminal_y})" clip-path="url(#{unique_id}-clip-terminal)">
{backgrounds}
<g class="{unique_id}-matrix">
{matrix}
</g>
</g>
</svg>
"""


def shown(line):
    """The part of a line that a terminal shows: the text after the last carriage return that clears the line."""
    return line.rstrip("\r").split("\r\x1b[K")[-1]


def part(lines):
    left, pattern, hidden = 0, None, False
    for line in lines:
        title = re.search(r"== ([^\x1b]*)", line)
        if title:
            left, pattern = next((how for name, how in SECTIONS.items() if title[1].startswith(name)), (0, None))
        # The answer below a hidden command is hidden too.
        hidden = bool(pattern and re.search(pattern, line)) or (hidden and line.startswith("sent "))
        if left > 0 and not hidden:
            left -= 1
            yield line


def main():
    console = Console(record=True, width=COLUMNS, file=io.StringIO(), force_terminal=True)
    for line in part(map(shown, sys.stdin.read().split("\n"))):
        console.print(Text.from_ansi(line), overflow="fold")
    print(console.export_svg(title="./demo.sh", code_format=FORM, unique_id="demo"), end="")


main()
