# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CHECKS = [
    Check("the installed program starts", do="tavisk -getdate", prints=re.compile(r"Date: \d+/\d+/\d{4}\n"),
          then={"test -x /usr/sbin/tavisk && echo yes": "yes\n"}),
    Check("the package's own test passes", do="/root/smoke-test", prints="the installed tavisk works\n",
          needs=frozenset({"bus"})),
]
