#pragma once

#include <string>

// For tests: is a text a valid document of CIM-XML?

namespace zorva::cimxml::testing {

/// What xmllint says against the document, line by line; empty where it is valid. It is held against the grammar
/// (cim-xml.rng) and, in a build that has DMTF's document type at hand, against that too. Safe on any thread.
std::string grammarProblem(const std::string& document);

}  // namespace zorva::cimxml::testing
