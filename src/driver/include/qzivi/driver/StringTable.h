// The string table: the text of every failure the system makes itself, by string id.
#pragma once

#include <cstdint>
#include <string>

namespace qzivi {

// The text of a string id. Throws Failure for an id the table does not hold.
const std::string& LoadResString(std::int32_t id);

} // namespace qzivi
