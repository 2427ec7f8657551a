#!/bin/sh
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
#
# in-time.sh COMMAND [ARGUMENT ...]: runs the program, and again where it says itself that something was not looked at in
# time: an emulated machine is slow. Only the last run counts; its report goes on to descriptor 9, if there is one.
for _ in 1 2 3 4 5 6 7 8 9 10 11 12; do
  rm -f /run/look
  TAVISK_REPORT=/run/look "$@" >/run/said 2>/run/complaint
  status=$?
  grep -q 'not done in time' /run/look || break
done
if [ -e /proc/self/fd/9 ]; then cat /run/look >&9; fi
cat /run/complaint >&2
cat /run/said
exit "$status"
