#pragma once

// Standard output and standard error of the program.

#include <string_view>

#include "cli/output/Table.h"

namespace zorva::cli {

/// From now on only errors are written: neither results nor warnings nor notes.
void writeOnlyErrors();

/// A line on stderr: the name of the program, the kind of the line ("warning: ") and `what`.
void tell(const char* kind, std::string_view what);

/// Prints an error on stderr: what happened, and what to do next.
void tellError(std::string_view what, std::string_view hint = {});

/// Prints a warning: something to know although the command succeeded.
void tellWarning(std::string_view what);

/// The same, without the mark of a warning.
void tellNote(std::string_view what);

/// Writes to standard output. Throws Failure if that fails.
void write(std::string_view text);

/// Writes a table to standard output.
void writeTable(const Table& table, const Layout& layout);

/// Writes the buffered output. Throws Failure as write does.
void flushOutput();

}  // namespace zorva::cli
