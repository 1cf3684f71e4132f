#pragma once

#include <cstdint>
#include <ostream>
#include <string>

namespace app {

// A bar of how far a job has gone, redrawn in place on a terminal ("\r"), and only when the
// whole percentage moves, so that a fast job does not spend its time drawing.
class ProgressBar {
 public:
  ProgressBar(std::ostream& terminal, std::uint64_t total) : terminal_(terminal), total_(total) {}

  void update(std::uint64_t done);
  // Wipes the bar, leaving the line empty for what comes next; the next update draws it again.
  void wipe();

 private:
  std::ostream& terminal_;
  const std::uint64_t total_;
  int shownPercent_ = -1;
};

}  // namespace app
