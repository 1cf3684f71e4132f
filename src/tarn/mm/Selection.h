#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "tarn/mm/Value.h"

namespace tarn::mm {

// ModemManager's objects as the source knows them: path -> interface -> properties.
using Objects = std::map<std::string, std::map<std::string, Dict, std::less<>>, std::less<>>;

// The modem that `selector` picks among `objects`: by its D-Bus path, its index (3 for
// /org/freedesktop/ModemManager1/Modem/3) or its equipment identifier (IMEI). An empty selector
// picks the modem of the lowest index. Empty when no modem matches.
std::optional<std::string> chooseModem(const Objects& objects, std::string_view selector);

// The index in a modem's path ("3"), or the whole path when it has none.
std::string_view modemIndex(std::string_view path);

}  // namespace tarn::mm
