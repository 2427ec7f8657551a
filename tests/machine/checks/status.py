# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

BUS = frozenset({"bus"})
GETTERS = ("-gettimezone -getusingnetworktime -getnetworktimeserver -getcomputersleep -getdisplaysleep -getharddisksleep "
           "-getwakeonmodem -getwakeonnetworkaccess -getrestartpowerfailure -getrestartfreeze "
           "-getallowpowerbuttontosleepcomputer -getwaitforstartupafterpowerfailure -getremotelogin -getremotevelmarevents "
           "-getcomputername -getlocalsubnetname -getkernelbootarchitecturesetting "
           "-getdisablekeyboardwhenenclosurelockisengaged")
# What the getters report and the status does not have, and how much they report.
DIFFERENCES = r"""rm -f /run/getters
TAVISK_REPORT=/run/getters tavisk GETTERS >/dev/null
taviskctl status --json >/run/status
sed 's/,"effects":.*//' /run/getters | grep -o '{"setting":[^}]*}' |
  sed -e 's/{"setting":\("[^"]*"\)\(,"unit":"[^"]*"\)*,"supported":false.*/\1:{"supported":false/' \
      -e 's/{"setting":\("[^"]*"\)\(.*\)}/\1:{"supported":true\2/' >/run/told
while read -r told; do grep -q -F "$told" /run/status || echo "$told"; done </run/told
echo "$(wc -l </run/told) told"
""".replace("GETTERS", GETTERS)

CHECKS = [
    Check("the status is what the getters report", needs=BUS, do=DIFFERENCES, prints=re.compile(r"(1[89]|2\d) told\n")),
    Check("the status tells where a value is kept and what undoes it", needs=BUS,
          do="mkdir /etc/cloud; touch /etc/cloud/cloud.cfg /usr/bin/cloud-init; taviskctl status localsubnetname; "
             "rm -r /etc/cloud /usr/bin/cloud-init",
          prints=re.compile(r"Setting .*\nLocal Subnet Name .* /etc/hostname\n  may be undone by cloud-init.*\n")),
    Check("who is nobody may look too", needs=BUS,
          do="setpriv --reuid nobody --regid nogroup --clear-groups taviskctl status timezone remotelogin",
          prints=re.compile(r"Setting .*\nTime Zone .* /etc/localtime\nRemote Login .*\n", re.DOTALL)),
]
