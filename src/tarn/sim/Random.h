#pragma once

#include <cstdint>

namespace tarn::sim {

// A seeded generator whose sequence is the same on every platform and standard library:
// xoshiro256** seeded through splitmix64, with its own uniform and normal helpers (the
// distributions of <random> may differ between library versions).
class Random {
 public:
  explicit Random(std::uint64_t seed);

  std::uint64_t next();
  // Uniform in [0, 1).
  double unit();
  // Uniform in [low, high).
  double uniform(double low, double high);
  // Uniform in [low, high], both ends included.
  std::int64_t between(std::int64_t low, std::int64_t high);
  bool chance(double probability);
  double normal(double mean, double deviation);
  // Exponentially distributed with the given mean.
  double exponential(double mean);

 private:
  std::uint64_t state_[4];
};

}  // namespace tarn::sim
