#pragma once

#include <algorithm>
#include <cstddef>
#include <optional>
#include <vector>

#include "tarn/sim/Network.h"
#include "tarn/sim/Random.h"

// What the phone receives from every cell at its position: path loss, terrain, slow
// shadowing that decorrelates as the phone moves, and interference between cells that share
// a channel. Fast fading is added per reported sample, not here.
namespace tarn::sim {

struct LteLevel {
  double rsrpDbm;
  double rsrqDb;
  double sinrDb;
  double rssiDbm;  // over the carrier's bandwidth
};

struct UmtsLevel {
  double rscpDbm;
  double ecnoDb;
  double rssiDbm;  // over the 3.84 MHz carrier
};

struct GsmLevel {
  double rxlevDbm;
};

// Levels below these are not detected at all.
inline constexpr double kLteDetectableDbm = -124.0;
inline constexpr double kUmtsDetectableDbm = -118.0;
inline constexpr double kGsmDetectableDbm = -108.0;

class Radio {
 public:
  explicit Radio(const Network& network);

  void update(double positionM, Random& random);

  const std::vector<LteLevel>& lte() const { return lte_; }
  const std::vector<UmtsLevel>& umts() const { return umts_; }
  const std::vector<GsmLevel>& gsm() const { return gsm_; }

  // The strongest detectable cell, optionally only among those `accept` lets through.
  template <class Accept>
  std::optional<std::size_t> bestLte(Accept accept) const {
    return best(lte_, &LteLevel::rsrpDbm, kLteDetectableDbm, accept);
  }
  template <class Accept>
  std::optional<std::size_t> bestUmts(Accept accept) const {
    return best(umts_, &UmtsLevel::rscpDbm, kUmtsDetectableDbm, accept);
  }
  template <class Accept>
  std::optional<std::size_t> bestGsm(Accept accept) const {
    return best(gsm_, &GsmLevel::rxlevDbm, kGsmDetectableDbm, accept);
  }

  // The detectable cells that `accept` lets through, strongest first, at most `limit`.
  template <class Accept>
  std::vector<std::size_t> rankedLte(std::size_t limit, Accept accept) const {
    return ranked(lte_, &LteLevel::rsrpDbm, kLteDetectableDbm, limit, accept);
  }
  template <class Accept>
  std::vector<std::size_t> rankedUmts(std::size_t limit, Accept accept) const {
    return ranked(umts_, &UmtsLevel::rscpDbm, kUmtsDetectableDbm, limit, accept);
  }
  template <class Accept>
  std::vector<std::size_t> rankedGsm(std::size_t limit, Accept accept) const {
    return ranked(gsm_, &GsmLevel::rxlevDbm, kGsmDetectableDbm, limit, accept);
  }

 private:
  template <class Level, class Accept>
  static std::optional<std::size_t> best(const std::vector<Level>& levels, double Level::*field,
                                         double floorDbm, Accept accept) {
    std::optional<std::size_t> found;
    for (std::size_t i = 0; i < levels.size(); ++i) {
      if (levels[i].*field < floorDbm || !accept(i)) continue;
      if (!found || levels[i].*field > levels[*found].*field) found = i;
    }
    return found;
  }

  template <class Level, class Accept>
  static std::vector<std::size_t> ranked(const std::vector<Level>& levels, double Level::*field,
                                         double floorDbm, std::size_t limit, Accept accept) {
    std::vector<std::size_t> cells;
    for (std::size_t i = 0; i < levels.size(); ++i) {
      if (levels[i].*field >= floorDbm && accept(i)) cells.push_back(i);
    }
    std::stable_sort(cells.begin(), cells.end(), [&](std::size_t a, std::size_t b) {
      return levels[a].*field > levels[b].*field;
    });
    if (cells.size() > limit) cells.resize(limit);
    return cells;
  }

  double meanLossDb(std::size_t site, double frequencyMhz) const;
  void updateLte();
  void updateUmts();

  const Network& network_;
  double positionM_ = 0.0;
  bool placed_ = false;
  std::vector<double> siteShadowDb_;  // slow fading shared by the cells of a site
  std::vector<double> lteShadowDb_;
  std::vector<double> umtsShadowDb_;
  std::vector<double> gsmShadowDb_;
  std::vector<LteLevel> lte_;
  std::vector<UmtsLevel> umts_;
  std::vector<GsmLevel> gsm_;
};

}  // namespace tarn::sim
