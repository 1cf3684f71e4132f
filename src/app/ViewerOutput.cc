#include "app/ViewerOutput.h"

#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iostream>

#include "app/LogDestination.h"
#include "platform/Log.h"

namespace app {

std::unique_ptr<ViewerOutput> ViewerOutput::open(std::optional<std::string_view> logOption,
                                                 std::string source,
                                                 const series::SeriesStore& series) {
  const LogDestination destination =
      chooseLogDestination(logOption, isatty(STDOUT_FILENO) == 1,
                           defaultLogFile(std::getenv("XDG_STATE_HOME"), std::getenv("HOME")));
  std::FILE* logFile = nullptr;
  if (destination.file) {
    const std::filesystem::path path(*destination.file);
    std::error_code ignored;  // fopen says what is wrong
    if (path.has_parent_path()) std::filesystem::create_directories(path.parent_path(), ignored);
    logFile = std::fopen(path.c_str(), "w");
    if (logFile == nullptr) {
      std::cerr << "norvo: cannot write the log to " << *destination.file << ": "
                << std::strerror(errno) << '\n';
      return nullptr;
    }
    std::cout << "Norvo writes its log to " << *destination.file << std::endl;
    platform::log::setPlainOutput(logFile);
  }
  auto statusLine = destination.statusLine
                        ? std::make_unique<StatusLine>(stdout, std::move(source), series)
                        : nullptr;
  return std::unique_ptr<ViewerOutput>(new ViewerOutput(logFile, std::move(statusLine)));
}

ViewerOutput::ViewerOutput(std::FILE* logFile, std::unique_ptr<StatusLine> statusLine)
    : logFile_(logFile),
      statusLine_(std::move(statusLine)),
      flushTimer_(ui::Timer::scheduledTimer(kLogFlushInterval, &platform::log::flushPlain, true)) {}

ViewerOutput::~ViewerOutput() {
  flushTimer_.invalidate();
  statusLine_.reset();
  if (logFile_ != nullptr) {
    platform::log::setPlainOutput(stdout);
    std::fclose(logFile_);
  }
}

void ViewerOutput::setAlertCount(std::function<std::size_t()> count) {
  if (statusLine_) statusLine_->setAlertCount(std::move(count));
}

void ViewerOutput::setLink(std::shared_ptr<const tarn::client::LinkStatus> link) {
  if (statusLine_) statusLine_->setLink(std::move(link));
}

void ViewerOutput::wire(ui::DisplayOptions& display, store::MetricValidator& intake) {
  if (!statusLine_) return;
  StatusLine& statusLine = *statusLine_;
  display.didStartServing = [&statusLine](const std::string& address) {
    statusLine.setAddress(address);
    statusLine.start();
  };
  intake.addStoreObserver([&statusLine](store::DisplayDictionary, const store::MetricValidator&) {
    statusLine.metricStored();
  });
}

}  // namespace app
