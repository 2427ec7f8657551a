// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/JournalReader.h"

#include <fcntl.h>
#include <systemd/sd-journal.h>

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <string_view>
#include <utility>

#include "base/LibraryFunctions.h"
#include "base/Text.h"

namespace tavisk {
namespace {

#define TAVISK_JOURNAL_FUNCTIONS(use) \
  use(sd_journal_open_files_fd);      \
  use(sd_journal_close);              \
  use(sd_journal_get_usage);          \
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
constexpr const char* lastingFolder = "/var/log/journal/";
constexpr const char* volatileFolder = "/run/log/journal/";
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

Failure noJournal() {
  return {tried, journal, "there is none", std::make_error_code(std::errc::no_such_file_or_directory)};
}

/// What is wrong with a file for good; null: it could not be read this time.
const char* damageOf(int result) {
  switch (-result) {
    case EBADMSG:
      return "it is damaged";
    case ENODATA:
      return "it is cut short";
    case EPROTONOSUPPORT:
      return "it is written in a way that this machine's libsystemd does not know";
    default:
      return nullptr;
  }
}

struct JournalFile {
  std::string path;
  FileDescriptor opened;
};
using JournalFiles = std::vector<JournalFile>;

Result<void> addFilesIn(JournalFiles& files, const std::string& folder, const SystemRoot& root) {
  const auto names = orEmpty(root.list(folder));
  if (!names) return names.failure();
  for (const auto& name : *names) {
    if (!name.ends_with(".journal") && !name.ends_with(".journal~")) continue;
    auto path = folder;
    path.append("/").append(name);
    auto opened = root.openRegular(path);
    if (!opened && !isAbsent(opened.failure())) return opened.failure();
    if (opened) files.push_back({std::move(path), std::move(opened).value()});
  }
  return {};
}

Result<JournalFiles> filesOf(const SystemRoot& root) {
  const auto machine = root.read("/etc/machine-id", machineIdLimit);
  if (!machine) return retold(machine.failure(), tried, "/etc/machine-id");
  JournalFiles files;
  for (const auto* folder : {lastingFolder, volatileFolder})
    if (auto added = addFilesIn(files, folder + std::string(trimmed(*machine)), root); !added) return added.failure();
  if (files.empty()) return noJournal();
  return files;
}

/// Files of the journal, open, at one entry after the other.
class OpenJournal final : public FoundJournalEntry {
 public:
  explicit OpenJournal(const JournalLibrary& library) : _library(library) {}
  ~OpenJournal() override {
    if (_journal) _library.sd_journal_close(_journal);
  }
  OpenJournal(const OpenJournal&) = delete;
  OpenJournal& operator=(const OpenJournal&) = delete;

  /// 0, or the library's error. Of a folder it would leave out the files that it cannot read, and say nothing.
  int open(std::vector<FileDescriptor> files) {
    std::vector<int> numbers;
    std::ranges::transform(files, std::back_inserter(numbers), &FileDescriptor::number);
    const auto count = static_cast<unsigned>(numbers.size());
    const int opened = _library.sd_journal_open_files_fd(&_journal, numbers.data(), count, 0);
    if (opened < 0) return opened;
    for (auto& file : files) static_cast<void>(file.release());  // the library closes them
    return opened;
  }

  Result<void> filter(const std::vector<std::string>& fields) {
    if (const int set = _library.sd_journal_set_data_threshold(_journal, 0); set < 0) return journalFailure(set);
    for (const auto& field : fields)
      if (const int added = _library.sd_journal_add_match(_journal, field.data(), field.size()); added < 0)
        return journalFailure(added);
    return {};
  }

  /// False at the end.
  Result<bool> goOn() {
    const int next = _library.sd_journal_next(_journal);
    if (next < 0) return journalFailure(next);
    return next > 0;
  }

