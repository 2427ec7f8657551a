// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
//
// Lets the first serial port of the emulator's board wake the machine.
DefinitionBlock ("", "SSDT", 2, "TAVISK", "WAKE", 1)
{
    External (\_SB.PCI0.SF8.COM1, DeviceObj)
    Scope (\_SB.PCI0.SF8.COM1)
    {
        Name (_PRW, Package () { 0x08, 3 })
    }
}
