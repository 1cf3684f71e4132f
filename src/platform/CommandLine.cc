#include "platform/CommandLine.h"

#include <algorithm>
#include <ostream>
#include <set>

namespace platform {

namespace {

bool looksLikeOption(std::string_view argument) {
  return argument.size() > 1 && argument.front() == '-';
}

}  // namespace

std::string readCommandLine(std::span<const std::string_view> arguments,
                            std::span<const CommandLineOption> options,
                            std::optional<CommandLinePositional> positional) {
  std::set<std::string_view> given;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string argument(arguments[i]);
    if (looksLikeOption(argument)) {
      const auto option = std::ranges::find(options, argument, &CommandLineOption::name);
      if (option == options.end()) return "unknown option " + argument;
      if (!given.insert(option->name).second) return argument + " is given twice; give it once";
      if (bool* const* flag = std::get_if<bool*>(&option->given)) {
        **flag = true;
      } else if (i + 1 == arguments.size()) {
        return argument + " needs " + std::string(option->valueName);
      } else {
        *std::get<std::optional<std::string_view>*>(option->given) = arguments[++i];
      }
    } else if (!positional) {
      return "unexpected argument " + argument;
    } else if (*positional->given) {
      return "one " + std::string(positional->noun) + " at a time, not also " + argument;
    } else {
      *positional->given = arguments[i];
    }
  }
  if (positional && !*positional->given) return std::string(positional->whenMissing);
  return {};
}

std::optional<int> openCommandLine(const CommandUsage& command,
                                   std::span<const std::string_view> arguments,
                                   std::span<const CommandLineOption> options,
                                   std::optional<CommandLinePositional> positional,
                                   std::ostream& out, std::ostream& errors) {
  constexpr int kHelped = 0;
  constexpr int kMisused = 2;
  if (asksForHelp(arguments)) {
    out << command.usage;
    return kHelped;
  }
  const std::string error = readCommandLine(arguments, options, positional);
  if (error.empty()) return std::nullopt;
  errors << command.name << ": " << error << "\n\n" << command.usage;
  return kMisused;
}

bool asksForHelp(std::span<const std::string_view> arguments) {
  return std::ranges::any_of(arguments, [](std::string_view argument) {
    return argument == "--help" || argument == "-h";
  });
}

}  // namespace platform