  std::optional<std::string> field(const std::string& name) const override {
    const void* data = nullptr;
    std::size_t size = 0;
    const int found = _library.sd_journal_get_data(_journal, name.c_str(), &data, &size);
    if (found < 0) {
      if (found != -ENOENT) note(found);
      return std::nullopt;
    }
    const std::string_view whole(static_cast<const char*>(data), size);
    return std::string(whole.substr(std::min(name.size() + 1, whole.size())));
  }

  std::int64_t time() const override {
    std::uint64_t microseconds = 0;
    if (const int found = _library.sd_journal_get_realtime_usec(_journal, &microseconds); found < 0) note(found);
    constexpr std::uint64_t second = 1'000'000;
    return static_cast<std::int64_t>(microseconds / second);
  }

  /// Why something of the entries could not be read, in whatever other way than by damage if that is among it; 0:
  /// everything could.
  int error() const { return _error; }

  /// Bytes; less than before when the library has given a file up, of which it says nothing.
  std::uint64_t size() const {
    std::uint64_t bytes = 0;
    return _library.sd_journal_get_usage(_journal, &bytes) < 0 ? 0 : bytes;
  }

 private:
  void note(int error) const {
    if (_error == 0 || damageOf(_error)) _error = error;
  }

  const JournalLibrary& _library;
  sd_journal* _journal = nullptr;
  mutable int _error = 0;
};

/// 0, or the library's error.
int tryOut(const JournalFile& file, const JournalLibrary& library) {
  FileDescriptor copy(::fcntl(file.opened.number(), F_DUPFD_CLOEXEC, 0));
  if (!copy) return -errno;
  std::vector<FileDescriptor> alone;
  alone.push_back(std::move(copy));
  return OpenJournal(library).open(std::move(alone));
}

/// The files that the library takes; those that it never will are told.
Result<std::vector<FileDescriptor>> readableAmong(JournalFiles files, const JournalLibrary& library,
                                                  std::vector<Failure>& leftOut) {
  std::vector<FileDescriptor> readable;
  for (auto& file : files) {
    const int opened = tryOut(file, library);
    const bool isRemovedMeanwhile = opened == -EIDRM;
    if (opened >= 0)
      readable.push_back(std::move(file.opened));
    else if (const auto* damage = damageOf(opened))
      leftOut.push_back({tried, file.path, damage, std::error_code(-opened, std::generic_category())});
    else if (!isRemovedMeanwhile)
      return systemFailure(tried, file.path, -opened);
  }
  if (readable.empty()) return leftOut.empty() ? noJournal() : leftOut.front();
  return readable;
}

Result<void> readEntries(OpenJournal& reading, const std::function<void(const FoundJournalEntry& entry)>& take,
                         std::vector<Failure>& leftOut) {
  const auto size = reading.size();
  auto found = reading.goOn();
  for (; found && *found; found = reading.goOn()) take(reading);
  if (!found) return found.failure();
  if (reading.error() != 0 && !damageOf(reading.error())) return journalFailure(reading.error());
  if (reading.error() != 0 || reading.size() < size)
    leftOut.push_back({tried, journal, "a file of it is damaged: journalctl --verify tells which"});
  return {};
}

}  // namespace

Result<JournalState> readJournal(const SystemRoot& root, const std::vector<std::string>& fields,
                                 const std::function<void(const FoundJournalEntry& entry)>& take) {
  auto files = filesOf(root);
  if (!files) return files.failure();
  const auto library = openJournalLibrary();
  if (!library) return library.failure();
  JournalState state;
  state.isVolatile =
      std::ranges::none_of(*files, [](const auto& file) { return file.path.starts_with(lastingFolder); });
  auto readable = readableAmong(std::move(files).value(), *library, state.leftOut);
  if (!readable) return readable.failure();
  OpenJournal reading(*library);
  if (const int opened = reading.open(std::move(readable).value()); opened < 0) return journalFailure(opened);
  if (auto filtered = reading.filter(fields); !filtered) return filtered.failure();
  if (auto read = readEntries(reading, take, state.leftOut); !read) return read.failure();
  return state;
}

}  // namespace tavisk
