#include "platform/Log.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <boost/asio/signal_set.hpp>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "platform/MainQueue.h"

namespace platform::log {
namespace {

using Lines = std::vector<std::string>;

TEST(ACapture, ReceivesEachChannelsLinesSeparately) {
  Capture capture;
  plain("Received Valid Metric");
  plainf("Unknown tag: %x:%u", 0x3C, 2u);
  systemf("%s: error=%d msg=%s", "clearConfig", 0, "ok");

  EXPECT_EQ(capture.plainLines(), (Lines{"Received Valid Metric", "Unknown tag: 3c:2"}));
  EXPECT_EQ(capture.systemLines(), (Lines{"clearConfig: error=0 msg=ok"}));
}

TEST(ACapture, CountsExactLinesOfBothChannels) {
  Capture capture;
  plain("I dont care for events");
  system("I dont care for events");
  plain("I dont care for events, really");
  EXPECT_EQ(capture.count("I dont care for events"), 2u);
  EXPECT_EQ(capture.count("I dont care"), 0u);

  capture.clear();
  EXPECT_EQ(capture.count("I dont care for events"), 0u);
  EXPECT_TRUE(capture.plainLines().empty());
}

TEST(ACapture, HandsLinesBackToTheOuterCaptureWhenAnInnerOneEnds) {
  Capture outer;
  {
    Capture inner;
    plain("inner");
    EXPECT_EQ(inner.plainLines(), (Lines{"inner"}));
  }
  plain("outer");
  EXPECT_EQ(outer.plainLines(), (Lines{"outer"}));
}

TEST(ACapture, KeepsEveryLineWholeWhenThreadsWriteAtOnce) {
  constexpr int kThreads = 4;
  constexpr int kLinesEach = 500;
  Capture capture;
  std::vector<std::thread> threads;
  for (int t = 0; t < kThreads; ++t) {
    threads.emplace_back([t] {
      for (int i = 0; i < kLinesEach; ++i) {
        plainf("thread %d line", t);
        systemf("thread %d system", t);
      }
    });
  }
  for (std::thread& thread : threads)
    thread.join();

  EXPECT_EQ(capture.plainLines().size(), std::size_t{kThreads * kLinesEach});
  for (int t = 0; t < kThreads; ++t) {
    EXPECT_EQ(capture.count(format("thread %d line", t)), std::size_t{kLinesEach});
    EXPECT_EQ(capture.count(format("thread %d system", t)), std::size_t{kLinesEach});
  }
}

// Runs body in a child process whose standard output is a pipe, and returns what it wrote.
template <class Body>
std::string standardOutputOfChild(Body body) {
  int pipeEnds[2];
  if (pipe(pipeEnds) != 0) return "pipe failed";
  std::fflush(stdout);
  const pid_t child = fork();
  if (child == 0) {
    dup2(pipeEnds[1], STDOUT_FILENO);
    close(pipeEnds[0]);
    close(pipeEnds[1]);
    body();
    std::exit(0);
  }
  close(pipeEnds[1]);
  std::string output;
  char buffer[256];
  for (ssize_t n; (n = read(pipeEnds[0], buffer, sizeof buffer)) > 0;) {
    output.append(buffer, static_cast<std::size_t>(n));
  }
  close(pipeEnds[0]);
  int status = 0;
  waitpid(child, &status, 0);
  return output;
}

TEST(ThePlainLog, WritesLinesToAPipedStandardOutputByTheTimeTheProcessExits) {
  const std::string output = standardOutputOfChild([] {
    plain("pushing metric file");
    plainf("Metric ID in Hex = %X", 0x3CD30E);
  });
  EXPECT_EQ(output, "pushing metric file\nMetric ID in Hex = 3CD30E\n");
}

// What the pipe holds now, without waiting.
std::string readAvailable(int readEnd) {
  std::string text;
  char buffer[256];
  for (ssize_t n; (n = read(readEnd, buffer, sizeof buffer)) > 0;)
    text.append(buffer, static_cast<std::size_t>(n));
  return text;
}

TEST(ThePlainLog, HoldsLinesForAPipeUntilItIsFlushedAndCanBeSentElsewhere) {
  int pipeEnds[2];
  ASSERT_EQ(pipe2(pipeEnds, O_NONBLOCK), 0);
  std::FILE* output = fdopen(pipeEnds[1], "w");
  ASSERT_NE(output, nullptr);
  setPlainOutput(output);
  plain("pushing metric file");
  plain("Received Valid Metric");
  EXPECT_EQ(readAvailable(pipeEnds[0]), "");
  flushPlain();
  EXPECT_EQ(readAvailable(pipeEnds[0]), "pushing metric file\nReceived Valid Metric\n");
  flushPlain();
  EXPECT_EQ(readAvailable(pipeEnds[0]), "");

  plain("Querying SIM files");
  setPlainOutput(stdout);  // writes out what the old output holds
  EXPECT_EQ(readAvailable(pipeEnds[0]), "Querying SIM files\n");
  std::fclose(output);
  close(pipeEnds[0]);
}

TEST(TheSystemLog, StaysOffStandardOutput) {
  const std::string output = standardOutputOfChild([] { system("listening for events"); });
  EXPECT_EQ(output, "");
}

}  // namespace
}  // namespace platform::log

