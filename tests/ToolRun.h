// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <sys/mman.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "ScratchMachine.h"
#include "frontend/LineSource.h"
#include "frontend/RemoteServerSettings.h"

namespace tavisk {

struct CloseStream {
  void operator()(std::FILE* stream) const { std::fclose(stream); }
};
using Stream = std::unique_ptr<std::FILE, CloseStream>;

inline Stream streamInMemory() {
  return Stream(::fdopen(::memfd_create("stream", MFD_CLOEXEC), "w+"));
}

/// A stream to read the text from.
inline Stream streamOf(std::string_view text) {
  Stream stream = streamInMemory();
  if (!text.empty()) std::fwrite(text.data(), 1, text.size(), stream.get());
  std::rewind(stream.get());
  return stream;
}

inline std::string textOf(std::FILE* stream) {
  std::string text;
  std::rewind(stream);
  for (int byte = std::fgetc(stream); byte != EOF; byte = std::fgetc(stream)) text += static_cast<char>(byte);
  return text;
}

struct RunOptions {
  std::string_view typed = {};  ///< standard input
  LineSource* input = nullptr;  ///< instead of it
  RunRecord* report = nullptr;  ///< must be a channel of the machine's effects already
  std::string_view commandTable = CommandTable::text();
  std::FILE* output = nullptr;  ///< instead of ToolResult::output
  std::chrono::milliseconds longestCommand{15000};
};

struct ToolResult {
  std::string output;
  int status;
};

/// One run of the tool on the machine, in this process: all that the program does but for hosts and signals.
template <typename Machine>
ToolResult runTool(Machine& machine, std::vector<std::string> words, const RunOptions& options = {}) {
  const Stream printed = streamInMemory();
  const Stream typed = streamOf(options.typed);
  Output output(options.output ? options.output : printed.get());
  StreamLineSource stream(typed.get(), output);
  LineSource& input = options.input ? *options.input : stream;
  NotificationCenter notifications;
  RemoteServerSettings settings({machine.host(), machine.runLoop, notifications, output, input, options.longestCommand},
                                machine.effects, options.report, options.commandTable);
  words.insert(words.begin(), "tavisk");
  std::vector<char*> arguments;
  for (std::string& word : words) arguments.push_back(word.data());
  if (settings.runTool(static_cast<int>(arguments.size()), arguments.data())) machine.runLoop.run();
  return {textOf(printed.get()), settings.exitStatus()};
}

}  // namespace tavisk
