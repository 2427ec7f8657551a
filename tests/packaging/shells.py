# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What three shells offer when a line is completed at its end."""

import contextlib
import os
import pathlib
import pty
import re
import subprocess
import tempfile

SECONDS = 20

BASH = r"""
source /usr/share/bash-completion/bash_completion
source "$1"
shift
COMP_LINE=$1 COMP_POINT=${#1} COMP_WORDS=("${@:2}") COMP_CWORD=$(($# - 2))
_tavisk tavisk "${COMP_WORDS[-1]}" "${COMP_WORDS[-2]}"
for offer in "${COMPREPLY[@]}"; do echo "$offer"; done
"""

# The widget completes a whole line that it is given, and every match that is added is written down.
ZSH = r"""
fpath=($1 $fpath)
autoload -Uz compinit
compinit -u -D
compadd() {
  if [[ ${@[1,(i)(-|--)]} == *-(O|A|D)\ * ]]; then
    builtin compadd "$@"
    return
  fi
  local -a matches
  builtin compadd -A matches "$@"
  (( $#matches )) && print -rl -- $matches >>$offers
  builtin compadd "$@"
}
complete-line() {
  BUFFER=$line CURSOR=$#line
  zle list-line
  exit 0
}
zle -C list-line list-choices _main_complete
zle -N complete-line
bindkey '^X' complete-line
"""


def _words(line):
    """As bash divides a line: a colon is a word of its own."""
    words = re.findall(r":+|[^\s:]+", line)
    return words if re.search(r"[^\s:]$", line) else [*words, ""]


def _lines(command, environment):
    result = subprocess.run([str(word) for word in command], stdin=subprocess.DEVNULL, capture_output=True, text=True,
                            env=environment, timeout=SECONDS, check=True)
    assert not result.stderr, result.stderr
    return result.stdout.splitlines()


def _unquoted(offer):
    return offer.replace("\\ ", " ")


def bash(share, line, environment):
    completion = share / "bash-completion/completions/tavisk"
    return _lines(["bash", "--norc", "-c", BASH, "bash", completion, line, *_words(line)], environment)


def fish(share, line, environment):
    completion = share / "fish/vendor_completions.d/tavisk.fish"
    offers = _lines(["fish", "--no-config", "-c", 'source "$argv[1]"; complete -C "$argv[2]"', completion, line],
                    environment)
    return [_unquoted(offer.split("\t")[0]) for offer in offers]


def zsh(share, line, environment):
    with tempfile.TemporaryDirectory() as folder:
        setup, offers = pathlib.Path(folder, "setup"), pathlib.Path(folder, "offers")
        setup.write_text(ZSH)
        offers.touch()
        _type_into_zsh(f". {setup} {share}/zsh/site-functions\r\x18".encode(),
                       {**environment, "line": line, "offers": str(offers), "HOME": folder})
        return [_unquoted(offer) for offer in offers.read_text().splitlines()]


def _type_into_zsh(typed, environment):
    """Completion wants a terminal and someone who types."""
    child, terminal = pty.fork()
    if child == 0:
        os.execvpe("timeout", ["timeout", "--foreground", str(SECONDS), "zsh", "-f", "-i"], environment)
    os.write(terminal, typed)
    shown = b""
    with contextlib.suppress(OSError):  # how a terminal ends
        while piece := os.read(terminal, 4096):
            shown += piece
    os.close(terminal)
    assert os.waitstatus_to_exitcode(os.waitpid(child, 0)[1]) == 0, shown


SHELLS = {"bash": bash, "fish": fish, "zsh": zsh}
