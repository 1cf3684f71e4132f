#pragma once

#include <chrono>
#include <cstdio>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "app/StatusLine.h"
#include "series/SeriesStore.h"
#include "store/MetricValidator.h"
#include "ui/Application.h"
#include "ui/Timer.h"

namespace app {

// What the live viewer writes where: its plain log lines to standard output or a log file,
// each within kLogFlushInterval of being written, and on a terminal the status line in their
// place.
class ViewerOutput {
 public:
  // Lines held in a buffer reach their file or pipe at most this much later.
  static constexpr std::chrono::milliseconds kLogFlushInterval{50};

  // Empty, after saying why on standard error, when the log file cannot be opened. Says on
  // standard output where the lines go when that is a file.
  static std::unique_ptr<ViewerOutput> open(std::optional<std::string_view> logOption,
                                            std::string source, const series::SeriesStore& series);
  ~ViewerOutput();
  ViewerOutput(const ViewerOutput&) = delete;
  ViewerOutput& operator=(const ViewerOutput&) = delete;

  // The status line learns the address once the pages are served, and counts the metrics the
  // intake stores.
  void wire(ui::DisplayOptions& display, store::MetricValidator& intake);
  // Where the status line takes the number of alerts from, once alerts exist.
  void setAlertCount(std::function<std::size_t()> count);
  // Whether the service is reached, for the status line.
  void setLink(std::shared_ptr<const tarn::client::LinkStatus> link);

 private:
  ViewerOutput(std::FILE* logFile, std::unique_ptr<StatusLine> statusLine);

  std::FILE* logFile_;  // null for standard output
  std::unique_ptr<StatusLine> statusLine_;
  ui::Timer flushTimer_;
};

}  // namespace app
