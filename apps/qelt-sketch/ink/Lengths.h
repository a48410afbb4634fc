#pragma once

#include <optional>
#include <string_view>

namespace QeltDesktop {

// How many stroke units a unit of length has, by InkML's name for it ("mm"); none for any other name. A
// stroke unit is 1/96 inch.
std::optional<double> strokeUnitsIn(std::string_view unit);

// True for the units that say nothing of a length: none at all, and the device's own ("dev").
bool isUnitless(std::string_view unit);

}  // namespace QeltDesktop
