#pragma once

#include <iosfwd>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>

// The shape of a command line: options, flags and at most one positional argument. What the
// values mean, and which options go together, each command judges for itself afterwards.
namespace platform {

// An option of a command: a flag, set when given, or an option whose value is the next argument,
// whatever it looks like, so that "--seed -1" reaches the command's own check.
struct CommandLineOption {
  std::string_view name;
  std::variant<bool*, std::optional<std::string_view>*> given;
  // Says what the value is when it is missing: "--replay needs a metric log".
  std::string_view valueName = "a value";
};

// The one argument of a command that is not an option, such as the file it works on. "-" counts
// as one, for standard input.
struct CommandLinePositional {
  std::optional<std::string_view>* given;
  // Names it when a second one comes: "one metric log at a time, not also b.jsonl".
  std::string_view noun;
  // The whole message when it is missing, such as "which metric log?".
  std::string_view whenMissing;
};

// Fills in the targets of the options and of the positional, which must be unset on entry, from
// `arguments`. Answers what is wrong with their shape in one line, naming the argument at fault,
// or an empty text. An option given twice is wrong: which of the two was meant is not clear.
[[nodiscard]] std::string readCommandLine(std::span<const std::string_view> arguments,
                                          std::span<const CommandLineOption> options,
                                          std::optional<CommandLinePositional> positional = {});

// True when "--help" or "-h" is among the arguments: the command then shows its usage, whatever
// else the arguments hold.
bool asksForHelp(std::span<const std::string_view> arguments);

// What a command says about itself: its name in messages ("norvo intake") and its usage text.
struct CommandUsage {
  std::string_view name;
  std::string_view usage;
};

// The opening that every command shares. When the arguments ask for help, writes the usage to
// `out` and answers 0; when their shape is wrong, writes "NAME: WHAT IS WRONG", a blank line and
// the usage to `errors` and answers 2. Otherwise fills in the targets as readCommandLine does and
// answers nothing: the command goes on.
std::optional<int> openCommandLine(const CommandUsage& command,
                                   std::span<const std::string_view> arguments,
                                   std::span<const CommandLineOption> options,
                                   std::optional<CommandLinePositional> positional,
                                   std::ostream& out, std::ostream& errors);

}  // namespace platform
