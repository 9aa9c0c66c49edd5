#pragma once

#include <memory>

#include "broker/objects/Value.h"
#include "cli/output/OutputFormat.h"
#include "cli/output/Table.h"

// What a CIM operation gives, on standard output, in the format that was asked for. Results go out one by one, so that
// any number of them fits into memory.

namespace zorva::cli {

class ResultWriter {
 public:
  virtual ~ResultWriter() = default;
  virtual void add(const broker::Instance& instance) = 0;
  virtual void add(const broker::ObjectPath& /*path*/) {}

  /// Completes the text; also after a failure, so that what came before it can be read by a program.
  virtual void finish() {}
};

/// How many results there are: One is written as it is, Many as a list.
enum class Count { One, Many };

enum class Results { Instances, Names };

/// Table: names one a line, instances as their names with their properties under them.
/// Json (RFC 8259): a name is a text; an instance {"class", "path", "properties"}, where null is a property that is
/// null, and a reference is a text. Many are an array.
/// Mof (DSP0004): instance declarations.
/// Xml (DSP0201): one declaration document of the instances with their paths.
/// Throws Failure (wrong usage) for a format that these results cannot have.
std::unique_ptr<ResultWriter> makeResultWriter(OutputFormat format, const Layout& layout, Count count, Results results);

/// Throws Failure (wrong usage) that names what `subcommand` can write unless `format` is among it.
void requireFormat(OutputFormat format, std::initializer_list<OutputFormat> allowed, const char* subcommand);

}  // namespace zorva::cli
