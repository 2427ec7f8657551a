// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ToolRun.h"

namespace tavisk {

namespace {

const char* const file = "/Library/Preferences/SystemConfiguration/com.velmar.Boot.plist";
const std::string saved = "changes to kernel architecture have been saved.\n";
const std::string notSaved = "changes to kernel architecture failed to save!\n";
const std::string isDefault = "kernel architecture is set to default\n";

std::string plist(const std::string& entries) {
  auto value = parsePropertyList("<dict>" + entries + "</dict>", ownFileLimits);
  return *writePropertyList(*value);
}

std::string architecture(const std::string& name) {
  return "<key>Kernel Architecture</key><string>" + name + "</string>";
}

struct Case {
  std::string before;  ///< empty: no file
  std::vector<std::string> words;
  std::string output;
  std::string after;
};

TEST(BootArchitecture, isOneKeyOfTheFile) {
  const std::string others = "<key>Kernel</key><string>mach_kernel</string><key>Timeout</key><integer>5</integer>";
  const std::string toDefault = "setting kernel architecture to default\n";
  const std::string invalid = "Invalid argument. Valid arguments are i386, x86_64, or default.\n";
  const Case cases[] = {
      {"", {"-getkernelbootarchitecturesetting"}, isDefault, ""},
      {plist(others), {"-getkernelbootarchitecturesetting"}, isDefault, plist(others)},
      {plist(architecture("i386")),
       {"-getkernelbootarchitecturesetting"},
       "kernel architecture is set to: i386\n",
       plist(architecture("i386"))},
      {"",
       {"-setkernelbootarchitecture", "x86_64", "-getkernelbootarchitecturesetting"},
       "setting kernel architecture to: x86_64\n" + saved + "kernel architecture is set to: x86_64\n",
       plist(architecture("x86_64"))},
      {plist(architecture("x86_64") + others),
       {"-setkernelbootarchitecture", "i386"},
       "setting kernel architecture to: i386\n" + saved,
       plist(architecture("i386") + others)},
      {plist(others + architecture("x86_64")),
       {"-setkernelbootarchitecture", "DEFAULT", "-getkernelbootarchitecturesetting"},
       toDefault + saved + isDefault,
       plist(others)},
      {"", {"-setkernelbootarchitecture", "default"}, toDefault + notSaved, ""},
      {"", {"-setkernelbootarchitecture", "I386"}, invalid, ""},
      {plist(others), {"-setkernelbootarchitecture", "X86_64"}, invalid, plist(others)},
      {plist(others), {"-setkernelbootarchitecture"}, invalid, plist(others)},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.words.back());
    ScratchMachine machine;
    if (!test.before.empty()) machine.writeFile(file, test.before);
    const auto result = runTool(machine, test.words);
    EXPECT_EQ(result.output, test.output);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(machine.file(file), test.after);
  }
}

TEST(BootArchitecture, keepsADamagedFileBeside) {
  const std::string damaged = "<dict><key>Kernel Architecture</key><string>i386";
  ScratchMachine machine;
  machine.writeFile(file, damaged);
  const auto result = runTool(machine, {"-getkernelbootarchitecturesetting", "-setkernelbootarchitecture", "default"});
  EXPECT_EQ(result.output, isDefault + "setting kernel architecture to default\n" + notSaved);
  EXPECT_EQ(machine.file(file), damaged);
  EXPECT_THAT(machine.effectsLog(), testing::Contains(testing::HasSubstr("end tag")));

  runTool(machine, {"-setkernelbootarchitecture", "i386"});
  EXPECT_EQ(machine.file(file), plist(architecture("i386")));
  EXPECT_EQ(machine.file(std::string(file) + ".damaged"), damaged);
}

TEST(BootArchitecture, tellsWhenItCannotBeSaved) {
  const std::string failed = "setting kernel architecture to: i386\n" + notSaved;
  ScratchMachine refusing;
  refusing.refuse("Kernel Architecture", "read-only");
  EXPECT_EQ(runTool(refusing, {"-setkernelbootarchitecture", "i386"}).output, failed);
  EXPECT_EQ(refusing.file(file), "");

  ScratchMachine blocked;
  blocked.writeFile("/Library/Preferences", "not a folder");
  EXPECT_EQ(runTool(blocked, {"-setkernelbootarchitecture", "i386"}).output, failed);
  EXPECT_THAT(blocked.effectsLog(), testing::Contains(testing::HasSubstr(R"("outcome":"failed")")));
}

}  // namespace

}  // namespace tavisk
