#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

// Page addresses: each screen's address is the texts of the rows tapped to reach it, so
// "/LTE/CA%20Status" is the screen reached by tapping "LTE" and then "CA Status".
namespace ui::web {

using Path = std::vector<std::string>;

// The row texts of an address's path ("/" gives none; one trailing slash is ignored). Empty when
// a segment is empty or holds a malformed percent escape.
std::optional<Path> decodePath(std::string_view path);

// The parameters of a query, the text after '?': "name=lte.rsrp&since=0". Names and values are
// percent-decoded, '+' stands for a space, a repeated name keeps its last value, and a name
// without '=' has the empty value. Empty when an escape is malformed.
using QueryParameters = std::map<std::string, std::string, std::less<>>;
std::optional<QueryParameters> decodeQuery(std::string_view query);

// The address of `path`, every byte but letters, digits and -._~ percent-escaped.
std::string encodePath(const Path& path);

// The address of one more tap below `parent`.
std::string appendToAddress(std::string_view parentAddress, std::string_view rowText);

}  // namespace ui::web
