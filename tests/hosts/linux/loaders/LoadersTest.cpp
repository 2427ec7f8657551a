// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/loaders/GrubFiles.h"
#include "hosts/linux/loaders/LoaderTexts.h"

namespace tavisk {
namespace {

using ::testing::HasSubstr;

std::string fedoraStub(const std::string& uuid) {
  return "search --no-floppy --root-dev-only --fs-uuid --set=dev " + uuid +
         "\nset prefix=($dev)/grub2\nexport $prefix\nconfigfile $prefix/grub.cfg\n";
}

const std::string fedoraId = "4098b3f648d74c13b1f04ccfba7798e8-";

/// Fedora with its kernels as entries of the boot partition.
LoaderFiles fedoraWith(const std::string& variables, const LoaderFiles& more = {}) {
  const auto& id = fedoraId;
  const auto conf = [](const std::string& root) {
    return "title Fedora\nversion 6\nlinux /vmlinuz\ninitrd /i $tuned_initrd\noptions " + root + " $tuned_params\n";
  };
  return with(
      {{"sda1:/EFI/fedora/shimx64.efi", shimProgram()},
       {"sda1:/EFI/fedora/grubx64.efi", grubProgram("/EFI/fedora")},
       {"sda1:/EFI/fedora/grub.cfg", fedoraStub("b007")},
       {"sda5:/grub2/grubenv", block(variables)},
       {"sda5:/loader/entries/" + id + "6.9.9-100.fc40.x86_64.conf", conf("root=UUID=aaaa ro")},
       {"sda5:/loader/entries/" + id + "6.10.3-200.fc40.x86_64.conf", conf("$kernelopts")},
       {"sda5:/loader/entries/" + id + "0-rescue.conf", conf("root=UUID=cccc ro")},
       {"sda5:/grub2/grub.cfg",
        "set pager=1\nif [ -f ${config_directory}/grubenv ]; then\n  load_env -f ${config_directory}/grubenv\n"
        "elif [ -s $prefix/grubenv ]; then\n  load_env\nfi\nif [ \"${next_entry}\" ] ; then\n"
        "  set default=\"${next_entry}\"\n  set next_entry=\n  save_env next_entry\nelse\n"
        "  set default=\"${saved_entry}\"\nfi\ninsmod xfs\nsearch --no-floppy --fs-uuid --set=root b007\n"
        "insmod xfs\nsearch --no-floppy --fs-uuid --set=boot b007\n"
        "if [ -z \"${kernelopts}\" ]; then\n  set kernelopts=\"root=UUID=bbbb ro \"\nfi\ninsmod blscfg\nblscfg\n"
        "if [ \"${boot_success}\" = \"1\" -o \"${boot_indeterminate}\" = \"1\" ]; then set menu_hide_ok=1; fi\n"}},
      more);
}

const std::string ubuntuEntry = contentsOf(TAVISK_RECORDINGS "/loaders/recordings/ubuntu-cloud.entry.cfg");

constexpr const char* fedora = "sda1:\\EFI\\fedora\\shimx64.efi";
struct Layout {
  const char* description;
  const char* loader;  ///< what firmware starts, or the folder of a menu
  LoaderFiles files;
  std::string expected;  ///< a part of the summary
  std::string options = {};
  LoaderVariables variables = {};
};

void expectAll(const std::vector<Layout>& layouts) {
  for (const auto& [description, loader, files, expected, options, variables] : layouts) {
    const LoaderMachine machine(files);
    EXPECT_THAT(summaryOf(machine.read(loader, options, variables)), HasSubstr(expected)) << description;
  }
}

TEST(LoadersTest, FollowsGrubAsInstallersLeaveIt) {
  const auto both = menu("0", first + advanced(entry("old", "aaaa", "UUID=aaaa single")) + second);
  const auto plain = [&](const std::string& program) { return LoaderFiles{{debianEfi, program}, {menuCfg, both}}; };
  const std::string found = "next=sda2 lasting=sda2 once= starts=sda2 sda2 sdb2 ";
  const auto onLvm = menu("0", entry("u", "b007", "/dev/mapper/vg-root", "/vmlinuz"));
  expectAll({
      {"Debian, signed", "sda1:\\EFI\\debian\\shimx64.efi",
       grubWith(both, {{"sda1:/EFI/debian/shimx64.efi", shimProgram()}, {menuEnv, block("")}}),
       found + "keeps=sda2:/boot/grub/grubenv"},
      {"Debian, signed, in another folder",
       "sda1:\\EFI\\here\\grubx64.efi",
       {{"sda1:/EFI/here/grubx64.efi", debianGrub()}, {"sda1:/EFI/here/grub.cfg", stub("aaaa")}, {menuCfg, both}},
       found},
      {"Debian, signed, in a folder of its own beside the usual one", "sda1:\\EFI\\here\\grubx64.efi",
       grubWith(both, {{"sda1:/EFI/here/grubx64.efi", debianGrub()}, {"sda1:/EFI/here/grub.cfg", stub("cccc")}}),
       found},
      {"removable, on a disk of its own",
       "sdb1:\\EFI\\BOOT\\BOOTX64.EFI",
       {{"sdb1:/EFI/BOOT/BOOTX64.EFI", shimProgram()},
        {"sdb1:/EFI/BOOT/grubx64.efi", debianGrub()},
        {"sdb1:/EFI/debian/grub.cfg", stub("aaaa")},
        {menuCfg, both}},
       found},
      {"unsigned, a partition of the same disk", debian, plain(grubProgram("(,gpt2)/boot/grub")), found},
      {"unsigned, the words built in", debian,
       plain(grubProgram("/boot/grub", "search.fs_uuid aaaa root hd0,gpt2 \nset prefix=($root)'/boot/grub'\n")), found},
      {"a disk by its number", debian, plain(grubProgram("(hd0,gpt2)/boot/grub")), "change from start to start"},
      {"everything in memory", debian, plain(grubProgram("(memdisk)/boot/grub")), "GRUB's device memdisk"},
      {"another maker's image with a disk in it", debian,
       plain(grubProgram("/EFI/debian", "normal (memdisk)/grub.cfg")), "GRUB's device memdisk"},
      {"Ubuntu with a separate /boot on LVM",
       debian,
       {{debianEfi, debianGrub()},
        {debianCfg, stub("b007", "/grub")},
        {"sda5:/grub/grub.cfg", onLvm},
        {"dm-0:/etc/fstab", "/dev/disk/by-id/dm-uuid-LVM-aB12 / xfs defaults 0 1\nUUID=b007 /boot x\n"}},
       "next=dm-0 "},
      {"LVM, and nothing there says that it is the one",
       debian,
       {{debianEfi, debianGrub()}, {debianCfg, stub("b007", "/grub")}, {"sda5:/grub/grub.cfg", onLvm}},
       "does not name this volume as \"/\""},
      {"LVM, of a system with another /boot",
       debian,
       {{debianEfi, debianGrub()},
        {debianCfg, stub("b007", "/grub")},
        {"sda5:/grub/grub.cfg", onLvm},
        {"dm-0:/etc/fstab", "UUID=ffff / xfs defaults 0 1\nUUID=aaaa /boot/ ext4 defaults 0 2\n"}},
       "does not name the volume that the kernel"},
      {"LVM, of a system without a separate /boot",
       debian,
       {{debianEfi, debianGrub()},
        {debianCfg, stub("b007", "/grub")},
        {"sda5:/grub/grub.cfg", onLvm},
        {"dm-0:/etc/fstab", "UUID=ffff / xfs defaults 0 1\n"}},
       "does not name the volume that the kernel"},
      {"Arch, /boot is the partition of the loader",
       debian,
       {{debianEfi, grubProgram("(,gpt1)/grub")},
        {"sda1:/grub/grub.cfg", menu("0", entry("arch", "AAAA-0001", "UUID=aaaa", "/vmlinuz"))}},
       "next=sda2 "},
      {"openSUSE on ext4",
       debian,
       {{debianEfi, grubProgram("/EFI/debian")},
        {debianCfg,
         "set btrfs_relative_path=\"yes\"\nsearch --fs-uuid --set=root aaaa\n"
         "set prefix=(${root})/boot/grub2\nsource \"${prefix}/grub.cfg\"\n"},
        {"sda2:/boot/grub2/grub.cfg", both}},
       found},
      {"openSUSE on btrfs",
       debian,
       {{debianEfi, grubProgram("/EFI/debian")},
        {debianCfg,
         "set btrfs_relative_path=\"yes\"\nsearch --fs-uuid --set=root dddd\n"
         "set prefix=(${root})/boot/grub2\nsource \"${prefix}/grub.cfg\"\n"},
        {"sdb3:/boot/grub2/grub.cfg", both}},
       "hang on the default subvolume"},
      {"Ubuntu's images for clouds", debian, grubWith(menu("0", ubuntuEntry), {{menuEnv, block("initrdfail=\n")}}),
       "next=sda3 "},
      {"a subvolume", debian,
       grubWith(menu("0", entry("b", "dddd", "UUID=dddd rootflags=subvol=@", "/@/boot/vmlinuz"))), "next=sdb3/@ "},
      {"Fedora", fedora, fedoraWith(""),
       "next=sda3 lasting=sda3 once= starts=sda3 sda2 sdb2 keeps=sda5:/grub2/grubenv"},
      {"Fedora, options in the environment", fedora, fedoraWith("kernelopts=root=UUID=cccc ro\n"), "next=sdb2 "},
      {"Fedora, an entry is saved", fedora,
       fedoraWith("saved_entry=4098b3f648d74c13b1f04ccfba7798e8-6.9.9-100.fc40.x86_64\n"), "next=sda2 "},
      {"Fedora, once", fedora, fedoraWith("next_entry=4098b3f648d74c13b1f04ccfba7798e8-0-rescue\n"),
       "next=sdb2 lasting=sda3 once=4098"},
      {"Fedora, an older package and an entry without a kernel", fedora,
       fedoraWith("", {{"sda5:/loader/entries/" + fedoraId + "6.10.3~rc1-200.fc40.x86_64.conf",
                        "linux /vmlinuz\noptions root=UUID=cccc\n"},
                       {"sda5:/loader/entries/" + fedoraId + "7.conf", "efi /vmlinuz\n"}}),
       "next=sda3 lasting=sda3 once= starts=sda3 sdb2 sda2 sdb2 "},
      {"without UEFI", "sda2:/boot/grub", {{menuCfg, both}}, found},
      {"without UEFI and menu", "sda3:/boot/grub", {{menuCfg, both}}, "there is no grub.cfg"},
  });
}

TEST(LoadersTest, FollowsTheMenusOfGrub) {
  const auto chosen = [](const std::string& name, const std::string& variables = "") {
    const auto entries = first + advanced(entry("old", "bbbb", "LABEL=L-bbbb")) + second;
    return grubWith(menu(name, entries), {{menuEnv, block(variables)}});
  };
  const auto started = [](const std::string& entries) { return grubWith(menu("0", entries)); };
  expectAll({
      {"by number", debian, chosen("2"), "next=sdb2 lasting=sdb2 "},
      {"by title", debian, chosen("Title of osprober-gnulinux-simple-cccc"), "next=sdb2 "},
      {"in a submenu", debian, chosen("advanced>old"), "next=sda3 "},
      {"saved", debian, chosen("${saved_entry}", "saved_entry=advanced>old\n"),
       "next=sda3 lasting=sda3 once= starts=sda2 sda3 sdb2 "},
      {"once", debian, chosen("0", "next_entry=2\n"), "next=sdb2 lasting=sda2 once=2 "},
      {"an entry that reads the environment", debian,
       grubWith("menuentry x {\nload_env -f ($root)/env root_uuid\nsearch.fs_uuid $root_uuid root\n"
                "linux /boot/vmlinuz root=UUID=$root_uuid\n}\n",
                {{"sda2:/env", block("root_uuid=bbbb\n")}}),
       "next=sda3 "},
      {"options in front of a title", debian,
       grubWith("set default=y\n" + first + "menuentry --unrestricted --id=y --class x 'y z' {\n" +
                "search.fs_uuid bbbb root\nlinux /boot/vmlinuz root=UUID=bbbb\n}\n"),
       "next=sda3 "},
      {"a menu after a menu", debian,
       grubWith(second + "configfile $prefix/x.cfg\n", {{"sda2:/boot/grub/x.cfg", first}}),
       "next=sda2 lasting=sda2 once= starts=sda2 "},
      {"once, in the way of old", debian, chosen("${saved_entry}", "saved_entry=2\nprev_saved_entry=0\n"),
       "next=sdb2 lasting=sda2 "},
      {"a system that is named by its disk", debian, started(entry("b", "bbbb", "/dev/sda3") + second),
       "change from start to start"},
      {"that one after another", debian, started(first + entry("b", "bbbb", "/dev/sda3") + third), "starts=sda2 sda3 "},
      {"no kernel there", debian, started(entry("a", "aaaa", "UUID=aaaa", "/gone") + second),
       "it is not there) lasting"},
      {"another loader", debian,
       started("menuentry W { search --fs-uuid --set=root AAAA-0001\n chainloader /EFI/other.efi\n}\n" + second),
       "it is another loader"},
      {"two volumes of one name", debian, started(entry("e", "eeee", "UUID=eeee") + second), "starts=sdb2 "},
      {"by a file that two have", debian,
       started("menuentry F { search --file --set=root /boot/vmlinuz\n linux /boot/vmlinuz root=UUID=aaaa\n}\n"),
       "several volumes have this file"},
      {"a menu on two volumes", debian, {{debianEfi, debianGrub()}, {debianCfg, stub("eeee")}}, "both sdc1 and sdc2"},
  });
}

TEST(LoadersTest, FollowsSystemdBootAndUnifiedImages) {
  const auto configured = [](const std::string& text) { return bootWith({{"sda1:/loader/loader.conf", text}}); };
  const auto image = unifiedImage("root=UUID=cccc ro", "ID=debian\nVERSION_ID=\"12\"\n");
  const auto alone = [](const LoaderFiles& more) {
    return with({{"sda1:/EFI/Linux/a.efi", unifiedImage("root=UUID=aaaa ro\n")}}, more);
  };
  constexpr const char* one = "sda1:\\EFI\\Linux\\a.efi";
  expectAll({
      {"the first", boot, bootWith({}), "next=sda3 lasting=sda3 once= starts=sda3 sda2 keeps=variable"},
      {"by a pattern", boot, configured("timeout 3\ndefault one*\n"), "next=sda2 lasting=sda2 "},
      {"by the variable", boot, configured("default two.conf\n"), "next=sda2 ", "", {"ONE.conf", ""}},
      {"once", boot, bootWith({}), "next=sda2 lasting=sda3 once=one.conf ", "", {"two.conf", "one.conf"}},
      {"the last one", boot, configured("default @saved\n"), "(tell what starts on @saved"},
      {"another loader", boot, configured("default auto-win*\n"), "(tell what starts on auto-win"},
      {"none that is there", boot, configured("default gone\n"), "next=sda3 "},
      {"on the other partition", boot, bootWith({{"sda4:/loader/entries/zzz.conf", conf("UUID=cccc")}}),
       "next=sdb2 lasting=sdb2 once= starts=sdb2 sda3 sda2 "},
      {"values in quotes", boot,
       bootWith({{"sda1:/loader/entries/zzz.conf", "linux \"/vmlinuz\"\noptions \"root=UUID=cccc ro\"\n"}}),
       "next=sdb2 "},
      {"a preferred entry", boot, configured("preferred one\n"), "by assessment"},
      {"a preferred entry in a variable", boot, bootWith({}), "by assessment", "", {"", "", "one"}},
      {"for another machine", boot,
       bootWith({{"sda1:/loader/entries/zzz.conf", "architecture none\n" + conf("UUID=cccc")}}), "next=sda3 "},
      {"a program behind the kernel", boot,
       bootWith({{"sda1:/loader/entries/zzz.conf", conf("UUID=cccc") + "efi /vmlinuz\n"}}),
       "no program for UEFI) lasting"},
      {"a unified image among them", boot, bootWith({{"sda4:/EFI/Linux/debian.efi", image}}),
       "next=sdb2 lasting=sdb2 once= starts=sdb2 sda3 sda2 "},
      {"no kernel there", boot, bootWith({{"sda1:/loader/entries/two.conf", conf("UUID=bbbb", "/gone")}}),
       "next=sda2 lasting=sda2 once= starts=sda2 keeps"},
      {"out of the partition", boot,
       bootWith({{"sda1:/loader/entries/two.conf", conf("UUID=bbbb", "/../sda3/boot/vmlinuz")}}), "no absolute path"},
      {"another loader as kernel", boot,
       bootWith({{"sda1:/loader/entries/two.conf", conf("UUID=bbbb", "/EFI/systemd/systemd-bootx64.efi")}}),
       "starts another loader) lasting"},
      {"no entries", boot, {{"sda1:/EFI/systemd/systemd-bootx64.efi", systemdBootProgram()}}, "there is no entry"},
      {"an entry of 1 MiB", boot, bootWith({{"sda1:/loader/entries/x.conf", std::string(1048576, ' ')}}), "next=("},
      {"its copy for removable media", "sda1:\\EFI\\BOOT\\BOOTX64.EFI",
       bootWith({{"sda1:/EFI/BOOT/BOOTX64.EFI", systemdBootProgram()}}), "next=sda3 "},
      {"a unified image alone", one, alone({}), "next=sda2 lasting=sda2 once= starts=sda2 "},
      {"with options", one, alone({}), "hangs on Secure Boot", toUtf16("root=UUID=cccc")},
      {"with addons", one, alone({{"sda1:/EFI/Linux/a.efi.extra.d/X.ADDON.EFI", ""}}), "add to its command line"},
      {"without a root", one, {{"sda1:/EFI/Linux/a.efi", unifiedImage("quiet")}}, "names no root"},
      {"started by a shim", "sda1:\\EFI\\shimx64.efi", alone({{"sda1:/EFI/shimx64.efi", shimProgram()}}), "next=sda2 ",
       toUtf16("\\EFI\\Linux\\a.efi") + std::string(2, '\0')},
  });
}

TEST(LoadersTest, RefusesWhatHangsOnWhatIsNotSeen) {
  const LoaderMachine machine(bootWith({{"sda2:/only", ""}}));
  auto all = machine.volumes.all();
  const auto open = [&](const Volume& volume) { return machine.volumes.filesOf(volume); };
  OtherDevice stick{all.front()};
  stick.names.device.name = {"sdz1"};
  EXPECT_EQ(grub::VolumeFiles(Volumes(all, open)).isFound("file:/only"), true);
  EXPECT_EQ(grub::VolumeFiles(Volumes(all, open)).isFound("fs-uuid:eeee"), std::nullopt);
  EXPECT_EQ(grub::VolumeFiles(Volumes(all, open, {stick})).isFound("file:/only"), std::nullopt);
  all[3].facts.type = "ext4";
  const auto reading = readLoader(Volumes(all, open), all[0], "\\EFI\\systemd\\systemd-bootx64.efi", "", {});
  EXPECT_THAT(summaryOf(reading), HasSubstr("sda4 hangs on drivers"));
}

TEST(LoadersTest, IsNotMisledByWhatAVolumeHolds) {
  const auto signedUp = [](const std::string& program) { return LoaderFiles{{debianEfi, program}}; };
  const auto cut = grubProgram("/EFI/debian", "normal").substr(0, 1060);
  std::string many;
  std::string words;
  std::string ways;
  for (int index = 0; index < 2000; ++index) many += "menuentry x { true; }\n";
  std::string values = "set a=0123456789abcdef\n";
  for (int index = 0; index < 5; ++index) values += "set a=$a$a$a$a\n";
  for (int index = 0; index < 200; ++index) values += "set b" + std::to_string(index) + "=$a\n";
  for (int index = 0; index < 100000; ++index) words += "\"\" -o ";
  for (int index = 0; index < 40000; ++index) ways += "elif false; then true\n";
  expectAll({
      {"no program", debian, signedUp("#!/bin/sh\n"), "no program for UEFI"},
      {"nothing", debian, signedUp(""), "no program for UEFI"},
      {"a folder", "sda1:\\EFI\\debian", grubWith(""), "not a regular file"},
      {"not there", "sda1:\\EFI\\gone.efi", {}, "No such file"},
      {"out of the partition", "sda1:\\EFI\\..\\..\\x.efi", {}, "no path of a file"},
      {"modules that end early", debian, signedUp(cut), "its modules cannot be read"},
      {"what comes with a shim", debian, signedUp(shimProgram("\\other.efi")), "no loader that is known"},
      {"a shim that starts a shim", debian, signedUp(shimProgram()), "no loader that is known"},
      {"a shim whose texts are elsewhere", "sda1:\\EFI\\debian\\shimx64.efi",
       grubWith(menu("0", first), {{"sda1:/EFI/debian/shimx64.efi", shimProgram("\\grubx64.efi", ".rodata")}}),
       "next=sda2 "},
      {"a shim alone", "sda1:\\shimx64.efi", {{"sda1:/shimx64.efi", shimProgram()}}, "No such file"},
      {"a shim that makes entries",
       "sda1:\\EFI\\BOOT\\BOOTX64.EFI",
       {{"sda1:/EFI/BOOT/BOOTX64.EFI", shimProgram()}, {"sda1:/EFI/BOOT/FBX64.EFI", ""}},
       "makes boot entries anew"},
      {"a stub that goes on with itself", debian, grubWith("", {{debianCfg, "configfile $cmdpath/grub.cfg\n"}}),
       "itself"},
      {"a function that calls itself", debian, grubWith("function f { f; f; }\nf\n" + first), "calls itself"},
      {"submenus without end", debian, grubWith("function f { submenu s { f; } }\nf\n"), "submenus without end"},
      {"very many words", debian, grubWith("[ " + words + "]\n" + first), "too long"},
      {"very many ways", debian, grubWith("if false; then true\n" + ways + "fi\n"), "too long"},
      {"values that grow", debian,
       grubWith("set a=0123456789\nfunction g { set a=$a$a$a$a; }\ng;g;g;g;g;g;g;g;g;g;g;g;g;g;g;g\n"), "too long"},
      {"many long values", debian, grubWith(values), "too long"},
      {"very many separators", debian, grubWith(std::string(900000, ';')), "too long"},
      {"too many entries", debian, grubWith(many), "too many entries"},
      {"deep conditions", debian, grubWith([] {
         std::string text;
         for (int index = 0; index < 100; ++index) text += "if keystatus; then\n";
         return text;
       }()),
       "not of GRUB's language"},
      {"an environment of another size", debian, grubWith(menu("0", first), {{menuEnv, block("") + "#"}}),
       "no environment block"},
      {"zeros", debian, grubWith(std::string("menuentry a\0b {", 15)), "not of GRUB's language"},
      {"a command that nobody knows in front", debian, grubWith("frobnicate --set=root x\n" + menu("0", first)),
       "next=sda2 "},
      {"a title in quotes and escapes", debian,
       grubWith("menuentry 'a'\\''b \\\"$root\\\" {' --id x\\ y {\nsearch.fs_uuid aaaa root\n"
                "linux /boot/vmlinuz root=UUID=aaaa\n}\n"),
       "next=sda2 "},
  });
  const LoaderMachine machine(grubWith(""));
  std::filesystem::resize_file(machine.at(menuCfg), std::uintmax_t(1) << 30U);
  EXPECT_THAT(summaryOf(machine.read(debian)), HasSubstr("next=("));
}

}  // namespace
}  // namespace tavisk
