# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER = frozenset({"container"})
RULE = "/etc/polkit-1/rules.d/00-test.rules"  # before the package's own
UNITS = "org.freedesktop.systemd1.manage-units"
ZONE = "readlink -f /etc/localtime"
PARIS = "TAVISK_LOG=stderr tavisk -settimezone Europe/Paris"
LIMA = "/usr/share/zoneinfo/America/Lima\n"
REFUSED = r"tavisk: Time Zone: authorize on org\.tavisk\.manage: {}[^\n]*\n"
WITH_REPORT = "rm -f /run/report; ( {} ) 3>/run/report; "


def by(user, command):
    return f"setpriv --reuid {user} --regid {user} --init-groups env {command}"


def with_rule(answer, command, action="a.id"):
    text = f'polkit.addRule(function(a, s) {{ if (s.isInGroup("admin") && a.id == {action}) return polkit.Result.{answer}; }});'
    renewed = "systemctl reset-failed polkit 2>/dev/null; systemctl restart polkit"
    return f"echo '{text}' >{RULE}; {renewed}; {command}; status=$?; rm {RULE}; {renewed}; exit $status"


def may(unit, verb):
    """Told by root on behalf of a process of alice's, as the service manager asks polkit."""
    return (f"pkcheck --process $! --action-id {UNITS} --detail unit {unit} --detail verb {verb} >/dev/null 2>&1; "
            f'echo "{verb} {unit}: $?"; ')


def at_terminal(user, command, password):
    """By a user who is logged in and types a password once it is asked for. What the terminal showed is left in /run/screen."""
    login = f"systemd-run --quiet --pty --wait --collect -p PAMName=login -p User={user} env {command}"
    asked = "timeout 20 sh -c 'until grep -q -s Password /run/screen; do sleep 0.1; done'"
    ended = "timeout 30 sh -c 'until [ -e /run/ended ]; do sleep 0.1; done'"
    return (f"rm -f /run/screen /run/ended; {{ {asked}; sleep 0.5; echo {password}; {ended}; }} | "
            f"script -q -e -f -c '{login}; status=$?; touch /run/ended; exit $status' /run/screen >/run/printed 2>&1; ")


CHECKS = [
    Check("who is no administrator is refused", needs=CONTAINER, do=by("mallory", "tavisk -getdate"),
          prints=re.compile(r"You need administrator access to run this tool\.\.\. exiting!\n?"),
          then={"journalctl --sync; journalctl -b -t tavisk -n 1 -o cat":
                re.compile(r"refused: user \d+ \(mallory\) at none is no administrator\n"),
                "journalctl -b -t tavisk -n 1 -o verbose | grep -c TAVISK_UID=$(id -u mallory)": "1\n"}),
    Check("an administrator reads without being asked, and that is no failure", needs=CONTAINER,
          do="tavisk -settimezone America/Lima >/run/printed; " +
             WITH_REPORT.format(by("alice", "TAVISK_LOG=stderr TAVISK_REPORT=fd:3 tavisk -gettimezone")),
          prints="Time Zone: America/Lima\n", errors="",
          then={"grep -c '\"failed\":false,\"changed\":false.*\"effects\":\\[\\]' /run/report": "1\n"}),
    Check("an administrator who cannot be asked changes nothing", needs=CONTAINER,
          do=WITH_REPORT.format(by("alice", "TAVISK_REPORT=fd:3 " + PARIS)), prints="Set TimeZone: Europe/Paris\n",
          errors=re.compile(REFUSED.format("polkit asks for a password, and there is no terminal to ask at: sudo tavisk")),
          then={ZONE: LIMA, "grep -c '\"changed\":false.*\"setting\":\"Time Zone\",\"outcome\":\"failed\"' /run/report": "1\n"}),
    Check("an administrator whom a rule forbids changes nothing", needs=CONTAINER, do=with_rule("NO", by("alice", PARIS)),
          prints="Set TimeZone: Europe/Paris\n", errors=re.compile(REFUSED.format("polkit does not grant it to this user")),
          then={ZONE: LIMA}),
    Check("an administrator at a terminal is asked once, for the own password", needs=CONTAINER,
          do="echo alice:a-secret | chpasswd; rm -f /etc/timezone; " +
             at_terminal("alice", PARIS + " -settimezone Europe/Rome -gettimezone", "a-secret"),
          then={ZONE: "/usr/share/zoneinfo/Europe/Rome\n", "grep -c -F Password: /run/screen": "1\n",
                "grep -c -F 'Authenticating as: alice' /run/screen": "1\n",
                "grep -c -F 'tavisk: ' /run/screen": "0\n"}),
    Check("a wrong password changes nothing, and is asked for once", needs=CONTAINER,
          do="tavisk -settimezone America/Lima >/run/printed; rm -f /etc/timezone; " +
             at_terminal("alice", PARIS + " -settimezone Europe/Rome", "a-guess"),
          then={ZONE: LIMA, "grep -c -F Password: /run/screen": "1\n",
                "grep -c -F 'tavisk: Time Zone: authorize on org.tavisk.manage' /run/screen": "2\n"}),
    Check("an administrator sets no half of the zone", needs=CONTAINER,
          do="echo America/Lima >/etc/timezone; " + with_rule("YES", by("alice", PARIS)),
          prints="Set TimeZone: Europe/Paris\n",
          errors=re.compile(r"tavisk: Time Zone: [^\n]*/etc/timezone: needs root: sudo tavisk [^\n]*\n"),
          then={ZONE: LIMA}),
    Check("an administrator whom a rule allows it sets the zone", needs=CONTAINER,
          do="mv /etc/timezone /run; " + with_rule("YES", by("alice", PARIS)),
          prints="Set TimeZone: Europe/Paris\n", then={ZONE: "/usr/share/zoneinfo/Europe/Paris\n"}),
    Check("who may use the tool is not asked again by the services behind it", needs=CONTAINER,
          do=with_rule("YES", by("alice", "TAVISK_LOG=stderr tavisk -settimezone America/Lima"), '"org.tavisk.manage"'),
          prints="Set TimeZone: America/Lima\n", then={ZONE: LIMA}),
    Check("an administrator is told what only root can store", needs=CONTAINER,
          do="mv /run/timezone /etc; " +
             with_rule("YES", by("alice", "TAVISK_LOG=stderr tavisk -setnetworktimeserver time.example")),
          prints="setNetworkTimeServer: time.example\n", errors=re.compile(r"(tavisk: [^\n]*sudo tavisk [^\n]*\n)+"),
          then={"journalctl -b -t tavisk -n 1 -o verbose | grep -c TAVISK_UID=$(id -u alice)": "1\n"}),
    Check("who may use the tool may not use the service manager by that", needs=CONTAINER, status=1,
          do=with_rule("YES", by("alice", 'sh -c "systemd-run --no-ask-password touch /run/x || systemctl --no-ask-password mask x.service"'),
                       '"org.tavisk.manage"'),
          then={"ls -d /run/x /etc/systemd/system/x.service 2>/dev/null": ""}),
    Check("the package's rule is about its own units and verbs", needs=CONTAINER,
          do=by("alice", "sleep 60") + " & sleep 1; " + may("ssh.service", "stop") + may("ssh.service", "kill")
          + may("cron.service", "stop") + "kill $!",
          prints="stop ssh.service: 0\nkill ssh.service: 2\nstop cron.service: 2\n"),
]
