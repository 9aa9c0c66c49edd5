// Runs a case: makes its host and its broker, asks the provider, and holds what came of it against what the case says.
#pragma once

#include <cmpidt.h>

#include <string>

#include "CaseFile.h"

namespace ZV::Test {

// What is to be told of a case that does not hold, beginning with the place of the first difference; empty where it
// holds. Throws CaseError where the case cannot be understood. No other World or RecordingLogger may be there
// meanwhile. lie is added to the state of every good key, element and argument that the broker gives; no case may hold
// less for it.
std::string differenceOf(const CaseFile& file, const Case& one, CMPIValueState lie = CMPI_goodValue);

// What came of the case's request, in the notation of a case, with no phrase in it.
std::string recordOf(const CaseFile& file, const Case& one);

}  // namespace ZV::Test
