// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/loaders/LoaderTexts.h"
#include "hosts/linux/loaders/MenuFiles.h"

namespace tavisk::grub {
namespace {

using ::testing::HasSubstr;

/// As grub-mkconfig writes it: what chooses the default, in place of DEFAULT, and the entries of one system.
const std::string recorded = contentsOf(TAVISK_RECORDINGS "/loaders/recordings/debian.grub.cfg");
const auto entriesBegin = recorded.find("\nmenuentry");
const std::string entries = recorded.substr(entriesBegin);
constexpr const char* other = R"(
menuentry 'Other (on /dev/sdb2)' --class os $menuentry_id_option 'osprober-gnulinux-simple-bbbb' {
	insmod part_gpt
	search --no-floppy --fs-uuid --set=root bbbb
	linux /boot/vmlinuz root=/dev/sdb2 quiet
}
)";

std::string headerWith(const std::string& chosen) {
  auto text = recorded.substr(0, entriesBegin);
  return text.replace(text.find("DEFAULT"), 7, chosen);
}

constexpr const char* configurationPath = "/boot/grub/grub.cfg";

/// What starts, or why that cannot be told.
std::string startOf(const MenuFiles& files) {
  const MenuReader reader(files,
                          {{"prefix", "(fs-uuid:aaaa)/boot/grub"}, {"root", "fs-uuid:aaaa"}, {"grub_platform", "efi"}});
  const auto menu = reader.menuOf({"fs-uuid:aaaa", configurationPath});
  const auto start = menu ? reader.startOfDefault(*menu) : menu.failure();
  if (!start) return start.failure().why;
  return start->program.device + start->program.path + " " + start->commandLine;
}

struct Case {
  const char* description;
  std::string configuration;
  std::string variables;  ///< of the environment block
  std::string expected;   ///< the start, or a part of why it cannot be told
};

constexpr const char* ownKernel = "fs-uuid:aaaa/boot/vmlinuz-6.1.0-18-amd64 root=UUID=aaaa ro quiet";
constexpr const char* otherKernel = "fs-uuid:bbbb/boot/vmlinuz root=/dev/sdb2 quiet";

TEST(GrubMenuTest, TellsWhatTheDefaultStarts) {
  const auto full = entries + other;
  const Case cases[] = {
      {"the first entry", headerWith("0") + full, "", ownKernel},
      {"a number", headerWith("3") + full, "", "hangs on a condition"},
      {"a number in a submenu", headerWith("1>0") + full, "",
       "fs-uuid:aaaa/boot/vmlinuz-6.1.0-18-amd64 root=UUID=aaaa ro single"},
      {"the saved entry", headerWith("${saved_entry}") + full, "saved_entry=osprober-gnulinux-simple-bbbb\n",
       otherKernel},
      {"a saved entry that is in doubt", headerWith("${saved_entry}") + full, "saved_entry=uefi-firmware\n",
       "hangs on a condition"},
      {"nothing saved", headerWith("${saved_entry}") + full, "", ownKernel},
      {"once", headerWith("0") + other + entries, "next_entry=gnulinux-advanced-aaaa>gnulinux-6.1-advanced-aaaa\n",
       "fs-uuid:aaaa/boot/vmlinuz-6.1.0-18-amd64 root=UUID=aaaa ro single"},
      {"a name that is not there", headerWith("gone") + full, "", ownKernel},
      {"no entries", "set default=0\n", "", "no entry"},
      {"not of the language", "menuentry 'x' { linux /a", "", "not of GRUB's language"},
      {"itself", "source $prefix/grub.cfg\n", "", "includes itself"},
      {"a condition that nobody knows", "if keystatus --shift; then set default=1; else set default=0; fi\n" + full, "",
       "default hangs on"},
      {"a start without a menu", "linux /vmlinuz root=/dev/sda1\nboot\n", "", "without a menu"},
      {"a loop", "for file in a b; do source $file; done\n" + full, "", "loop around source"},
      {"a variable that a loop goes through", "for default in 1 2; do true; done\n" + full, "", "default hangs on"},
      {"a loop's test", "while source x; do true; done\n" + full, "", "loop around source"},
      {"a loop that sets what nobody knows", "for x in 1; do set a$x=1; done\n" + full, "", "loop around set"},
      {"a name that some take for a number", headerWith("2nd") + full, "", "is a number cannot be told"},
      {"a number of base 8", headerWith("1>010") + full, "", "is a number cannot be told"},
      {"an escape in a name", headerWith("a>>b") + full, "", "has an escape"},
      {"a search with a hint", "menuentry x { search --set=root --hint hd0,gpt1 -u bbbb cccc\n linux /v root=1 }", "",
       "fs-uuid:bbbb/v root=1"},
      {"a search that keeps nothing", "menuentry x { search -u bbbb\n linux /v root=1 }", "", "fs-uuid:aaaa/v root=1"},
      {"half a root", "menuentry x { if keystatus; then set u=1; fi\n linux /v root=UUID=a$u }", "",
       "root on its command line is not known"},
      {"a root in two words", "set u='1 2'\nmenuentry x { linux /v rootflags=$u }", "",
       "root on its command line is not known"},
      {"a function in the way of a command", "function linux { true; }\nmenuentry x { linux /v root=1 }", "",
       "/v root=1"},
      {"a submenu's own default", "submenu s { set default=1\n menuentry a { linux /a } }", "", "default of its own"},
      {"a number before a name", "regexp --set 1:default x y\n" + full, "", "default hangs on"},
      {"an entry with two ways", "menuentry x { if keystatus; then linux /a root=1; else linux /a root=2; fi }", "",
       "what is started hangs on"},
      {"a disk by its place", "menuentry x { set root='hd0,gpt2'\n linux /vmlinuz root=/dev/sda2 }", "",
       "hd0,gpt2/vmlinuz root=/dev/sda2"},
  };
  for (const auto& [description, configuration, variables, expected] : cases) {
    MenuFiles files;
    files.files = {{configurationPath, configuration}, {"/boot/grub/grubenv", block(variables)}};
    EXPECT_THAT(startOf(files), HasSubstr(expected)) << description;
  }
}

}  // namespace
}  // namespace tavisk::grub
