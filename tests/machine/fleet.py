# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Three servers in containers, and a fourth one from which Ansible reaches them over SSH."""

import json
import re

import container
import machine
import trees

CONTROL_ADDRESS = "192.0.2.1"
ADDRESSES = {"web-1": "192.0.2.11", "web-2": "192.0.2.12", "db-1": "192.0.2.13"}
ZONE = "Asia/Kathmandu"
MODULE = "tavisk.settings.machine"
PLAY = f"""
- hosts: rack
  gather_facts: false
  become: true
  tasks:
    - name: Settings of the server
      {MODULE}:
        settings:
          Computer Name: "Rack: {{{{ inventory_hostname_short }}}}"
          Local Subnet Name: "{{{{ inventory_hostname }}}}"
          Time Zone: {ZONE}
          Remote Login: on
          Computer Sleep: 45
"""
INVENTORY = "[rack]\n" + "".join(
    f"{name}.rack.example ansible_host={address} ansible_user=alice ansible_python_interpreter=/usr/bin/python3\n"
    for name, address in ADDRESSES.items())
SHOWN = ['-    "Time Zone": "Etc/UTC"', f'+    "Time Zone": "{ZONE}"', '+    "Computer Sleep": "45 minutes"',
         '-    "Remote Login": "on, after a restart off"']
SETTINGS = {"Computer Name", "Local Subnet Name", "Time Zone", "Remote Login", "Computer Sleep"}
ALIKE = ("before", "stored_before", "after", "stored", "outcome", "reason", "changed", "lasts")
ANSWER = re.compile(r"^(\S+?)\.rack\.example \| (\w+)!? => ", re.MULTILINE)

# The SSH server runs until the next start only; what sshd-keygen.service does to that is told in doc/platforms.md.
BEFORE = """set -e
tavisk -settimezone Etc/UTC >/dev/null
systemctl disable --quiet ssh.service
if [ -e /usr/lib/systemd/system/sshd-keygen.service ]; then systemctl disable --quiet sshd-keygen; fi
install -d -o alice -m 700 /home/alice/.ssh
echo 'alice ALL=(ALL) NOPASSWD: ALL' >/etc/sudoers.d/alice
"""
# The kernel of such a server can sleep, as far as anybody can see there.
ABLE_TO_SLEEP = """set -e
mkdir /run/sys
mount -t tmpfs tmpfs /run/sys
for part in /sys/*; do
  mkdir /run$part
  case $part in */power) ;; *) mount --rbind $part /run$part ;; esac
done
mkdir -p /run/sys/power
echo 'freeze mem' >/run/sys/power/state
echo '[s2idle] deep' >/run/sys/power/mem_sleep
mount --rbind /run/sys /sys
systemctl restart systemd-logind
"""
# Of all files of the settings, and of what is in force.
EVERYTHING = """find /etc /var/lib/tavisk /Library -printf '%p %s %T@ %l\\n' 2>/dev/null | sort | sha256sum
uname -n; systemctl is-active ssh.service; systemctl is-enabled ssh.service; journalctl --sync; journalctl -t tavisk -o cat | grep -c -e applied -e begins"""


def in_force(name):
    """What the server's own tools tell when it has what is wanted, but for its sleep."""
    return {"readlink /etc/localtime | sed 's,.*zoneinfo/,,'": f"{ZONE}\n", "hostnamectl hostname --pretty": f"Rack: {name}\n",
            "cat /etc/hostname; uname -n": f"{name}.rack.example\n" * 2,
            "systemctl is-active ssh.service; systemctl is-enabled ssh.service": "active\nenabled\n"}


SLEEPS = {"busctl get-property org.freedesktop.login1 /org/freedesktop/login1 org.freedesktop.login1.Manager IdleAction":
          's "suspend"\n'}


