#pragma once

// For tests: is a text a valid document of CIM-XML?

#include <string>

namespace zorva::cimxml::testing {

/// xmllint's messages about the document, line by line; empty if it is valid. It is validated against the grammar
/// (cim-xml.rng) and, in a build that has DMTF's document type, against that too. Safe on any thread.
std::string grammarProblem(const std::string& document);

}  // namespace zorva::cimxml::testing
