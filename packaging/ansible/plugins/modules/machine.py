#!/usr/bin/python
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Gives a server the settings that are wanted, by one run of its taviskctl."""

DOCUMENTATION = r"""
module: machine
short_description: Read and change the system settings of a server
version_added: 1.4.0
description:
  - Gives a server the wanted values of its clock, names, network time, sleep, wake, restart, remote login and startup disk,
    for now and for the time after its next restart.
  - All is done by one run of C(taviskctl) on that server, which looks at each setting first and changes only those that differ,
    in an order that works.
  - The task fails when a setting was refused, is not supported, has failed or will not last over a restart, and says why of
    each; the others are done all the same.
author:
  - The tavisk developers (@tavisk)
extends_documentation_fragment:
  - ansible.builtin.action_common_attributes
attributes:
  check_mode:
    support: full
    details:
      - C(taviskctl rehearse) asks the server what it would refuse, does the rest on a copy of it in files, and leaves it alone.
      - What only shows when a change is really made, such as a full disk, is not foretold.
  diff_mode:
    support: full
    details:
      - Shows each setting that changes, with its value before and after.
  platform:
    platforms: debian
requirements:
  - the Debian package C(tavisk) on the server
options:
  settings:
    description:
      - Settings and the values that they are to have.
      - The names are those that C(taviskctl status) shows, or what follows C(get) in the words of C(tavisk); case, blanks,
        hyphens and underscores do not count.
      - Switches take C(true) and C(false), or C(on) and C(off), which are the same to Ansible without quotes and to the server
        with them.
      - The sleep timers take minutes or C(never), C(Startup Delay) a number of seconds from C(0) to C(7650) that is divisible by
        30, the other settings a text.
      - C(Time) takes a text such as C("2026-11-22 16:30:00"), in quotes; it is set again by each run, as the clock goes on.
      - A setting may also have what C(gather) told of it, and all of them what it told of another server.
    type: dict
  skip_unsupported:
    description:
      - Leave out what this server cannot have, instead of failing for it.
    type: bool
    default: false
  allow_lockout:
    description:
      - Turn C(Remote Login) off when that is wanted.
      - Without it the task fails then, and nothing at all is changed, unless it is off already.
    type: bool
    default: false
  gather:
    description:
      - Return all settings as facts, as they are at the end of the task, but for the startup disk.
      - Only this is done when C(settings) is not given. No rights are needed for it; who may not read something is warned.
    type: bool
    default: false
notes:
  - Changes need root, or a user in the server's group C(admin).
  - C(taviskctl undo) on the server shows what the last run has changed, and takes it back.
"""

EXAMPLES = r"""
- name: A server that never sleeps and comes back after a power failure
  tavisk.settings.machine:
    settings:
      Time Zone: Europe/Paris
      Computer Sleep: never
      Display Sleep: 10
      Restart After Power Failure: true
    skip_unsupported: true
  become: true

- name: What the settings are
  tavisk.settings.machine:
    gather: true

- name: Complain of a clock that is not synchronised
  ansible.builtin.assert:
    that: ansible_facts.tavisk.settings['Network Time'].facts.synchronized == 'yes'

- name: The same sleep timers as web-1
  tavisk.settings.machine:
    settings:
      Computer Sleep: "{{ hostvars['web-1'].ansible_facts.tavisk.settings['Computer Sleep'] }}"
      Display Sleep: "{{ hostvars['web-1'].ansible_facts.tavisk.settings['Display Sleep'] }}"
  become: true
"""

RETURN = r"""
settings:
  description:
    - What became of each setting, or would become of it, in the order in which they come.
    - Members that do not apply or are not known are left out.
  returned: when settings were wanted
  type: list
  elements: dict
  contains:
    setting:
      description: Its name.
      type: str
      sample: Time Zone
    before:
      description: The value in force before, or stored where there is no other.
      type: str
      sample: Etc/UTC
    stored_before:
      description: The value that was stored before, where another one was in force.
      type: str
      sample: Europe/Rome
    after:
      description: The same afterwards.
      type: str
      sample: Europe/Paris
    stored:
      description: The value after the next restart.
      type: str
      sample: Europe/Paris
    unit:
      description: Of these values, where they are numbers.
      type: str
      sample: minutes
    wanted:
      description: The value that was asked for; not in check mode.
      type: str
      sample: Europe/Paris
    where:
      description: The places in which it would be kept; in check mode only.
      type: str
      sample: /etc/localtime
    outcome:
      description: One of unchanged, applied, not supported, failed, refused.
      type: str
      sample: applied
    reason:
      description: Of an outcome that is neither unchanged nor applied.
      type: str
      sample: "set on the rehearsed machine: it cannot have this setting"
    changed:
      description: Whether the server differs from before, in whole or in part.
      type: bool
      sample: true
    lasts:
      description: Whether it will be so after a restart.
      type: bool
      sample: true
    undone_by:
      description: What else on the server may undo it.
      type: str
      sample: cloud-init
    note:
      description: What else is to be known.
      type: str
