#include "app/StatusLine.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <chrono>
#include <cmath>

#include "platform/Format.h"

namespace app {

namespace {

constexpr std::string_view kSeparator = " | ";
constexpr std::size_t kDefaultWidth = 80;

std::size_t widthOf(std::FILE* terminal) {
  winsize size{};
  if (ioctl(fileno(terminal), TIOCGWINSZ, &size) == 0 && size.ws_col > 0) return size.ws_col;
  return kDefaultWidth;
}

}  // namespace

std::string statusText(const StatusFigures& figures, std::size_t width) {
  std::string text = figures.address.empty() ? "Norvo is starting" : "Open " + figures.address;
  text += kSeparator;
  text += figures.source;
  text += kSeparator;
  text += platform::format("%.1f metrics/s", figures.metricsPerSecond);
  text += kSeparator;
  if (figures.serving) {
    text += platform::format("%s %.0f %s", figures.serving->technology,
                             figures.serving->sample.value, figures.servingUnit);
  } else {
    text += "no service";
  }
  if (figures.alerts) {
    text += kSeparator;
    text += platform::format("%zu alert%s", *figures.alerts, *figures.alerts == 1 ? "" : "s");
  }
  // A line wider than the terminal would wrap, and the next one would not overwrite it.
  if (width > 0 && text.size() > width - 1) text.resize(width - 1);
  return text;
}

StatusLine::StatusLine(std::FILE* terminal, std::string source, const series::SeriesStore& series)
    : terminal_(terminal), series_(series), source_(std::move(source)) {
  figures_.source = source_;
}

StatusLine::~StatusLine() {
  finish();
}

void StatusLine::setAddress(std::string address) {
  figures_.address = std::move(address);
  show();
}

void StatusLine::start() {
  tick();
  timer_ = ui::Timer::scheduledTimer(
      std::chrono::seconds(1), [this] { tick(); }, true);
}

void StatusLine::finish() {
  timer_.invalidate();
  if (!shown_) return;
  std::fputc('\n', terminal_);
  std::fflush(terminal_);
  shown_ = false;
}

void StatusLine::tick() {
  const std::size_t window = std::min(ticks_, counted_.size() - 1);
  const std::size_t oldest = counted_[(ticks_ + counted_.size() - window) % counted_.size()];
  counted_[ticks_ % counted_.size()] = metrics_;
  ++ticks_;
  figures_.source = link_ && !link_->get().connected ? source_ + " (not connected)" : source_;
  figures_.metricsPerSecond =
      window == 0 ? 0.0 : static_cast<double>(metrics_ - oldest) / static_cast<double>(window);
  figures_.serving = dashboard::servingLevel(series_);
  figures_.servingUnit =
      figures_.serving ? series_.definition(figures_.serving->series)->unit : std::string_view();
  if (alertCount_) figures_.alerts = alertCount_();
  show();
}

void StatusLine::show() {
  const std::string text = statusText(figures_, widthOf(terminal_));
  // Back to the start of the line, the new text, then clear what the old one left.
  std::fprintf(terminal_, "\r%s\x1b[K", text.c_str());
  std::fflush(terminal_);
  shown_ = true;
}

}  // namespace app
