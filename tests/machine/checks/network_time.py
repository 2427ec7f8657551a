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
OTHERS = {
    "systemd-timesyncd": ("/etc/systemd/timesyncd.conf.d/50-test.conf", r"[Time]\nNTP=other.example",
                          "puts aside what is configured elsewhere: other.example"),
    "chrony": ("/etc/chrony/sources.d/50-test.sources", "server other.example", "behind it: .*other.example"),
    "ntpsec": ("/etc/ntpsec/ntp.d/50-test.conf", "server other.example", "behind it: .*other.example"),
}
REPORTED = "rm -f /run/report; TAVISK_REPORT=/run/report tavisk {} >/dev/null; cat /run/report"


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
        Check(f"{daemon} is left alone by what changes nothing", needs=needs,
              do=f"start() {{ systemctl show -P ActiveEnterTimestampMonotonic {daemon}; }}; before=$(start); "
                 + REPORTED.format(f"-setnetworktimeserver {SERVER} -setnetworktimeserver 'two words'") +
                 """ | grep -o -e '"changed":[a-z]*,"values"' -e '"outcome":"[a-z]*"'; sleep 1; """
                 """[ "$before" = "$(start)" ] && echo same start""",
              prints='"changed":false,"values"\n"outcome":"unchanged"\n"outcome":"unchanged"\n'
                     '"changed":false,"values"\n"outcome":"failed"\n"outcome":"unchanged"\nsame start\n'),
        Check(f"{daemon} that runs until the next start only is told, with what to type", needs=needs,
              do=f"systemctl disable --quiet {daemon} 2>&1; TAVISK_LOG=stderr tavisk -setusingnetworktime on",
              prints="Network Time is already on.\n",
              errors=re.compile(rf"tavisk: Network Time At Startup: enable on {daemon}.service: it runs already[^\n]*"
                                r"type 'tavisk -setusingnetworktime off -setusingnetworktime on'\n"),
              then={at_startup: "disabled\n", running: "active\n",
                    "tavisk -setusingnetworktime off -setusingnetworktime on >/dev/null; " + at_startup: "enabled\n"}),
        Check(f"{daemon}'s other servers are told", needs=needs,
              do="printf '{1}\\n' >{0}; {3} | grep -c '{2}'; rm {0}".format(
                  *OTHERS[daemon], REPORTED.format(f"-setnetworktimeserver {SERVER}")),
              prints="1\n", then={in_use(daemon): "in use\n"}),
    ]


# A daemon of our own that keeps no clock, and answers others.
LOCAL_SERVER = """printf '%s\\n' 'local stratum 5' 'port 11123' 'bindaddress 127.0.0.1' 'allow 127.0.0.1' 'cmdport 0' 'bindcmdaddress /' \\
  'pidfile /run/local.pid' 'driftfile /run/local.drift' >/run/local.conf
chronyd -x -u root -f /run/local.conf
echo 'server 127.0.0.1 port 11123 iburst minpoll 0 maxpoll 0' >/etc/chrony/sources.d/local.sources
chronyc reload sources >/dev/null
timeout 30 sh -c 'until chronyc -c sources | grep -q "^^,[*]"; do sleep 0.2; done'
"""
WITHOUT_IT = f"""kill $(cat /run/local.pid); rm /etc/chrony/sources.d/local.sources
tavisk -setnetworktimeserver {SERVER} >/dev/null; chronyc reload sources >/dev/null
"""
OTHER = "192.0.2.98"
FROM_ANOTHER = Check(
    "a server that does not answer is set while another is in use, which is told", needs=frozenset({"container", "chrony"}),
    do=LOCAL_SERVER + "taviskctl status networktime | grep source; "
       f"taviskctl apply -setnetworktimeserver {OTHER}; taviskctl apply -setnetworktimeserver {OTHER} | sed 1d; "
       "journalctl --sync; taviskctl undo --run; " + WITHOUT_IT,
    prints=re.compile(r"  source: 127.0.0.1\n  milliseconds ahead of the source: -?0\.\d\d\d\n"
                      r"Setting +Was +Is +Outcome\n"
                      rf"Network Time Server +{SERVER} +{OTHER} +applied\n(  .*\n)*"
                      rf"Network Time Server +{OTHER} +{OTHER} +unchanged\n(  .*\n)*"
                      r"Setting +Was +Back to +Outcome\n"
                      rf"Network Time Server +{OTHER} +{SERVER} +applied\n(  .*\n)*"))


CHECKS = [check for daemon in WITHOUT_CLOCK for check in where_it_may_not_run(daemon) + where_it_runs(daemon)] + [FROM_ANOTHER]
