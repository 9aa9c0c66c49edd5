#pragma once

// Runs a case: makes its host and its broker, calls the provider, and compares the result with the case.

#include <cmpidt.h>

#include <string>

#include "CaseFile.h"

namespace ZV::Test {

/// The report of a case that fails, beginning with the place of the first difference; empty if it passes. Throws
/// CaseError if the case cannot be understood. No other World or RecordingLogger may exist at the same time. lie is
/// added to the state of every good key, element and argument that the broker returns; it must not change the result of
/// any case.
std::string differenceOf(const CaseFile& file, const Case& one, CMPIValueState lie = CMPI_goodValue);

/// The result of the case's request, in the notation of a case, without phrases.
std::string recordOf(const CaseFile& file, const Case& one);

}  // namespace ZV::Test