namespace platform::log {
namespace {

TEST(ASilence, DropsTheLinesOfEveryChannelWhileItLives) {
  Capture capture;
  {
    const Silence silence;
    plainf("dropped %d", 1);
    systemf("dropped %d", 2);
    warning("dropped 3");
  }
  plain("kept");
  EXPECT_EQ(capture.plainLines(), std::vector<std::string>{"kept"});
  EXPECT_TRUE(capture.systemLines().empty());
}

}  // namespace
}  // namespace platform::log

namespace platform::log {
namespace {

// Writes lines of every kind, each in a known order, from this thread and from one other.
void writeMixedLines() {
  const auto described = std::make_shared<const Dictionary>(
      Dictionary{{"rsrp", -97}, {"cells", List{Dictionary{{"pci", 12}}}}, {"band", "B3"}});
  std::thread other([] {
    for (int i = 0; i < 300; ++i)
      plainf("other %d", i);
  });
  for (int i = 0; i < 300; ++i) {
    plainf("Metric ID in Hex = %X", i);
    plainDescribed("Received CA Status Dict is ", described);
    if (i % 7 == 0) systemf("%s: MetricsTrigger dict=%d", "listen", i);
    if (i % 50 == 0) warningf("warning %d", i);
  }
  other.join();
}

// The lines of this thread, without those of the other.
Lines withoutOthers(Lines lines) {
  std::erase_if(lines, [](const std::string& line) { return line.starts_with("other "); });
  return lines;
}

Lines ofTheOther(const Lines& lines) {
  Lines others;
  for (const std::string& line : lines) {
    if (line.starts_with("other ")) others.push_back(line);
  }
  return others;
}

TEST(AWriterThread, WritesTheLinesOfEachThreadInTheOrderWrittenWhateverItsCapacity) {
  Capture direct;
  writeMixedLines();
  for (const std::size_t capacity :
       {std::size_t{1}, std::size_t{5}, WriterThread::kDefaultCapacity}) {
    Capture threaded;
    {
      const WriterThread writer(capacity);
      writeMixedLines();
    }
    EXPECT_EQ(withoutOthers(threaded.plainLines()), withoutOthers(direct.plainLines()));
    EXPECT_EQ(ofTheOther(threaded.plainLines()), ofTheOther(direct.plainLines()));
    EXPECT_EQ(threaded.systemLines(), direct.systemLines());
  }
}

TEST(AWriterThread, HandsEveryLineToACaptureThatBeginsOrEndsWhileItRuns) {
  const WriterThread writer(3);
  Capture outer;
  plain("before");
  {
    Capture inner;
    plain("inside");
    EXPECT_EQ(inner.plainLines(), Lines{"inside"});
  }
  plain("after");
  EXPECT_EQ(outer.plainLines(), (Lines{"before", "after"}));
}

// However the process ends its run, each line written before is on its standard output.
TEST(AWriterThread, WritesOutEveryQueuedLineWhenTheProcessEnds) {
  constexpr int kLines = 20'000;
  std::string expected;
  for (int i = 0; i < kLines; ++i)
    expected += format("line %d\n", i);
  const auto writeLines = [] {
    for (int i = 0; i < kLines; ++i)
      plainf("line %d", i);
  };
  // The programs end on SIGINT and SIGTERM by stopping the main queue and returning from main.
  const auto endOnSignal = [&writeLines](int signal) {
    const WriterThread writer(64);
    boost::asio::signal_set signals(mainQueue(), signal);
    signals.async_wait([](const auto&, int) { stopMainQueue(); });
    writeLines();
    ::kill(::getpid(), signal);
    runMainQueue();
  };
  const struct {
    std::string_view ending;
    std::function<void()> body;
  } kEndings[] = {
      {"the writer's owner returns",
       [&] {
         const WriterThread writer(64);
         writeLines();
       }},
      {"exit() while the writer runs",
       [&] {
         const auto writer = std::make_unique<WriterThread>(64);
         writeLines();
         std::exit(0);
       }},
      {"SIGTERM", [&] { endOnSignal(SIGTERM); }},
      {"SIGINT", [&] { endOnSignal(SIGINT); }},
  };
  for (const auto& test : kEndings) {
    EXPECT_EQ(standardOutputOfChild(test.body), expected) << test.ending;
  }
}

}  // namespace
}  // namespace platform::log
