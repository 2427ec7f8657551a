# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Lines edited at the prompt of a terminal: keys, history, completion, and what happens meanwhile."""

import os
import re
import sys
import termios
import unittest

from machine import ScratchMachine, program_and_arguments
from terminal import Terminal, stop_without_terminals

FOLDER = "/System/Library/CoreServices"
UP, LEFT, HOME = "\x1b[A", "\x1b[D", "\x01"
ENDED = "\r\n> "


class Prompt(unittest.TestCase):
    def setUp(self):
        zones = ["Europe/Madrid", "Europe/Malta", "Asia/Tokyo", "UTC"]
        clock = {"Time": 1173258303, "Known Time Zones": zones}
        self.machine = ScratchMachine(PROGRAM, {"Clock": clock, "Remote Shell": {"Enabled": True}})
        self.addCleanup(self.machine.__exit__)

    def start(self, words=(), **environment):
        terminal = Terminal(self.machine, words, **environment)
        self.addCleanup(terminal.close)
        return terminal


class AtThePrompt(Prompt):
    def setUp(self):
        super().setUp()
        self.terminal = self.start(TERM="xterm")
        self.terminal.wait_for("help.\r\n")
        self.terminal.wait_for("> ")

    def answer(self, keys):
        """What a line is answered, from the end of the line to the next prompt."""
        self.terminal.type_by_hand(keys + "\n")
        self.terminal.wait_for("\r\n")
        return self.terminal.wait_for("> ").removesuffix("> ").removesuffix("\n")

    def exchange(self, *typed_and_shown):
        for typed, shown in typed_and_shown:
            with self.subTest(typed):
                self.terminal.type_by_hand(typed)
                self.terminal.wait_for(shown)

    def status(self):
        status = self.terminal.status()
        self.assertEqual(termios.tcgetattr(self.terminal.other_end), self.terminal.modes)
        return status

    def test_keys(self):
        date = "Date: 3/7/2007"
        for keys, expected in (
            ("-getdate", date),
            ("getdxre" + LEFT + "\x7f" * 2 + "at", date),
            ("xgetdate" + HOME + "\x1b[3~", date),  # the key Delete
            ("te" + HOME + "getda", date),
            ("get date\x17date" + HOME + "\x04" * 3 + "get", "Error: get is not a valid command"),
            ("nothing at all\x15getdate", date),
            ("-setcomputername Zo\u00eb\u65e5\u672c\x7f", "setcomputername: Zo\u00eb\u65e5"),
            ("\udcff\udcc3(", "Error: \udcff\udcc3( is not a valid command"),
            ("   ", "Error, buffer == NULL"),
            ("", ""),
        ):
            with self.subTest(keys):
                self.assertEqual(self.answer(keys), expected)

    def test_history_has_commands_and_no_answers(self):
        self.answer("getdate")
        self.exchange(("setremotelogin off\n", "(yes/no)? "), ("perhaps\n", "(yes/no)? "), ("NO\n", ENDED))
        self.answer("  ")
        self.assertEqual(self.answer(UP * 2), "Date: 3/7/2007")
        self.exchange((UP * 2 + "\n", "(yes/no)? "), ("yes\n", ENDED))
        self.assertFalse(self.machine.read()["Remote Shell"]["Enabled"])

    def test_lines_typed_ahead_of_a_question_answer_it(self):
        self.terminal.type("setremotelogin off\nyes\ngetremotelogin\nquit\nfor the shell\n")
        self.terminal.wait_for("Remote Login: Off\r\n> ")
        self.assertEqual(self.status(), 0)
        self.assertEqual(os.read(self.terminal.other_end, 80), b"for the shell\n")

    def test_tab_completes_words_and_values(self):
        self.exchange(*((keys + "\n", "\r\n" + expected + ENDED) for keys, expected in (
            ("GETDA\t", "Date: 3/7/2007"),
            ("-printc\t\x15-versi\t", "tavisk, Version 1.4a1\r\nCopyright 2026 The tavisk developers"),
            ("-setwakeonmodem of\t-gettimez\t", "Time Zone: UTC"),
            ("gettimezone qui\t", "Time Zone: UTC\r\nError: qui is not a valid command"),
            ("settimezone as\t\t", "Set TimeZone: Asia/Tokyo"),
            ("setkernelbootarchi\tx8\t", "setting kernel architecture to: x86_64\r\nchanges to kernel architecture have been saved."),
            ("setdate -gettimez\t", "setdate: Error: -gettimez is invalid date format... use mm:dd:yy"),
            ("-bogus getda\t", "Error: -bogus is not a valid command"),
        )))

    def test_a_pasted_tab_is_a_part_of_the_word(self):
        for line, answer in (("GETDA\t", "Error: GETDA\t is not a valid command"),
                             ("settimezone as\t", "as\t is not a valid timezone. The command "
                              "'listtimezones' will show a list of valid time zones.")):
            self.terminal.type(line + "\n")
            self.terminal.wait_for("\r\n")
            self.assertEqual(self.terminal.wait_for("\r\n> ").removesuffix("\n> "), answer)
        self.assertNotIn("Time Zone", self.machine.read()["Clock"])

    def test_tab_lists_what_it_cannot_choose_among(self):
        self.exchange(("settimezone \t", "\r\nAsia/  Europe/  UTC\r\n"), ("", "> settimezone "),
                      ("europe/\t\t", "\r\nEurope/Madrid  Europe/Malta\r\n"), ("", "> settimezone Europe/Ma"))
        self.assertEqual(self.answer("lt\t"), "Set TimeZone: Europe/Malta")

    def test_tab_knows_the_startup_disks_that_a_command_found_and_looks_for_none(self):
        disks = {f"disk{number}s1": {"Volume Name": name, "Mount Point": f"/Volumes/{name}"}
                 for number, name in enumerate(("Main", "Two Words"))}
        self.machine.change({"Disks": disks})
        main = f"/Volumes/Main{FOLDER}"
        self.machine.file(f"{main}/boot.efi")
        self.machine.file(f"{main}/mach_kernel")
        chosen = f"\r\nSet Startup Disk to Path: {main}{ENDED}"
        self.exchange(("setstartupdisk m\t\n", f"\r\nNot a System Folder: /Volumes/m{FOLDER}{ENDED}"),
                      ("setstartupdisk m\t\n", chosen), (f"setstartupdisk {main[:10]}\t\n", chosen))

    def test_a_failure_meanwhile_is_told_below_the_line(self):
        self.answer("liststartupdisks")
        self.exchange(("getd", "getd"))
        self.machine.plist.write_bytes(b"<plist>")
        self.terminal.wait_for("\r\ntavisk: ")
        self.terminal.wait_for("\r\n> getd")
        self.machine.plist.unlink()
        self.assertRegex(self.answer("ate"), "^Date: ")

    def test_lines_of_any_length_come_in_the_same_pieces_as_from_a_pipe(self):
        line = "x" * 2050 + " getdate " + "y" * 3000 + "\n"
        expected, _, _ = self.machine.run([], line.encode())
        self.terminal.type(line + "\x04")
        shown = self.terminal.wait_for("NULL.\r\n")
        self.assertEqual(shown[shown.index("Error: x"):], expected[expected.index(b"Error: x"):].decode())
        self.assertEqual(self.status(), 0)

    def test_the_end_of_the_input_and_the_key_for_it(self):
        self.assertEqual(self.answer("xgetdate" + HOME + "\x04"), "Date: 3/7/2007")
        self.terminal.type("\x04")
        self.assertEqual(self.terminal.wait_for("\r\n"), "Error: fgets returned NULL.\n")
        self.assertEqual(self.status(), 0)

    def test_control_c_ends_the_session_and_gives_the_terminal_back(self):
        self.answer("settime 99")
        self.terminal.type("getdate\x03")
        self.assertEqual(self.status(), 1)
        self.assertEqual(self.machine.read()["Authorization"]["Deauthentications"], 1)

    def test_a_resized_screen_and_a_stop_leave_the_line_as_it_is(self):
        self.exchange(("getd", "getd"))
        self.terminal.resize(10, 40)
        self.terminal.wait_for("\r> getd")
        self.terminal.type("\x1aate\n")  # nobody could continue this process: the system does not stop it
        self.terminal.wait_for("\r\nDate: 3/7/2007" + ENDED)


