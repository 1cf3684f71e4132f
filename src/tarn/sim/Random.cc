#include "tarn/sim/Random.h"

#include <cmath>
#include <numbers>

namespace tarn::sim {
namespace {

std::uint64_t rotateLeft(std::uint64_t value, int bits) {
  return (value << bits) | (value >> (64 - bits));
}

std::uint64_t splitmix64(std::uint64_t& state) {
  std::uint64_t z = (state += 0x9E3779B97F4A7C15u);
  z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
  z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
  return z ^ (z >> 31);
}

}  // namespace

Random::Random(std::uint64_t seed) {
  for (std::uint64_t& word : state_)
    word = splitmix64(seed);
}

std::uint64_t Random::next() {
  const std::uint64_t result = rotateLeft(state_[1] * 5, 7) * 9;
  const std::uint64_t shifted = state_[1] << 17;
  state_[2] ^= state_[0];
  state_[3] ^= state_[1];
  state_[1] ^= state_[2];
  state_[0] ^= state_[3];
  state_[2] ^= shifted;
  state_[3] = rotateLeft(state_[3], 45);
  return result;
}

double Random::unit() {
  return static_cast<double>(next() >> 11) * 0x1.0p-53;
}

double Random::uniform(double low, double high) {
  return low + (high - low) * unit();
}

std::int64_t Random::between(std::int64_t low, std::int64_t high) {
  const auto span = static_cast<std::uint64_t>(high - low) + 1;
  return low + static_cast<std::int64_t>(next() % span);
}

bool Random::chance(double probability) {
  return unit() < probability;
}

// Box-Muller; the second value of each pair is dropped to keep the generator stateless
// beyond its four words.
double Random::normal(double mean, double deviation) {
  const double u1 = 1.0 - unit();
  const double u2 = unit();
  return mean + deviation * std::sqrt(-2.0 * std::log(u1)) * std::cos(2.0 * std::numbers::pi * u2);
}

double Random::exponential(double mean) {
  return -mean * std::log(1.0 - unit());
}

}  // namespace tarn::sim
