#pragma once

#include <cstdint>
#include <map>

namespace store {

// LTE downlink bandwidth index to channel bandwidth in MHz. Built once, never changed.
inline const std::map<std::int32_t, float>& downlinkBandwidthMHz() {
  static const std::map<std::int32_t, float> table{{0, 1.4f},  {1, 3.0f},  {2, 5.0f},
                                                   {3, 10.0f}, {4, 15.0f}, {5, 20.0f}};
  return table;
}

}  // namespace store
