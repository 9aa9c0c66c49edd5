#pragma once

#include <cmpidt.h>

namespace ZV {

bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right, bool flag);

}  // namespace ZV
