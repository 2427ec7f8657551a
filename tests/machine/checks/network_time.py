# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

SERVER = "192.0.2.7"
ONE_LINE = "tavisk -setusingnetworktime on -getusingnetworktime"

# What lets a daemon run where it may not set the clock.
WITHOUT_CLOCK = {
    "systemd-timesyncd": ["[Unit]", "ConditionCapability=", "ConditionVirtualization=",
                          "[Service]", "AmbientCapabilities=", "CapabilityBoundingSet="],
    "chrony": ["[Unit]", "ConditionCapability=", "[Service]", "EnvironmentFile=", "Environment=DAEMON_OPTS=-x"],
    "ntpsec": ["[Unit]", "ConditionCapability=",
               "[Service]", "ExecStart=", "ExecStart=/usr/sbin/ntpd -p /run/ntpd.pid -c /etc/ntpsec/ntp.conf -g"],
}
SERVERS_IN_USE = {
    "systemd-timesyncd": "timedatectl show-timesync --property SystemNTPServers",
    "chrony": "chronyc -n sources",
    "ntpsec": "ntpq -np",
}


def in_use(daemon):
    """Waits, as the daemon reads its servers when it comes to it."""
    asked = f"{SERVERS_IN_USE[daemon]} 2>&1 | grep -q -F {SERVER}"
    return f"timeout 20 sh -c 'until {asked}; do sleep 0.2; done' && echo in use"


def where_it_may_not_run(daemon):
    container = frozenset({"container", daemon})
    drop_in = f"/etc/systemd/system/{daemon}.service.d"
    enabled = {f"systemctl is-enabled {daemon}": "enabled\n"}
    return [
        Check(f"{daemon} that may not run is told, and enabled all the same", needs=container,
              do=f"rm -rf {drop_in}; systemctl daemon-reload; systemctl disable --quiet --now {daemon}; "
                 f"TAVISK_LOG=stderr {ONE_LINE}",
              prints="setUsingNetworkTime: On\nNetwork Time: Off\n",
              errors=re.compile(r"tavisk: Network Time: StartUnit on [^\n]* condition [^\n]*\n"),
              then=enabled | {"journalctl -b -t tavisk TAVISK_SETTING='Network Time' -n 1 -o cat":
                              re.compile(r"Network Time: failed, [^\n]*\n")}),
        Check(f"{daemon} is let run without a clock", needs=container,
              do=f"mkdir -p {drop_in}; printf '%s\\n' '" + "' '".join(WITHOUT_CLOCK[daemon]) +
                 f"' >{drop_in}/test.conf; systemctl daemon-reload"),
    ]


def where_it_runs(daemon):
    needs = frozenset({daemon})
    running = f"systemctl is-active {daemon}"
    at_startup = f"systemctl is-enabled {daemon}"
    server = {"tavisk -getnetworktimeserver": f"Network Time Server: {SERVER}\n"}
    return [
        Check(f"{daemon} is started and enabled", needs=needs,
              do=f"systemctl disable --quiet --now {daemon}; {ONE_LINE}",
              prints="setUsingNetworkTime: On\nNetwork Time: On\n", then={running: "active\n", at_startup: "enabled\n"}),
        Check(f"{daemon} is stopped and disabled before the next command", needs=needs,
              do="tavisk -setusingnetworktime off -settime 13:2:3 -getusingnetworktime",
              prints="setUsingNetworkTime: Off\nSet Time: 13:02:03\nNetwork Time: Off\n",
              then={running: "inactive\n", at_startup: "disabled\n"}),
        Check(f"{daemon}'s server is stored while it is off", needs=needs,
              do="tavisk -setnetworktimeserver time.example -getnetworktimeserver",
              prints="setNetworkTimeServer: time.example\nNetwork Time Server: time.example\n",
              then={running: "inactive\n"}),
        Check(f"{daemon} uses a new server at once", needs=needs, kept=True,
              do=f"tavisk -setusingnetworktime on -setnetworktimeserver {SERVER}",
              prints=f"setUsingNetworkTime: On\nsetNetworkTimeServer: {SERVER}\n",
              then=server | {in_use(daemon): "in use\n", running: "active\n", at_startup: "enabled\n"}),
    ]


CHECKS = [check for daemon in WITHOUT_CLOCK for check in where_it_may_not_run(daemon) + where_it_runs(daemon)]
