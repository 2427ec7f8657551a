// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <filesystem>

#include "TemporaryFolder.h"
#include "fuzz/Targets.h"

namespace tavisk::fuzz {

void PrintTo(const Target& target, std::ostream* stream) {
  *stream << target.name;
}

namespace {

std::vector<std::filesystem::path> entriesOf(const std::filesystem::path& folder) {
  std::vector<std::filesystem::path> paths;
  if (!std::filesystem::exists(folder)) return paths;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) paths.push_back(entry.path());
  std::ranges::sort(paths);
  return paths;
}

class CorpusTest : public ::testing::TestWithParam<Target> {};

TEST_P(CorpusTest, holds) {
  constexpr std::uintmax_t largest = 4096;
  const auto inputs = entriesOf(std::filesystem::path(TAVISK_CORPUS) / GetParam().name);
  ASSERT_FALSE(inputs.empty()) << "a target has a corpus";
  for (const auto& input : inputs) {
    SCOPED_TRACE(input.string());
    EXPECT_LE(std::filesystem::file_size(input), largest);
    EXPECT_NO_THROW(GetParam().run(contentsOf(input)));
  }
}

std::string nameOfTest(const ::testing::TestParamInfo<Target>& info) {
  std::string name = info.param.name;
  std::ranges::replace(name, '-', '_');
  return name;
}

INSTANTIATE_TEST_SUITE_P(Fuzz, CorpusTest, ::testing::ValuesIn(targets), nameOfTest);

TEST(CorpusTest, isOfTargets) {
  for (const auto& folder : entriesOf(TAVISK_CORPUS)) EXPECT_TRUE(targetNamed(folder.filename().string())) << folder;
}

}  // namespace
}  // namespace tavisk::fuzz
