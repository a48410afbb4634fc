#include "pen/VersionTable.h"

const std::int32_t versionTable[9][2] = {{0, 0}, {1, 1}, {2, 2}, {3, 3}, {4, 4},
                                         {5, 5}, {6, 4}, {7, 4}, {8, 4}};
