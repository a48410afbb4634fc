#include "ink/Lengths.h"

namespace QeltDesktop {

std::optional<double> strokeUnitsIn(std::string_view unit) {
  constexpr double kInch = 96.0, kMillimetresAnInch = 25.4, kPointsAnInch = 72.0;
  static constexpr struct {
    std::string_view name;
    double strokeUnits;
  } kUnits[] = {{"in", kInch},
                {"m", kInch * 1000.0 / kMillimetresAnInch},
                {"cm", kInch * 10.0 / kMillimetresAnInch},
                {"mm", kInch / kMillimetresAnInch},
                {"himetric", kInch / (100.0 * kMillimetresAnInch)},
                {"pc", kInch * 12.0 / kPointsAnInch},
                {"pt", kInch / kPointsAnInch},
                {"px", 1.0}};
  for (const auto& [name, strokeUnits] : kUnits) {
    if (unit == name) return strokeUnits;
  }
  return std::nullopt;
}

bool isUnitless(std::string_view unit) {
  return unit.empty() || unit == "dev";
}

}  // namespace QeltDesktop
