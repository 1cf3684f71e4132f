#include "app/ProgressBar.h"

#include <algorithm>

namespace app {

namespace {

constexpr int kWidth = 40;

}  // namespace

void ProgressBar::update(std::uint64_t done) {
  if (total_ == 0) return;
  const auto percent = static_cast<int>(std::min<std::uint64_t>(done, total_) * 100 / total_);
  if (percent == shownPercent_) return;
  shownPercent_ = percent;
  const int filled = percent * kWidth / 100;
  terminal_ << "\r[" << std::string(static_cast<std::size_t>(filled), '#')
            << std::string(static_cast<std::size_t>(kWidth - filled), ' ') << "] " << percent << '%'
            << std::flush;
}

void ProgressBar::wipe() {
  if (shownPercent_ < 0) return;
  terminal_ << '\r' << std::string(kWidth + 8, ' ') << '\r' << std::flush;
  shownPercent_ = -1;
}

}  // namespace app
