#include <algorithm>
#include <iostream>
#include <span>
#include <string_view>
#include <vector>

#include "app/EventsCommand.h"
#include "app/ExportCommand.h"
#include "app/FleetCommand.h"
#include "app/IntakeCommand.h"
#include "app/RecordCommand.h"
#include "app/Viewer.h"
#include "platform/Log.h"

namespace {

struct Command {
  std::string_view name;
  int (*run)(std::span<const std::string_view> arguments);
};

constexpr Command kCommands[] = {
    {"export", &app::runExportCommand},
    {"events", &app::runEventsCommand},
    {"intake", &app::runIntakeCommand},
    {"record", &app::runRecordCommand},
};

constexpr std::string_view kCommandsUsage =
    "\n"
    "usage: norvo <command> [arguments]\n"
    "\n"
    "commands:\n"
    "  export LOG.jsonl --to pcapng|jsonl|csv [-o OUT] [--raw]\n"
    "      Write a metric log out for Wireshark, jq and pandas, or spreadsheets.\n"
    "  events LOG.jsonl [--json]\n"
    "      Find the events of a metric log: RRC changes, handovers, failures, registrations...\n"
    "  intake LOG.jsonl [--dump-store OUT.json]\n"
    "      Feed a metric log to the metric intake, print its log lines and write the store.\n"
    "  record OUT.jsonl [--to FORMAT] [--seconds N] [--seed S] [--speed X]\n"
    "      Record the metrics the simulated phone delivers into a metric log, for --replay,\n"
    "      or live as an export: norvo record --to pcapng - | wireshark -k -i -\n"
    "\n"
    "norvo <command> --help describes a command.\n";

}  // namespace

int main(int argc, char** argv) {
  // Log lines are made and written off the main queue; returning from here writes out the rest.
  const platform::log::WriterThread logWriter;
  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  const std::string_view name = arguments.empty() ? "" : arguments.front();
  if (name == "--help" || name == "-h" || name == "help") {
    std::cout << app::kViewerUsage << '\n' << app::kFleetUsage << kCommandsUsage;
    return 0;
  }
  // The fleet viewer watches a broker rather than one baseband service.
  if (std::find(arguments.begin(), arguments.end(), "--fleet") != arguments.end())
    return app::runFleet(arguments);
  // Without a command, Norvo is the viewer.
  if (arguments.empty() || name.starts_with("--")) return app::runViewer(arguments);
  for (const Command& command : kCommands) {
    if (command.name == name) return command.run(std::span(arguments).subspan(1));
  }
  std::cerr << "norvo: unknown command " << name << "\n\n" << app::kViewerUsage << kCommandsUsage;
  return 2;
}