class Member(container.Container):
    """One of them; only the wires that are plugged in lead out of it."""

    def plug(self, server, address):
        """A wire of its own to the server, which needs a new one after each start."""
        name = address.replace(".", "-")
        here, there = (["nsenter", "--target", member._first_process, "--net", "ip"] for member in (self, server))
        trees.run(*here, "link", "add", name, "type", "veth", "peer", "name", "rack", "netns", server._first_process)
        for ip, link, own, other in ((here, name, CONTROL_ADDRESS, address), (there, "rack", address, CONTROL_ADDRESS)):
            trees.run(*ip, "address", "add", own, "peer", other, "dev", link)
            trees.run(*ip, "link", "set", link, "up")

    def unplug(self, address):
        trees.run("nsenter", "--target", self._first_process, "--net", "ip", "link", "delete", address.replace(".", "-"))

    def write(self, path, text):
        (self._tree / path.lstrip("/")).write_text(text)

    def read(self, path):
        return (self._tree / path.lstrip("/")).read_text()

    def tell(self, command):
        """What it prints; Trouble when it fails."""
        answer = self.run(command)
        if answer.status:
            raise machine.Trouble(f"{self.name}: {command}: {answer.output}{answer.errors}")
        return answer.output


class Fleet(machine.Machine):
    name = "fleet of three servers"
    cannot = Member.cannot

    def __init__(self):
        self._control = Member("ansible-core", "openssh-client", name="control", own=[trees.COLLECTION])
        self._servers = {name: Member("openssh-server", "python3", "sudo", name=name) for name in ADDRESSES}
        self.run = self._control.run

    def start(self):
        self._control.start()
        self._control.write("root/rack.yml", PLAY)
        self._control.write("root/rack", INVENTORY)
        self._control.tell("ssh-keygen -q -t ed25519 -N '' -f /root/.ssh/id_ed25519")
        known = ""
        for name, server in self._servers.items():
            server.start()
            server.tell(BEFORE)
            server.write("home/alice/.ssh/authorized_keys", self._control.read("root/.ssh/id_ed25519.pub"))
            known += f"{ADDRESSES[name]} {server.read('etc/ssh/ssh_host_ed25519_key.pub')}"
            self._control.plug(server, ADDRESSES[name])
        self._control.write("root/.ssh/known_hosts", known)
        for name in ("web-1", "web-2"):
            self._servers[name].tell(ABLE_TO_SLEEP)

    def stop(self):
        for member in (*self._servers.values(), self._control):
            member.stop()

    def restart(self):
        for name, server in self._servers.items():
            self._control.unplug(ADDRESSES[name])
            server.restart()
            self._control.plug(server, ADDRESSES[name])
            server.tell(ABLE_TO_SLEEP)

    def prove(self, results):
        before = self._told(EVERYTHING)
        foretold = self._play("--check --diff")
        results.add("fleet: check mode foretells, and changes nothing",
                    [*differences("outcomes", foretold.outcomes, _first_outcomes()),
                     *differences("everything", self._told(EVERYTHING), before)])
        done = self._play("--diff")
        results.add("fleet: the first run does what was foretold, on the others too where one server cannot",
                    [*differences("results", done.seen(), foretold.seen()), *self._wrong_tools(sleepless=["db-1"]),
                     *_wrong_failure(done)])
        results.add("fleet: the difference is shown", [f"not shown: {line}" for line in SHOWN if line not in done.text])
        self._servers["db-1"].tell(ABLE_TO_SLEEP)
        results.add("fleet: the second run does what is left", differences("changes", self._play().changes(), {
            "web-1": [], "web-2": [], "db-1": ["Computer Sleep"]}))
        everything = self._told(EVERYTHING)
        results.add("fleet: the third changes nothing",
                    [*self._unsettled(), *differences("everything", self._told(EVERYTHING), everything)])
        self.restart()
        results.add("fleet: after a restart there is still nothing to change",
                    [*self._unsettled("--check"), *self._unsettled(), *self._wrong_tools()])
        results.add("fleet: facts are gathered", self._wrong_facts())
        results.add("fleet: a server without the package says so", self._wrong_without_package())

    def _told(self, command):
        return {name: server.run(command).output for name, server in self._servers.items()}

    def _play(self, options=""):
        return Run(self.run(f"cd /root && ANSIBLE_STDOUT_CALLBACK=minimal ansible-playbook -i rack rack.yml {options}"))

    def _ask(self, arguments):
        return Run(self.run(f"cd /root && ansible rack -i rack -m {MODULE} -a '{arguments}'"))

    def _unsettled(self, options=""):
        run = self._play(options)
        complaints = [f"{name}: {answer['msg']}" for name, answer in run.answers.items() if answer["failed"]]
        return differences("changes", run.changes(), dict.fromkeys(ADDRESSES, [])) + complaints

    def _wrong_tools(self, sleepless=()):
        return [problem for name, server in self._servers.items()
                for command, expected in {**in_force(name), **({} if name in sleepless else SLEEPS)}.items()
                for problem in differences(f"{name}: {command}", server.run(command).output, expected)]

    def _wrong_facts(self):
        answers = self._ask("gather=true").answers
        told = {name: answer.get("ansible_facts", {}).get("tavisk", {}).get("settings", {}) for name, answer in answers.items()}
        wanted = {name: (f"Rack: {name}", ZONE, "45") for name in ADDRESSES}
        return differences("facts", {name: tuple(settings.get(setting, {}).get("live") for setting in
                                                 ("Computer Name", "Time Zone", "Computer Sleep"))
                                     for name, settings in told.items()}, wanted)

    def _wrong_without_package(self):
        self._servers["web-2"].tell("dpkg --remove tavisk")
        run = self._ask("gather=true")
        return differences("answers", {name: "not installed" in answer.get("msg", "") for name, answer in run.answers.items()},
                           {"web-1": False, "web-2": True, "db-1": False})