ansible_facts:
  description: What the server says of itself.
  returned: with gather
  type: dict
  contains:
    tavisk:
      description: What C(taviskctl status --json) prints; its manual page describes it.
      type: dict
      sample: {"status": 1, "settings": {"Display Sleep": {"supported": true, "live": "10", "stored": "10", "unit": "minutes"}}}
"""

import json

from ansible.module_utils.basic import AnsibleModule

ARGUMENTS = {
    "settings": {"type": "dict"},
    "skip_unsupported": {"type": "bool", "default": False},
    "allow_lockout": {"type": "bool", "default": False},
    "gather": {"type": "bool", "default": False},
}
# What a rehearsal calls otherwise, and what no variable is called.
NAMES = {"now": "before", "storedNow": "stored_before", "storedBefore": "stored_before", "then": "after",
         "undoneBy": "undone_by"}
FROM_INPUT = ("--from", "-")


class Unanswered(Exception):
    """Why taviskctl has told nothing, and the status with which it ended, if it ran."""

    def __init__(self, why, status=None):
        super().__init__(why)
        self.told = {} if status is None else {"rc": status}


def ask(module, words, typed=None):
    """Runs taviskctl, and returns its status and the object that it prints."""
    program = module.get_bin_path("taviskctl", opt_dirs=["/usr/local/bin"])
    if not program:
        raise Unanswered("taviskctl is not installed on this server; it is in the Debian package tavisk")
    status, output, errors = module.run_command([program, *words], data=typed)
    complaint = errors.strip()
    try:
        answer = json.loads(output)
    except ValueError:
        raise Unanswered(complaint or f"taviskctl ended with status {status} and told nothing", status) from None
    for line in complaint.splitlines():
        module.warn(line)
    return status, answer


def told(answer):
    return [{NAMES.get(name, name): value for name, value in setting.items()} for setting in answer["settings"]]


def run(module, command, wanted):
    """What came of each setting, and why that is not all, by taviskctl apply or rehearse."""
    options = [option for option in ("skip_unsupported", "allow_lockout") if module.params[option]]
    words = [command, *("--" + option.replace("_", "-") for option in options), "--json", *FROM_INPUT]
    status, answer = ask(module, words, wanted)
    settings = told(answer)
    return settings, faults(module, settings) or ["not everything was done"] * bool(status)


def faults(module, settings):
    texts = [fault(setting, module.params["skip_unsupported"]) for setting in settings]
    return [text for text in texts if text]


def fault(setting, is_unsupported_skipped):
    """Why this setting makes the task fail, if it does."""
    outcome = setting["outcome"]
    if outcome == "not supported" and is_unsupported_skipped:
        return None
    if outcome not in ("unchanged", "applied"):
        return f"{setting['setting']}: {outcome}: {setting.get('reason', 'no reason is known')}"
    if setting["lasts"]:
        return None
    later = f"may be undone by {setting['undone_by']}" if "undone_by" in setting else f"it will be {setting.get('stored')}"
    return f"{setting['setting']}: does not last over a restart: {later}"


def shown(setting, value, stored):
    """Both for people, the second one where it differs."""
    unit = " " + setting["unit"] if "unit" in setting else ""
    text = value and value + unit
    return text if stored in (None, value) else f"{text}, after a restart {stored}{unit}"


def difference(settings):
    changed = [setting for setting in settings if setting["changed"]]
    return {value: {setting["setting"]: shown(setting, setting.get(value), setting.get(stored)) for setting in changed}
            for value, stored in (("before", "stored_before"), ("after", "stored"))}


def change(module):
    """What was done, as a part of the result, and why that is not all."""
    wanted = json.dumps(module.params["settings"])
    settings, problems = run(module, "rehearse" if module.check_mode else "apply", wanted)
    result = {"settings": settings, "changed": any(setting["changed"] for setting in settings)}
    if module._diff:
        result["diff"] = difference(settings)
    return result, problems


def described(failure):
    return " on ".join(failure[part] for part in ("tried", "on") if part in failure) + ": " + failure.get("why", "")


def gathered(module):
    """As facts; what could not be read is warned of."""
    facts = ask(module, ["status", "--json"])[1]
    for name, setting in facts["settings"].items():
        for failure in setting.get("failures", []):
            module.warn(f"{name}: {described(failure)}")
    return {"ansible_facts": {"tavisk": facts}}


def main():
    module = AnsibleModule(argument_spec=ARGUMENTS, supports_check_mode=True)
    wants_change = module.params["settings"] is not None
    if not wants_change and not module.params["gather"]:
        module.fail_json(msg="nothing is asked for: give settings, or gather: true")
    result, problems = {} if wants_change else {"changed": False}, []
    try:
        if wants_change:
            result, problems = change(module)
        if module.params["gather"]:
            result.update(gathered(module))
    except Unanswered as failure:
        result.update(failure.told)
        problems.append(str(failure))
    if problems:
        module.fail_json(msg="; ".join(problems), **result)
    module.exit_json(**result)


if __name__ == "__main__":
    main()
