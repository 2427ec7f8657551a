# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What three shells offer when lines are completed at their ends: for each line, the offers."""

import contextlib
import os
import pathlib
import pty
import re
import subprocess
import tempfile

SECONDS = 60
NEXT = "next line"  # no offer

BASH = r"""
source /usr/share/bash-completion/bash_completion
source "$1"
while IFS=$'\t' read -r line words; do
  IFS=$'\037' read -ra COMP_WORDS <<<"$words"
  [[ $line == *' ' ]] && COMP_WORDS+=('')
  COMP_LINE=$line COMP_POINT=${#line} COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
  "_$2" "$2" "${COMP_WORDS[-1]}" "${COMP_WORDS[-2]}"
  for offer in "${COMPREPLY[@]}"; do echo "$offer"; done
  echo next line
done
"""

FISH = r"""
source $argv[1]
while read --null line
  complete -C $line
  echo next line
end
"""

# The widget completes whole lines that it is given, and every match that is added is written down.
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
complete-lines() {
  for BUFFER in ${(f)"$(<$lines)"}; do
    CURSOR=$#BUFFER
    zle list-line
    print next line >>$offers
  done
  exit 0
}
zle -C list-line list-choices _main_complete
zle -N complete-lines
bindkey '^X' complete-lines
"""


def _offers(text):
    """An offer may be described, behind a tab, and be quoted as it is to be typed."""
    found = [[]]
    for line in text.splitlines():
        if line == NEXT:
            found.append([])
        else:
            found[-1].append(line.split("\t")[0].replace("\\ ", " "))
    return found[:-1]


def _run(command, typed, environment):
    result = subprocess.run([str(word) for word in command], input=typed, capture_output=True, text=True,
                            env=environment, timeout=SECONDS, check=True)
    assert not result.stderr, result.stderr
    return _offers(result.stdout)


def bash(share, program, lines, environment):
    # bash divides a line into words at colons too.
    typed = "".join(line + "\t" + "\037".join(re.findall(r":+|[^\s:]+", line)) + "\n" for line in lines)
    completion = share / "bash-completion/completions" / program
    return _run(["bash", "--norc", "-c", BASH, "bash", completion, program], typed, environment)


def fish(share, program, lines, environment):
    completion = share / f"fish/vendor_completions.d/{program}.fish"
    return _run(["fish", "--no-config", "-c", FISH, completion], "".join(line + "\0" for line in lines), environment)


def zsh(share, _, lines, environment):
    with tempfile.TemporaryDirectory() as folder:
        files = {name: pathlib.Path(folder, name) for name in ("setup", "lines", "offers")}
        files["setup"].write_text(ZSH)
        files["lines"].write_text("\n".join(lines))
        files["offers"].touch()
        _type_into_zsh(f". {files['setup']} {share}/zsh/site-functions\r\x18".encode(),
                       {**environment, **{name: str(file) for name, file in files.items()}, "HOME": folder})
        return _offers(files["offers"].read_text())


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
