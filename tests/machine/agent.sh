#!/bin/sh
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
#
# agent.sh PORT: runs commands that come in over a serial port, one a line in base64; answers each with
# STATUS:OUTPUT:ERRORS, the last two in base64 too.
port=$1
stty -F "$port" raw -echo
exec <>"$port" >&0
echo ready
while read -r line; do
  echo "$line" | base64 -d >/run/agent.command
  sh /run/agent.command >/run/agent.output 2>/run/agent.errors </dev/null
  echo "$?:$(base64 -w 0 /run/agent.output):$(base64 -w 0 /run/agent.errors)"
done
