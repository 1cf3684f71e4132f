#include "app/EventsCommand.h"

#include <fstream>
#include <iostream>
#include <optional>
#include <string>

#include "events/EventDetector.h"
#include "events/EventJson.h"
#include "platform/CommandLine.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "store/Dispatch.h"
#include "store/MetricValidator.h"
#include "tarn/log/MetricLog.h"

namespace app {

namespace {

constexpr std::string_view kUsage =
    "usage: norvo events LOG.jsonl [--json]\n"
    "\n"
    "Finds the events of a metric log (\"-\" for standard input) as the running viewer does:\n"
    "RRC state changes, handovers and reselections, changes of technology, radio link\n"
    "failures, registrations and rejects, secondary carriers, bearers, area changes and SIM\n"
    "reads. Prints one line per event, oldest first, or with --json one JSON object per line.\n"
    "Lines that do not parse are reported with their line number and skipped.\n";

// Only what the events command prints needs keeping: a few metrics' worth.
constexpr std::size_t kRingCapacity = 1024;

// Why the intake turned the record down, or nothing when it took it.
std::optional<std::string> refusal(const platform::Dictionary& record) {
  const platform::Value* id = record.find(store::MetricValidator::metricIDKey);
  const std::optional<std::int64_t> metricID = id != nullptr ? id->asInteger() : std::nullopt;
  if (!metricID) return "no integer \"kKeyMetricID\"";
  if (store::handlerFor(*metricID) != nullptr) return "the payload does not decode";
  return std::nullopt;  // a metric the intake does not convert is no fault of the line
}

}  // namespace

bool writeLogEvents(std::istream& log, std::string_view logName, bool json, std::ostream& out,
                    std::ostream& errors) {
  store::MetricValidator intake(nullptr);
  events::EventRing ring(kRingCapacity);
  events::EventDetector detector(ring);
  detector.watch(intake);
  // The intake's own lines are not what this command prints.
  platform::log::Capture intakeLines;

  tarn::log::MetricLogReader reader(log);
  std::uint64_t printed = 0;
  while (std::optional<tarn::log::MetricLogReader::Line> line = reader.next()) {
    std::optional<std::string> error;
    if (!line->parsed.entry) {
      error = line->parsed.error;
    } else if (!intake.isMetricIDValidWithMetricdict(line->parsed.entry->record)) {
      error = refusal(line->parsed.entry->record);
    }
    intakeLines.clear();
    if (error) {
      out.flush();
      errors << logName << ':' << line->number << ": " << *error << "; line skipped" << std::endl;
    }
    for (const events::Event* event : ring.addedAfter(printed)) {
      out << (json ? platform::toJson(events::eventDictionary(*event)) : events::eventLine(*event))
          << '\n';
    }
    printed = ring.nextId() - 1;
  }
  out.flush();
  return !reader.failed();
}

int runEventsCommand(std::span<const std::string_view> arguments) {
  if (platform::asksForHelp(arguments)) {
    std::cout << kUsage;
    return 0;
  }
  std::optional<std::string_view> logPath;
  bool json = false;
  const platform::CommandLineOption options[] = {{"--json", &json}};
  const platform::CommandLinePositional logArgument{&logPath, "metric log",
                                                    "which metric log? (\"-\" for standard input)"};
  if (const std::string error = platform::readCommandLine(arguments, options, logArgument);
      !error.empty()) {
    std::cerr << "norvo events: " << error << '\n' << kUsage;
    return 2;
  }

  const bool standardInput = *logPath == "-";
  std::ifstream file;
  if (!standardInput) {
    file.open(std::string(*logPath), std::ios::binary);
    if (!file) {
      std::cerr << "norvo events: cannot read " << *logPath << '\n';
      return 1;
    }
  }
  const std::string logName = standardInput ? "<stdin>" : std::string(*logPath);
  if (!writeLogEvents(standardInput ? std::cin : file, logName, json, std::cout, std::cerr)) {
    std::cerr << "norvo events: cannot read " << logName << " to its end\n";
    return 1;
  }
  if (!std::cout) {
    std::cerr << "norvo events: cannot write the events\n";
    return 1;
  }
  return 0;
}

}  // namespace app
