#pragma once

#include <string_view>

namespace fleet {

// The fleet page: its HTML, which loads the script and the style sheet below from
// /fleet/fleet.js and /fleet/fleet.css. The script reads /api/fleet every second and shows one
// row per device, sorted by the column last clicked, filtered by the text typed, silent devices
// grey; each device's name opens its screens at /fleet/open/DEVICE.
extern const std::string_view kFleetHtml;
extern const std::string_view kFleetScript;
extern const std::string_view kFleetStyle;

}  // namespace fleet