class WithoutEditing(Prompt):
    def test_a_terminal_that_cannot_do_it_and_a_system_without_the_library(self):
        self.machine.file("/lib/libedit.so.2")
        without = {"TERM": "xterm", "LD_LIBRARY_PATH": f"{self.machine.directory}/root/lib"}
        for environment in ({"TERM": "dumb"}, without):
            with self.subTest(**environment):
                terminal = self.start(**environment)
                terminal.wait_for("\r\n> tavisk\r\n> type -help for help.\r\n> ")
                terminal.type("getdate\tx\n")
                terminal.wait_for("\r\nError: getdate\tx is not a valid command\r\n> ")
                terminal.type("\x03")
                self.assertEqual(terminal.status(), 0)

    def test_volumes_come_change_and_go_at_their_lines(self):
        def volume(name):
            return {"Volume Name": name, "Mount Point": f"/Volumes/{name}"}

        def listed():
            terminal.type("-liststartupdisks\n")
            return re.findall(f"/Volumes/(.*){FOLDER}", terminal.wait_for("\r\n> "))

        for name in ("Main", "Backup"):
            self.machine.file(f"/Volumes/{name}{FOLDER}/boot.efi")
            self.machine.file(f"/Volumes/{name}/mach_kernel")
        self.machine.change({"Disks": {"disk0s1": volume("Main")}})
        terminal = self.start(TERM="dumb")
        terminal.wait_for("help.\r\n> ")
        self.assertEqual(listed(), ["Main"])
        both = ["Main", "Backup"]
        self.machine.change({"Disks": {"disk1s1": volume("Backup")}})
        self.assertEqual([listed() for _ in range(3)], [["Main"], ["Main"], both])
        for changes, left in (({"disk0s1": {"Kind": "hfs"}}, both), ({"disk0s1": {"Size": 5}}, ["Backup"]),
                              ({"disk0s1": {"Mount Point": "/Volumes/Backup"}, "disk1s1": None}, ["Backup"])):
            self.machine.change({"Disks": changes})
            self.assertEqual([listed() for _ in range(3)][2], left, changes)
        self.machine.plist.write_bytes(b"<plist><dict><key>Disks</key><dict>")
        self.assertEqual([listed() for _ in range(3)], [["Backup"]] * 3)
        self.assertEqual(len(self.machine.effects()), 1)

    def test_a_failure_and_names_that_are_misspelt_are_told_in_one_line_each(self):
        self.machine.change({"Refusals": {"Time": "sealed\x85 off", "\x85": ""}, "Clock": {"time zone": "UTC"}})
        shown = self.start(["-settime", "1:2:3"]).wait_for("Set Time: 01:02:03\r\n")
        self.assertRegex(shown, rf"^tavisk: rehearsing on {self.machine.directory}\ntavisk: machine\.plist has [^\n]*: "
                         r'"Clock" "time zone" \(is "Time Zone" meant\?\), "Refusals" "\\u\{0085}" \(no setting is called so\)\n'
                         r"tavisk: Time: .*sealed\\u\{0085} off\n")


if __name__ == "__main__":
    stop_without_terminals()
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])
