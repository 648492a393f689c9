#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace convert
{

bool isDataUri(const std::string& uri);

/// Bytes of a data URI, in base64 or spelt with %.
/// @return nothing if it is damaged.
std::optional<std::vector<uint8_t>> readDataUri(const std::string& uri);

} // namespace convert
