# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check, WITHOUT_BUS

REMOTE = frozenset({"avahi-daemon"})
GUEST = frozenset({"guest"})
COMPUTER = r"""Mail "2" of $HOME \ Z""" + "\u00fc" + "rich"
QUOTED = "'" + COMPUTER + "'"
HOSTS = r"printf '127.0.0.1\tlocalhost\n127.0.1.1\t%s.lan %s # own\n' $(hostname) $(hostname) >/etc/hosts; "
RESPONDER = "busctl call org.freedesktop.Avahi / org.freedesktop.Avahi.Server GetHostName"
REPORTED = "rm -f /run/report; TAVISK_REPORT=/run/report tavisk {}; cat /run/report"


def named(name):
    return {"hostnamectl hostname --static": f"{name}\n", "cat /etc/hostname": f"{name}\n", "uname -n": f"{name}\n"}


CHECKS = [
    Check("names are set while the bus is away", needs=REMOTE,
          do=WITHOUT_BUS.format("tavisk -setcomputername 'No Bus' -getcomputername -setlocalsubnetname no-bus.example "
                                "-getlocalsubnetname") + "systemctl start avahi-daemon",
          prints="setcomputername: No Bus\nComputer Name: No Bus\n"
                 "setlocalsubnetname: no-bus.example\nLocal Subnet Name: no-bus\n",
          then=named("no-bus.example") | {"hostnamectl hostname --pretty": "No Bus\n", RESPONDER: 's "no-bus"\n'}),
    Check("a responder that does not run is not started", needs=REMOTE,
          do="systemctl stop avahi-daemon.socket avahi-daemon; systemctl start systemd-resolved; "
             "TAVISK_LOG=stderr tavisk -setlocalsubnetname alone -getlocalsubnetname",
          prints="setlocalsubnetname: alone\nLocal Subnet Name: alone\n", errors="",
          then=named("alone") | {"systemctl is-active avahi-daemon": "inactive\n", "systemctl start avahi-daemon": ""}),
    Check("the lines of the machine's own addresses follow", needs=REMOTE,
          do="tavisk -setlocalsubnetname before >/dev/null; printf '127.0.0.1 localhost\\n127.0.0.2 before.lan before www\\n"
             "192.0.2.1 before\\n' >/etc/hosts; " + REPORTED.format("-setlocalsubnetname after.example -getlocalsubnetname") +
             """ | grep -o -e '^[a-zL].*' -e '"live":"[^"]*","stored":"[^"]*"' -e '"where":"[^"]*"'""",
          prints='setlocalsubnetname: after.example\nLocal Subnet Name: after\n"live":"after","stored":"after.example"\n'
                 '"where":"/etc/hosts, /etc/hostname"\n"live":"after","stored":"after.example"\n',
          then={"cat /etc/hosts": "127.0.0.1 localhost\n127.0.0.2\tafter.example after www\n192.0.2.1 before\n",
                "getent hosts after.example | cut -d' ' -f1": "127.0.0.2\n"}),
    Check("a name that nothing resolves is told", needs=REMOTE,
          do="echo '127.0.0.1 localhost' >/etc/hosts; cp /etc/nsswitch.conf /run/; echo 'hosts: files' >/etc/nsswitch.conf; "
             + REPORTED.format("-setlocalsubnetname nowhere") + " | grep -o 'does not resolve'; getent hosts nowhere || "
             "echo none; cp /run/nsswitch.conf /etc/", prints="setlocalsubnetname: nowhere\ndoes not resolve\nnone\n"),
    Check("the computer name is set", needs=REMOTE, kept=True, do=f"tavisk -setcomputername {QUOTED} -getcomputername",
          prints=f"setcomputername: {COMPUTER}\nComputer Name: {COMPUTER}\n",
          then={"hostnamectl hostname --pretty": f"{COMPUTER}\n", "tavisk -getcomputername": f"Computer Name: {COMPUTER}\n"}),
    Check("the host name is set, announced and in /etc/hosts", needs=REMOTE, kept=True,
          do=HOSTS + "TAVISK_LOG=stderr tavisk -setlocalsubnetname mail-2 -getlocalsubnetname",
          prints="setlocalsubnetname: mail-2\nLocal Subnet Name: mail-2\n", errors="",
          then=named("mail-2") | {RESPONDER: 's "mail-2"\n', "grep 127.0.1.1 /etc/hosts": "127.0.1.1\tmail-2.lan mail-2 # own\n",
                                  "tavisk -getlocalsubnetname": "Local Subnet Name: mail-2\n"}),
    Check("an empty computer name takes it away", needs=REMOTE,
          do=f"tavisk -setcomputername '' -getcomputername -setcomputername {QUOTED}",
          prints=f"setcomputername: \nComputer Name: mail-2\nsetcomputername: {COMPUTER}\n"),
    Check("names are set without a service manager", needs=GUEST,
          do="echo before >/etc/hostname; echo '127.0.1.1 before' >/etc/hosts; "
             "tavisk -setcomputername Guest -setlocalsubnetname guest-2 -getcomputername -getlocalsubnetname",
          prints="setcomputername: Guest\nsetlocalsubnetname: guest-2\nComputer Name: Guest\nLocal Subnet Name: guest-2\n",
          then={"hostname": "guest-2\n", "cat /etc/hostname /etc/hosts /etc/machine-info":
                'guest-2\n127.0.1.1\tguest-2\nPRETTY_HOSTNAME="Guest"\n'}),
]
