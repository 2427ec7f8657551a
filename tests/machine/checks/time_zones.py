# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check, WITHOUT_BUS

BUS = frozenset({"bus"})
CONTAINER = frozenset({"container"})
ZONE_LINK = {"readlink -f /etc/localtime": "/usr/share/zoneinfo/Asia/Kolkata\n", "date +%z": "+0530\n"}
WITHOUT_LINK = """(while :; do [ -L /etc/localtime ] || echo absent; done) >/run/absent 2>&1 & watch=$!
for zone in Europe/Paris America/Lima Europe/Paris America/Lima; do tavisk -settimezone $zone; done
kill $watch
cat /run/absent"""
REPORTED = "rm -f /run/report; TAVISK_REPORT=/run/report tavisk {}; cat /run/report"

CHECKS = [
    Check("the zones are those of timedatectl", needs=BUS,
          do="""tavisk -listtimezones | tail -n +2 | cut -c2- | LC_ALL=C sort >/run/zones
                timedatectl list-timezones | LC_ALL=C sort | diff - /run/zones"""),
    Check("/etc/localtime is never absent while zones change", needs=CONTAINER, do=WITHOUT_LINK,
          prints="".join(f"Set TimeZone: {zone}\n" for zone in 2 * ["Europe/Paris", "America/Lima"])),
    Check("a zone is set while the bus is away", needs=CONTAINER,
          do=WITHOUT_BUS.format("tavisk -settimezone Asia/Tokyo -gettimezone"),
          prints="Set TimeZone: Asia/Tokyo\nTime Zone: Asia/Tokyo\n",
          then={"timedatectl show --property Timezone --value": "Asia/Tokyo\n"}),
    Check("a copied zone is known by its rules", needs=CONTAINER,
          do="rm /etc/localtime; cp /usr/share/zoneinfo/Asia/Tokyo /etc/localtime; echo Europe/Paris >/etc/timezone; "
             + REPORTED.format("-gettimezone"),
          prints=re.compile(r'Time Zone: Asia/Tokyo\n(?s:.*)"live":"Asia/Tokyo, by the rules in /etc/localtime",'
                            r'"stored":"Europe/Paris"(?s:.*)'),
          then={"date +%Z": "JST\n"}),
    Check("without /etc/localtime it is UTC, whatever /etc/timezone says", needs=CONTAINER,
          do="rm /etc/localtime; " + REPORTED.format("-gettimezone"),
          prints=re.compile(r'Time Zone: UTC\n(?s:.*)"live":"UTC","stored":"Europe/Paris"(?s:.*)'),
          then={"date +%Z": "UTC\n"}),
    Check("a zone is set", do="tavisk -settimezone Asia/Kolkata -gettimezone",
          prints="Set TimeZone: Asia/Kolkata\nTime Zone: Asia/Kolkata\n", then=ZONE_LINK),
    Check("the zone is the machine's own, and is kept", needs=BUS, kept=True, do="tavisk -gettimezone",
          prints="Time Zone: Asia/Kolkata\n",
          then=ZONE_LINK | {"timedatectl show --property Timezone --value": "Asia/Kolkata\n",
                            "cat /etc/timezone 2>/dev/null || echo none": re.compile("(Asia/Kolkata|none)\n"),
                            "tavisk -gettimezone": "Time Zone: Asia/Kolkata\n"}),
]