class Run:
    """What Ansible printed of its hosts, each with the result of its one task."""

    def __init__(self, answer):
        self.status = answer.status
        self.text = answer.output + answer.errors
        self.answers = {found[1]: json.JSONDecoder().raw_decode(self.text, found.end())[0] | {"failed": found[2] == "FAILED"}
                        for found in ANSWER.finditer(self.text)}
        if not self.answers:
            raise machine.Trouble(f"Ansible reached no server: {self.text[-2000:]}")

    @property
    def outcomes(self):
        return {name: {setting["setting"]: setting["outcome"] for setting in answer.get("settings", [])} | {
            "failed": answer["failed"], "changed": answer.get("changed")} for name, answer in self.answers.items()}

    def seen(self):
        """What a rehearsal and the run have to tell alike: of what a server cannot have, only the reason."""
        return {name: {"msg": answer.get("msg")} | {
            setting["setting"]: {part: setting.get(part) for part in ALIKE} for setting in answer.get("settings", [])
            if setting["outcome"] != "not supported"} for name, answer in self.answers.items()}

    def changes(self):
        return {name: [setting["setting"] for setting in answer.get("settings", ["no answer"]) if setting["changed"]]
                for name, answer in self.answers.items()}


def _first_outcomes():
    all_applied = dict.fromkeys(SETTINGS, "applied") | {"failed": False, "changed": True}
    return {"web-1": all_applied, "web-2": all_applied,
            "db-1": all_applied | {"Computer Sleep": "not supported", "failed": True}}


def _wrong_failure(run):
    reason = run.answers.get("db-1", {}).get("msg", "")
    return [] if re.fullmatch(r"Computer Sleep: not supported: [^;]+", reason) and run.status == 2 else [f"{run.status}: {reason}"]


def differences(what, got, expected):
    """Of dictionaries, in what lies behind their keys."""
    if got == expected:
        return []
    if isinstance(got, dict) and isinstance(expected, dict):
        return [problem for key in sorted({*got, *expected})
                for problem in differences(f"{what}, {key}", got.get(key), expected.get(key))]
    return [f"{what}: expected {expected}", f"{what}: got {got}"]
