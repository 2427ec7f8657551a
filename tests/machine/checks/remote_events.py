# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
from check import Check

CONTAINER = frozenset({"container", "iproute2"})
CONFIG = "mkdir -p /etc/tavisk; echo 'remote-events = {}' >/etc/tavisk/services.conf; "
UNIT = "/etc/systemd/system/events.{}"
MAKE_UNITS = f"""printf '[Socket]\\nListenStream=7007\\n[Install]\\nWantedBy=sockets.target\\n' >{UNIT.format('socket')}
printf '[Service]\\nExecStart=sleep infinity\\n' >{UNIT.format('service')}
systemctl daemon-reload
""" + CONFIG.format("events.socket events.service")
STATES = "systemctl is-active events.socket events.service"
LISTENING = "ss -H -l -t -n 'sport = :7007' | wc -l"
SET = "TAVISK_LOG=stderr tavisk -setremotevelmarevents {} -getremotevelmarevents"

CHECKS = [
    Check("remote events are turned off", needs=CONTAINER,
          do=MAKE_UNITS + "systemctl enable --quiet --now events.socket; " + SET.format("off"),
          prints="setremotevelmarevents: Off\nRemote Velmar Events: Off\n", errors="",
          then={STATES: "inactive\ninactive\n", "systemctl is-enabled events.socket": "disabled\n", LISTENING: "0\n"}),
    Check("remote events that are enabled and stopped are neither on nor off already", needs=CONTAINER,
          do="systemctl enable --quiet events.socket; rm -f /run/report; TAVISK_REPORT=/run/report; export TAVISK_REPORT; "
          "tavisk -getremotevelmarevents; " + SET.format("off"),
          prints="Remote Velmar Events: On\nsetremotevelmarevents: Off\nRemote Velmar Events: Off\n", errors="",
          then={"systemctl is-enabled events.socket": "disabled\n",
                "grep -c '\"live\":\"off\",\"stored\":\"on\"' /run/report": "2\n",
                "grep -c '\"where\":\"/etc/systemd/system/sockets.target.wants/events.socket\"' /run/report": "1\n"}),
    Check("remote events are turned on and stay so", needs=CONTAINER, kept=True, do=SET.format("on"),
          prints="setremotevelmarevents: On\nRemote Velmar Events: On\n", errors="",
          then={"systemctl is-active events.socket": "active\n", "systemctl is-enabled events.socket": "enabled\n",
                LISTENING: "1\n", "tavisk -getremotevelmarevents": "Remote Velmar Events: On\n"}),
]
