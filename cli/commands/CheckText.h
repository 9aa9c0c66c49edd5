#pragma once

#include <string>

#include "dns/ServerCheck.h"

namespace zorva::cli {

/// The problem in a sentence, without control characters.
std::string checkProblemText(const dns::CheckProblem& problem);

}  // namespace zorva::cli
