#pragma once

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "ChildProcess.h"

namespace bustest {

// Starts the tarnd that was built with the tests (NORVO_TARND), on the bus at `busAddress`, with
// `options`. Its standard output and error go to `outputStem` with ".out" and ".err" added.
inline std::unique_ptr<ChildProcess> startTarnd(const std::string& busAddress,
                                                std::vector<std::string> options,
                                                const std::filesystem::path& outputStem) {
  std::vector<std::string> arguments = {NORVO_TARND, "--bus", busAddress};
  arguments.insert(arguments.end(), options.begin(), options.end());
  return std::make_unique<ChildProcess>(
      ChildProcess::Options{.arguments = std::move(arguments),
                            .standardOutput = outputStem.string() + ".out",
                            .standardError = outputStem.string() + ".err"});
}

}  // namespace bustest
