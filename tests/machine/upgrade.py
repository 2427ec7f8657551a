# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A container with Debian 12 that becomes Debian 13 between the first checks and its restart."""

import pathlib
import shutil

import container
import trees

BEFORE, AFTER = "bookworm", "trixie"
UPGRADE_SECONDS = 1800
# A question of dpkg's finds nobody, and is an error then.
UPGRADE = """export DEBIAN_FRONTEND=noninteractive
apt-get --quiet --yes --no-download full-upgrade </dev/null && dpkg --install /root/tavisk.deb </dev/null"""
OWN_FILES = "find /etc -name '60-tavisk*' -exec sha256sum {} + | sort"
FACTS = {"sed -n 's/^VERSION_CODENAME=//p' /etc/os-release": AFTER + "\n",
         "dpkg-query -W -f '${Status} ${Version}' tavisk": "install ok installed ",
         "dpkg --verify tavisk": "",
         "find /etc -name '*.dpkg-*' | grep -i tavisk": ""}


class Upgrade(container.Container):
    def __init__(self, *packages):
        super().__init__(*packages, release=BEFORE)
        self.name = f"container from {BEFORE} to {AFTER}"
        self._problems = None
        self._fetch()

    def restart(self):
        """Becomes the next release before the first restart."""
        if self._problems is None:
            self._upgrade()
        super().restart()

    def prove_more(self, results):
        results.add(f"{self.name}: the upgrade asks nothing, and leaves what was made", self._problems)

    def _fetch(self):
        """The container has no network: its packages are laid into its tree before it starts."""
        for sources in (self._tree / "etc/apt/sources.list.d").iterdir():
            sources.write_text(sources.read_text().replace(BEFORE, AFTER))
        resolver = self._tree / "run/systemd/resolve"  # where the tree's resolv.conf leads to
        resolver.mkdir(parents=True)
        shutil.copy("/etc/resolv.conf", resolver / "stub-resolv.conf")
        for words in (["update"], ["--yes", "--download-only", "full-upgrade"]):
            trees.run("chroot", self._tree, "apt-get", "--quiet", *words)

    def _upgrade(self):
        shutil.copy(trees.package(AFTER), self._tree / "root/tavisk.deb")
        before = self.run(OWN_FILES).output
        upgraded = self.run_beside(UPGRADE, UPGRADE_SECONDS)
        self._problems = [] if before else ["no file was made that could be lost"]
        if upgraded.status:
            self._problems.append((upgraded.output + upgraded.errors)[-2000:])
        if self.run(OWN_FILES).output != before:
            self._problems.append("files of the settings have changed")
        for command, expected in FACTS.items():
            said = self.run_beside(command, 60).output
            if not said.startswith(expected) or (not expected and said):
                self._problems.append(f"{command}: {said}")
