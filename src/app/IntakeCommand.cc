#include "app/IntakeCommand.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <functional>
#include <iostream>
#include <optional>
#include <string>

#include "app/ServiceOption.h"
#include "app/SharedIntake.h"
#include "platform/CommandLine.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "store/MetricValidator.h"
#include "store/StoreDump.h"
#include "tarn/log/MetricLog.h"

namespace app {

namespace {

constexpr std::string_view kUsage =
    "usage: norvo intake LOG.jsonl [--dump-store OUT.json]\n"
    "\n"
    "Hands each metric record of LOG.jsonl (\"-\" for standard input) to the metric intake, in\n"
    "order, and prints the intake's log lines. With --dump-store, writes the whole store to\n"
    "OUT.json afterwards. Lines that do not parse are reported and skipped.\n";

struct Options {
  std::string logPath;
  std::optional<std::string> dumpPath;
};

bool writeDump(std::ofstream& file, const store::MetricValidator& intake) {
  file << platform::toJson(store::dumpStore(intake)) << '\n';
  file.close();
  return !file.fail();
}

}  // namespace

bool deliverMetricLog(std::istream& log, std::string_view logName, TarnWrapperDelegate& receiver,
                      std::ostream& errors) {
  tarn::log::MetricLogReader reader(log);
  std::function<void()> deliverNext;
  deliverNext = [&] {
    std::optional<tarn::log::MetricLogReader::Line> line = reader.next();
    if (!line) {
      platform::stopMainQueue();
      return;
    }
    if (line->parsed.entry) {
      receiver.metricsDidUpdate(line->parsed.entry->record);
    } else {
      // Keeps the report next to the intake's lines when both streams go to one place.
      std::fflush(stdout);
      errors << logName << ':' << line->number << ": " << line->parsed.error << "; line skipped"
             << std::endl;
    }
    platform::postToMainQueue(deliverNext);
  };
  platform::postToMainQueue(deliverNext);
  platform::runMainQueue();
  return !reader.failed();
}

int runIntakeCommand(std::span<const std::string_view> arguments) {
  std::optional<std::string_view> logGiven, dumpGiven;
  const platform::CommandLineOption table[] = {{"--dump-store", &dumpGiven, "a file name"}};
  const platform::CommandLinePositional logArgument{&logGiven, "metric log",
                                                    "which metric log? (\"-\" for standard input)"};
  if (const auto exit = platform::openCommandLine({"norvo intake", kUsage}, arguments, table,
                                                  logArgument, std::cout, std::cerr)) {
    return *exit;
  }
  const Options options{std::string(*logGiven),
                        dumpGiven ? std::optional<std::string>(*dumpGiven) : std::nullopt};

  std::ifstream file;
  if (options.logPath != "-") {
    file.open(options.logPath, std::ios::binary);
    if (!file) {
      std::cerr << "norvo intake: cannot read " << options.logPath << '\n';
      return 1;
    }
  }
  std::istream& log = options.logPath == "-" ? std::cin : file;
  const std::string logName = options.logPath == "-" ? "<stdin>" : options.logPath;
  // Opened first, so that a long log is not read in vain.
  std::ofstream dump;
  if (options.dumpPath) {
    dump.open(*options.dumpPath, std::ios::binary | std::ios::trunc);
    if (!dump) {
      std::cerr << "norvo intake: cannot write the store to " << *options.dumpPath << '\n';
      return 1;
    }
  }

  // Only the log's records may reach the store: the service in this process has no source.
  useService(ServiceChoice{}, nullptr);
  store::MetricValidator& intake = sharedIntake();
  const bool read = deliverMetricLog(log, logName, intake, std::cerr);
  // The log lines are the command's output: a disk that is full or a pipe that closed loses them.
  platform::log::drain();
  if (std::fflush(stdout) != 0 || std::ferror(stdout) != 0) {
    std::cerr << "norvo intake: cannot write the log lines to standard output: "
              << std::strerror(errno) << '\n';
    return 1;
  }
  if (!read) {
    std::cerr << "norvo intake: cannot read " << logName << " to its end\n";
    return 1;
  }
  if (options.dumpPath && !writeDump(dump, intake)) {
    std::cerr << "norvo intake: cannot write the store to " << *options.dumpPath << '\n';
    return 1;
  }
  return 0;
}

}  // namespace app
