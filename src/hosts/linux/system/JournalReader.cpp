// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/JournalReader.h"

#include <systemd/sd-journal.h>

#include <algorithm>
#include <cerrno>
#include <string_view>

#include "base/LibraryFunctions.h"
#include "base/Text.h"

namespace tavisk {
namespace {

#define TAVISK_JOURNAL_FUNCTIONS(use) \
  use(sd_journal_open);               \
  use(sd_journal_open_directory);     \
  use(sd_journal_close);              \
  use(sd_journal_set_data_threshold); \
  use(sd_journal_add_match);          \
  use(sd_journal_next);               \
  use(sd_journal_get_data);           \
  use(sd_journal_get_realtime_usec)

/// The functions of libsystemd, by their own names.
struct JournalLibrary {
#define TAVISK_DECLARE_FUNCTION(name) decltype(&::name) name = nullptr  // NOLINT(bugprone-macro-parentheses)
  TAVISK_JOURNAL_FUNCTIONS(TAVISK_DECLARE_FUNCTION);
#undef TAVISK_DECLARE_FUNCTION
};

constexpr const char* tried = "read";
constexpr const char* journal = "this machine's journal";
/// journald.conf(5), Storage=.
constexpr const char* lastingFolder = "/var/log/journal";
constexpr const char* volatileFolder = "/run/log/journal";
constexpr std::size_t machineIdLimit = 64;

Result<JournalLibrary> openJournalLibrary() {
  LibraryFunctions functions("libsystemd.so.0");
  JournalLibrary library;
#define TAVISK_FIND_FUNCTION(name) functions.find(#name, library.name)
  TAVISK_JOURNAL_FUNCTIONS(TAVISK_FIND_FUNCTION);
#undef TAVISK_FIND_FUNCTION
  if (functions.failure()) return *functions.failure();
  return library;
}

Failure journalFailure(int result) {
  return systemFailure(tried, journal, -result);
}

/// The library leaves out files that it may not read, and says nothing.
std::string inFolder(const std::string& folder, const std::string& name) {
  return folder + "/" + name;
}

Result<std::size_t> countReadable(const SystemRoot& root, const std::string& folder) {
  const auto names = orEmpty(root.list(folder));
  if (!names) return names.failure();
  std::size_t count = 0;
  for (const auto& name : *names) {
    if (!name.ends_with(".journal") && !name.ends_with(".journal~")) continue;
    const auto file = orAbsent(root.openRegular(inFolder(folder, name)));
    if (!file) return file.failure();
    if (*file) ++count;
  }
  return count;
}

Result<JournalState> stateOf(const SystemRoot& root) {
  const auto machine = root.read("/etc/machine-id", machineIdLimit);
  if (!machine) return retold(machine.failure(), tried, "/etc/machine-id");
  const auto name = "/" + std::string(trimmed(*machine));
  const auto lasting = countReadable(root, lastingFolder + name);
  if (!lasting) return lasting.failure();
  const auto inMemory = countReadable(root, volatileFolder + name);
  if (!inMemory) return inMemory.failure();
  if (*lasting + *inMemory == 0)
    return Failure{tried, journal, "there is none", std::make_error_code(std::errc::no_such_file_or_directory)};
  return JournalState{.isVolatile = *lasting == 0};
}

/// The journal's files, open, at one entry after the other.
class OpenJournal final : public FoundJournalEntry {
 public:
  explicit OpenJournal(const JournalLibrary& library) : _library(library) {}
  ~OpenJournal() override {
    if (_files) _library.sd_journal_close(_files);
  }
  OpenJournal(const OpenJournal&) = delete;
  OpenJournal& operator=(const OpenJournal&) = delete;

  Result<void> open(const SystemRoot& root) {
    const int opened = root.prefix() == "/"
                           ? _library.sd_journal_open(&_files, SD_JOURNAL_LOCAL_ONLY)
                           : _library.sd_journal_open_directory(&_files, (root.prefix() + lastingFolder).c_str(), 0);
    if (opened < 0) return journalFailure(opened);
    _library.sd_journal_set_data_threshold(_files, 0);
    return {};
  }

  Result<void> filter(const std::vector<std::string>& fields) {
    for (const auto& field : fields)
      if (const int added = _library.sd_journal_add_match(_files, field.data(), field.size()); added < 0)
        return journalFailure(added);
    return {};
  }

  /// False at the end.
  Result<bool> goOn() {
    const int next = _library.sd_journal_next(_files);
    if (next < 0) return journalFailure(next);
    return next > 0;
  }

  std::optional<std::string> field(const std::string& name) const override {
    const void* data = nullptr;
    std::size_t size = 0;
    if (_library.sd_journal_get_data(_files, name.c_str(), &data, &size) < 0) return std::nullopt;
    const std::string_view whole(static_cast<const char*>(data), size);
    return std::string(whole.substr(std::min(name.size() + 1, whole.size())));
  }

  std::int64_t time() const override {
    std::uint64_t microseconds = 0;
    if (_library.sd_journal_get_realtime_usec(_files, &microseconds) < 0) return 0;
    constexpr std::uint64_t second = 1'000'000;
    return static_cast<std::int64_t>(microseconds / second);
  }

 private:
  const JournalLibrary& _library;
  sd_journal* _files = nullptr;
};

}  // namespace

Result<JournalState> readJournal(const SystemRoot& root, const std::vector<std::string>& fields,
                                 const std::function<void(const FoundJournalEntry& entry)>& take) {
  auto state = stateOf(root);
  if (!state) return state;
  const auto library = openJournalLibrary();
  if (!library) return library.failure();
  OpenJournal reading(*library);
  if (auto opened = reading.open(root); !opened) return opened.failure();
  if (auto filtered = reading.filter(fields); !filtered) return filtered.failure();
  auto found = reading.goOn();
  for (; found && *found; found = reading.goOn()) take(reading);
  if (!found) return found.failure();
  return state;
}

}  // namespace tavisk
