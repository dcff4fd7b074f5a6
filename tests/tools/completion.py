#!/usr/bin/env python3
"""Completes command lines in interactive shells on a terminal: bash, zsh and fish.
usage: completion.py KIVCTL"""
import os
import pty
import select
import shutil
import sys
import tempfile
import time

KIVCTL = os.path.abspath(sys.argv[1])
# What is typed, with a tab at its end and at each "\t", and the command line after it.
CASES = [
    ("kivctl device set runtime.flight-mode=t", "kivctl device set runtime.flight-mode=true"),
    ("kivctl device set runtime.fl\ttr", "kivctl device set runtime.flight-mode=true"),
    ("kivctl sim my", "kivctl sim my"),  # no file belongs there
    ("kivctl sim --profile=roa", "kivctl sim --profile=roaming"),
    ("kivctl sim --profile=my", "kivctl sim --profile=my.profile"),
    ("kivctl sim -p my", "kivctl sim -p my.profile"),
    ("kivctl --col", "kivctl --color"),
    ("kivctl subscribers remove st", "kivctl subscribers remove status"),
    ("kivctl subscribers remove status 7 org.a", "kivctl subscribers remove status 7 org.a.B"),
    ("kivctl completion z", "kivctl completion zsh"),
    ("kivctl sim --fields slot,car", "kivctl sim --fields slot,card"),
]
# How each shell is started, and a definition of "show", which prints the words of a line.
SHELLS = {
    "bash": (["--noprofile", "--norc", "-i"], "show() { printf '<%s>' \"$@\"; echo; }; source <(kivctl completion bash)"),
    "zsh": (["-f", "-i"],
            "autoload -U compinit; compinit -u -D; show() { printf '<%s>' \"$@\"; echo; }; source <(kivctl completion zsh)"),
    "fish": (["--no-config", "-i"], "function show; printf '<%s>' $argv; echo; end; kivctl completion fish | source"),
}


class Terminal:
    """A shell on its own terminal."""

    def __init__(self, shell, arguments):
        self.process, self.descriptor = pty.fork()
        if self.process == 0:
            os.execvp(shell, [shell, *arguments])
        self.seen = ""

    def type(self, text):
        os.write(self.descriptor, text.encode())

    def read_until(self, text):
        """Returns whether the text was printed within the time limit."""
        deadline = time.monotonic() + 20
        while text not in self.seen and time.monotonic() < deadline:
            if select.select([self.descriptor], [], [], 0.1)[0]:
                self.seen += os.read(self.descriptor, 65536).decode(errors="replace")
        found = text in self.seen
        if found:
            self.seen = self.seen.split(text, 1)[1]
        return found

    def close(self):
        os.kill(self.process, 9)
        os.waitpid(self.process, 0)
        os.close(self.descriptor)


def check(shell):
    arguments, start = SHELLS[shell]
    terminal = Terminal(shell, arguments)
    terminal.type(start + "; show ready\r")
    failures = 0 if terminal.read_until("<ready>") else 1
    for typed, expected in CASES:
        for part in typed.split("\t"):
            terminal.type(part + "\t")
            time.sleep(0.3)  # shells ignore input while they complete
        terminal.type("\x01show \r")
        words = "".join(f"<{word}>" for word in expected.split())
        if not terminal.read_until(words):
            print(f"{shell}: {typed}<TAB> does not give {words} but {terminal.seen!r}")
            failures += 1
    terminal.close()
    return failures


def main():
    missing = [shell for shell in SHELLS if not shutil.which(shell)]
    if missing:
        print("skipped: not installed:", *missing)
        return 77
    with tempfile.TemporaryDirectory() as directory:
        os.chdir(directory)
        os.environ.update(PATH=os.path.dirname(KIVCTL) + ":" + os.environ["PATH"], KIV_SUBSCRIBERS=directory + "/subscribers.db",
                          HOME=directory, TERM="xterm")
        open("my.profile", "w").close()
        if os.system("kivctl subscribers add status 7 org.a.B /x a.b") != 0:
            return 1
        return 1 if sum(check(shell) for shell in SHELLS) else 0


sys.exit(main())
