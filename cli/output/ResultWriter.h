#pragma once

// Writes the results of a CIM operation to standard output, in the requested format. Results are written one by one, so
// that their number is not limited by memory.

#include <memory>

#include "broker/objects/Value.h"
#include "cli/output/OutputFormat.h"
#include "cli/output/Table.h"

namespace zorva::cli {

class ResultWriter {
 public:
  virtual ~ResultWriter() = default;
  virtual void add(const broker::Instance& instance) = 0;
  virtual void add(const broker::ObjectPath& /*path*/) {}

  /// Completes the text, also after a failure, so that a program can read the results before it.
  virtual void finish() {}
};

/// The number of results: One is written alone, Many as a list.
enum class Count { One, Many };

enum class Results { Instances, Names };

/// Table: names one a line, instances as their names with their properties under them; with Layout::rowsAlone one
/// table. Json (RFC 8259): a name is a text; an instance is {"class", "path", "properties"}, with null for a null
/// property and a text for a reference. Many are an array. Mof (DSP0004): instance declarations. Xml (DSP0201): one
/// declaration document of the instances with their paths. Throws Failure (wrong usage) for a format that does not
/// exist for these results.
std::unique_ptr<ResultWriter> makeResultWriter(OutputFormat format, const Layout& layout, Count count, Results results);

}  // namespace zorva::cli
