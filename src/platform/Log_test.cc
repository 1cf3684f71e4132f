#include "platform/Log.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

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
