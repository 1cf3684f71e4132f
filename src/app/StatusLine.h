#pragma once

#include <array>
#include <cstddef>
#include <cstdio>
#include <functional>
#include <optional>
#include <string>

#include "dashboard/ServingCell.h"
#include "series/SeriesStore.h"
#include "tarn/client/LinkStatus.h"
#include "ui/Timer.h"

namespace app {

// What the status line shows.
struct StatusFigures {
  std::string address;  // empty until the pages are served
  std::string source;
  double metricsPerSecond = 0;
  std::optional<dashboard::ServingLevel> serving;
  std::string_view servingUnit;
  std::optional<std::size_t> alerts;  // empty while nothing counts alerts
};

// One line of at most `width` characters:
// "Open http://127.0.0.1:8080/ | simulated phone | 4.2 metrics/s | LTE -95 dBm".
std::string statusText(const StatusFigures& figures, std::size_t width);

// The line on a terminal, rewritten in place once a second on the main queue.
class StatusLine {
 public:
  StatusLine(std::FILE* terminal, std::string source, const series::SeriesStore& series);
  ~StatusLine();
  StatusLine(const StatusLine&) = delete;
  StatusLine& operator=(const StatusLine&) = delete;

  void setAddress(std::string address);
  // Counts one metric taken into the store.
  void metricStored() { ++metrics_; }
  // Where the number of alerts comes from, once alerts exist.
  void setAlertCount(std::function<std::size_t()> count) { alertCount_ = std::move(count); }
  // Whether the service is reached: while it is not, the source says so.
  void setLink(std::shared_ptr<const tarn::client::LinkStatus> link) { link_ = std::move(link); }

  // Shows the line now and then every second.
  void start();
  // Takes the metric rate and the levels anew, and shows them.
  void tick();
  // Ends the line, so that what the terminal shows next starts on a line of its own.
  void finish();

 private:
  void show();

  std::FILE* terminal_;
  const series::SeriesStore& series_;
  StatusFigures figures_;
  std::function<std::size_t()> alertCount_;
  const std::string source_;
  std::shared_ptr<const tarn::client::LinkStatus> link_;
  std::size_t metrics_ = 0;
  // Metrics counted at each of the last ticks, for a rate over a few seconds.
  std::array<std::size_t, 5> counted_{};
  std::size_t ticks_ = 0;
  ui::Timer timer_;
  bool shown_ = false;
};

}  // namespace app
