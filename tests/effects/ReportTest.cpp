// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <thread>

#include "ToolRun.h"
#include "effects/Report.h"
#include "platform/BootLoaderFile.h"

namespace tavisk {
namespace {

namespace fs = std::filesystem;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

struct ReportTest : ::testing::Test {
  /// The lines that a run adds to the report.
  std::vector<std::string> run(const std::vector<std::string>& words) {
    machine.set("Clock", "Time", 1173301503);
    report = Report::open(path).value();
    machine.effects.addChannel(*report);
    runTool(machine, words, {.report = report.get()});
    return linesOf(path);
  }

  /// For those who hold it to its schema.
  void TearDown() override {
    const auto* kept = std::getenv("TAVISK_KEPT_REPORTS");
    if (kept && fs::exists(path)) std::ofstream(kept, std::ios::app) << contentsOf(path);
  }

  TemporaryFolder folder;
  fs::path path = folder.path() / "report";
  std::unique_ptr<Report> report;
  ScratchMachine machine;
};

TEST_F(ReportTest, tellsEachCommand) {
  machine.refuse("Network Time Server", "no\nway");
  EXPECT_THAT(
      run({"-f", "GETTIMEZONE", "-settime", "9:9\t", "-settime", "99", "-setnetworktimeserver", "a", "bogus\xff"}),
      ElementsAre(
          R"({"report":1,"command":"GETTIMEZONE","handler":"getTimeZone","failed":false,"changed":false,)"
          R"("values":[{"setting":"Time Zone","live":"UTC","stored":"UTC"}],"effects":[],"output":"Time Zone: UTC\n"})",
          ::testing::AllOf(HasSubstr(R"({"report":1,"command":"-settime","argument":"9:9\t","handler":"setTime:",)"
                                     R"("failed":false,"changed":true,"values":[)"),
                           HasSubstr(R"("effects":[{"setting":"Time","outcome":"applied",)"),
                           HasSubstr(R"("output":"Set Time: 09:09:00\n"})")),
          ::testing::AllOf(
              HasSubstr(R"("argument":"99","handler":"setTime:","refused":"a time as hh:mm:ss","failed":true,)"
                        R"("changed":false)"),
              HasSubstr(R"("effects":[],"output":"settime: Error, 99 is)")),
          ::testing::AllOf(HasSubstr(R"("failed":false,"changed":false,"values":[)"),
                           HasSubstr(R"("outcome":"failed")"), HasSubstr(R"("why":"no\nway")")),
          "{\"report\":1,\"command\":\"bogus\xef\xbf\xbd\",\"refused\":\"a command that -printcommands "
          "lists\",\"error\":\"not a valid command\",\"failed\":false,"
          "\"changed\":false,\"values\":[],\"effects\":[],"
          "\"output\":\"Error: bogus\xef\xbf\xbd is not a valid command\\n\"}"));
}

TEST_F(ReportTest, tellsThatAFileCannotBeReadInsteadOfARefusal) {
  machine.writeFile(BootLoaderFile::path, "damaged");
  EXPECT_THAT(run({"-setkernelbootarchitecture", "default"}).back(),
              ::testing::AllOf(HasSubstr(R"("outcome":"failed")"), ::testing::Not(HasSubstr("refused"))));
}

TEST_F(ReportTest, tellsARefusalToRun) {
  machine.set("User", "ID", 1000);
  EXPECT_THAT(run({"-getdate"}),
              ElementsAre(R"({"report":1,"error":"not an administrator","failed":true,"changed":false,"values":[],)"
                          R"("effects":[],"output":"You need administrator access to run this tool... exiting!\n"})"));
}

TEST_F(ReportTest, tellsTheCommandThatASignalInterrupted) {
  report = Report::open(path).value();
  machine.effects.addChannel(*report);
  report->commandBegins("-settime", std::vector<std::string>{"9"}, "setTime:");
  machine.effects.changeBegins("Time", "0");
  machine.effects.interrupt("gone");
  report->runEndedBySignal("SIGTERM", true, "half");
  report->commandEnds(false, "");
  EXPECT_THAT(linesOf(path), ElementsAre(::testing::AllOf(
                                 HasSubstr(R"("handler":"setTime:","signal":"SIGTERM","failed":true,"changed":true,)"),
                                 HasSubstr(R"("asked":"0")"), HasSubstr(R"("why":"gone"}],"output":"half"})"))));
}

TEST_F(ReportTest, isWholeWhenASignalComesAtAnyMoment) {
  constexpr int times = 300;
  const auto kept = Report::open(path).value();
  std::thread signal([&] {
    for (int time = 0; time < times; ++time) kept->runEndedBySignal("SIGTERM", false, "");
  });
  for (int time = 0; time < times; ++time) {
    kept->commandBegins("-gettime", {}, "getTime");
    kept->record({.setting = "Time", .outcome = Outcome::failed});
    kept->commandEnds(false, "");
  }
  signal.join();
  kept->runRefused("the end", "");
  int effects = 0;
  for (const auto& line : linesOf(path)) {
    EXPECT_TRUE(line.starts_with(R"({"report":1,)") && line.ends_with(R"("output":""})")) << line;
    for (auto at = line.find(R"("setting")"); at != std::string::npos; at = line.find(R"("setting")", at + 1))
      ++effects;
  }
  EXPECT_EQ(effects, times);
}

TEST_F(ReportTest, keepsNoMoreThanAMiBOfTheOutput) {
  const Stream nowhere(std::fopen("/dev/null", "w"));
  Output output(nowhere.get());
  output.keepPrinted();
  const std::string half(700'000, 'x');
  for (int i = 0; i < 3; ++i) output.putLine(half.c_str());
  EXPECT_EQ(output.takePrinted().size(), 1U << 20U);
  output.putLine("again");
  EXPECT_EQ(output.takePrinted(), "again\n");
}

TEST_F(ReportTest, appendsToAFileOfItsOwner) {
  const mode_t mask = umask(0);
  const auto result = Report::open(path);
  umask(mask);
  ASSERT_TRUE(result);
  EXPECT_EQ(fs::status(path).permissions(), fs::perms::owner_read | fs::perms::owner_write);
  folder.write("report", "earlier\n");
  (*result)->runRefused("x", "");
  EXPECT_THAT(linesOf(path), ElementsAre("earlier", HasSubstr(R"("error":"x")")));
}

TEST_F(ReportTest, writesToAnOpenDescriptor) {
  int ends[2];
  ASSERT_EQ(::pipe(ends), 0);
  const FileDescriptor reader(ends[0]);
  const FileDescriptor named(ends[1]);
  Report::open("fd:" + std::to_string(named.number())).value()->runRefused("x", "");
  EXPECT_EQ(::write(named.number(), "open\n", 5), 5);
  char text[256] = {};
  EXPECT_GT(::read(reader.number(), text, sizeof text - 1), 0);
  EXPECT_THAT(text, ::testing::EndsWith("\"output\":\"\"}\nopen\n"));
}

TEST_F(ReportTest, refusesWhatIsNoFileOfItsOwn) {
  folder.write("file", "");
  fs::create_symlink("file", folder.path() / "link");
  ASSERT_EQ(mkfifo((folder.path() / "fifo").c_str(), 0600), 0);
  const FileDescriptor reader(::open((folder.path() / "fifo").c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
  for (const char* name : {"link", "fifo", "no/such/folder", "."}) {
    EXPECT_FALSE(Report::open(folder.path() / name)) << name;
  }
  const FileDescriptor readable(::open((folder.path() / "file").c_str(), O_RDONLY | O_CLOEXEC));
  for (const std::string name : {"", "fd:", "fd:-1", "fd:1x", "fd: 1", "fd:99999999999", "fd:987", "/dev/null"}) {
    EXPECT_FALSE(Report::open(name)) << name;
  }
  EXPECT_FALSE(Report::open("fd:" + std::to_string(readable.number())));
}

}  // namespace
}  // namespace tavisk
