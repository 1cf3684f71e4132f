#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace ui::web {

using QueryParameters = std::vector<std::pair<std::string, std::string>>;

// The parameters of a request target's query ("/api/events?since=5&kind=rrc"), names and values
// percent-decoded and "+" read as a space, in their order. Empty when an escape is malformed.
std::optional<QueryParameters> parseQuery(std::string_view target);

// The value of the last parameter of that name, if any.
std::optional<std::string_view> queryValue(const QueryParameters& parameters,
                                           std::string_view name);

}  // namespace ui::web
