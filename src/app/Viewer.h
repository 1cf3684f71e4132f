#pragma once

#include <span>
#include <string_view>

namespace app {

// What `norvo --help` says about running the viewer.
extern const std::string_view kViewerUsage;

// `norvo [--listen ADDR:PORT] [--replay LOG.jsonl [--speed X] [--loop]]`: runs the app with the
// baseband service inside the process and the simulator, or the replayed log, as its source of
// metrics, and serves the screens to browsers until Ctrl-C. Answers the exit status.
int runViewer(std::span<const std::string_view> arguments);

}  // namespace app
