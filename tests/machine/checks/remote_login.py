# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check, WITHOUT_BUS

NEEDS = frozenset({"openssh-server"})
QUESTION = ("Do you really want to turn remote login off? If you do, you will lose this connection and can only turn it "
            "back on locally at the server (yes/no)? ")
ENABLED = "systemctl is-enabled ssh.service ssh.socket"
ACTIVE = "systemctl is-active ssh.service ssh.socket"
LISTENING = "ss -H -l -t -n 'sport = :22' | grep -c -F '[::]'"
GREETING = {"timeout 5 bash -c 'head -c 4 </dev/tcp/127.0.0.1/22'": "SSH-"}
ON = {ENABLED: "enabled\ndisabled\n", ACTIVE: "active\ninactive\n", LISTENING: "1\n", **GREETING}
OFF = {ENABLED: "disabled\ndisabled\n", ACTIVE: "inactive\ninactive\n", LISTENING: "0\n",
       "test -e /etc/systemd/system/sshd.service || echo no alias": "no alias\n"}
TO_SERVICE = "systemctl disable --quiet --now ssh.socket ssh.service; "
TO_SOCKET = TO_SERVICE + "systemctl enable --quiet --now ssh.socket; "
TURN_ON = "TAVISK_LOG=stderr tavisk -setremotelogin on -getremotelogin"
TURN_OFF = "TAVISK_LOG=stderr tavisk -f -setremotelogin off -getremotelogin"
# A login that lasts longer than the command that began it.
LOGIN = """install -d -o alice -m 700 /home/alice/.ssh
rm -f /root/key; ssh-keygen -q -t ed25519 -N '' -f /root/key
install -o alice -m 600 /root/key.pub /home/alice/.ssh/authorized_keys
rm -f /run/login
systemd-run --quiet --collect --unit=login sh -c \\
  "ssh -i /root/key -o StrictHostKeyChecking=no -o LogLevel=ERROR alice@127.0.0.1 'echo in; exec sleep 61' >/run/login"
timeout 10 sh -c 'until grep -q -s in /run/login; do sleep 0.1; done'
"""
STAYS = {"systemctl is-active login; systemctl stop login; pkill -u alice sleep": "active\n"}

# Enabled and stopped: off now, on after the next start of the machine.
TO_STOPPED = TO_SERVICE + "systemctl enable --quiet ssh.service; "
WANTED = "/etc/systemd/system/multi-user.target.wants/ssh.service"
WITH_REPORT = "rm -f /run/report; TAVISK_REPORT=/run/report tavisk {} {}; "


def told(text):
    return {f"grep -c -F '{text}' /run/report": "1\n"}

# It wants and names sshd.service, which is an alias that is absent while the server is off: with such a name the service
# manager forgets, when it reads its units again, that a server runs that was just enabled.
WITHOUT_KEY_MAKER = "if [ -e /usr/lib/systemd/system/sshd-keygen.service ]; then systemctl disable --quiet sshd-keygen; fi"

CHECKS = [
    Check("the maker of host keys is put aside", needs=NEEDS, do=WITHOUT_KEY_MAKER),
    Check("a server that is enabled and stopped is off now and on later", needs=NEEDS,
          do=TO_STOPPED + WITH_REPORT.format("", "-getremotelogin"), prints="Remote Login: On\n",
          then={LISTENING: "0\n"} | told('"live":"off","stored":"on"')),
    Check("a server that is enabled and stopped is not on already", needs=NEEDS,
          do=TO_STOPPED + WITH_REPORT.format("", "-setremotelogin on") + "grep -c where /run/report",
          prints="0\n", status=1, then=ON | told('"before":"off","asked":"on","live":"on","stored":"on"')),
    Check("a server that is enabled and stopped is not off already", needs=NEEDS,
          do=TO_STOPPED + WITH_REPORT.format("-f", "-setremotelogin off") + "grep -c note /run/report; "
          "tavisk -f -setremotelogin off", prints="0\nsetremotelogin: remote login is already Off.\n",
          then=OFF | told('"stored":"off"') | told(WANTED)),
    Check("a server that runs until the next start is not on already", needs=NEEDS,
          do=TO_SERVICE + "systemctl start ssh.service; " + WITH_REPORT.format("", "-setremotelogin on -setremotelogin on"),
          prints="setremotelogin: remote login is already On.\n", then=ON | told(WANTED)),
    Check("a server that is enabled until the next start is not on after it", needs=NEEDS,
          do=TO_SERVICE + "systemctl enable --quiet --runtime --now ssh.service; " + WITH_REPORT.format("", "-getremotelogin"),
          prints="Remote Login: On\n", then=told('"live":"on","stored":"off"') | {
              "systemctl disable --quiet --runtime ssh.service": ""}),
    Check("a socket that listens is on", needs=NEEDS, do=TO_SOCKET + WITH_REPORT.format("", "-getremotelogin") + "tavisk -setremotelogin on",
          prints="Remote Login: On\nsetremotelogin: remote login is already On.\n",
          then={ACTIVE: "inactive\nactive\n", **GREETING} | told('"live":"on","stored":"on"')),
    Check("a question that nobody is left to answer fills no disk", needs=NEEDS,
          do="timeout 2 tavisk -setremotelogin off </dev/null | wc -c | awk '{print ($1 > 0 && $1 < 30000)}'", prints="1\n"),
    Check("remote login is turned on", needs=NEEDS, do=TO_SERVICE + TURN_ON, prints="Remote Login: On\n", errors="",
          then=ON),
    Check("remote login is turned off after a question", needs=NEEDS, do="echo yes | tavisk -setremotelogin off",
          prints=QUESTION, then=OFF | {"tavisk -getremotelogin": "Remote Login: Off\n"}),
    Check("remote login is switched while the bus is away", needs=NEEDS,
          do=WITHOUT_BUS.format(TURN_ON + " 2>&1") + "systemctl restart avahi-daemon",
          prints="Remote Login: On\n", then=ON),
    Check("who is logged in stays when remote login is turned off", needs=NEEDS, do=LOGIN + TURN_OFF,
          prints="Remote Login: Off\n", errors="", then=OFF | STAYS),
    Check("socket, service and logins: the first two are turned off", needs=NEEDS, do=TO_SOCKET + LOGIN + TURN_OFF,
          prints="Remote Login: Off\n", errors="", then=OFF | STAYS),
    Check("host keys are made where there are none", needs=NEEDS, do="rm /etc/ssh/ssh_host_*; " + TURN_ON,
          prints="Remote Login: On\n", errors="", then=ON),
    Check("a service that is masked is told, and stays so", needs=NEEDS,
          do=TO_SERVICE + "systemctl mask --quiet ssh.service; " + TURN_ON, prints="Remote Login: Off\n",
          errors=re.compile(r"tavisk: Remote Login: EnableUnitFiles on ssh\.service: [^\n]*masked[^\n]*\n"),
          then={"systemctl is-enabled ssh.service": "masked\n", "systemctl unmask --quiet ssh.service": ""}),
    Check("a server that its administrator forbids is told", needs=NEEDS,
          do="touch /etc/ssh/sshd_not_to_be_run; " + TURN_ON + "; rm /etc/ssh/sshd_not_to_be_run",
          prints="Remote Login: On\n", errors=re.compile(r"tavisk: Remote Login: [^\n]*sshd_not_to_be_run does not hold\n"),
          then={ACTIVE: "inactive\ninactive\n"}),
    Check("remote login stays off", needs=NEEDS, kept=True, do="tavisk -f -setremotelogin off -getremotelogin",
          prints="Remote Login: Off\n", then=OFF),
]
