#pragma once

#include <string_view>

// Standard output and standard error of the program.

namespace zorva::cli {

/// A line on stderr: the name of the program, the kind of the line ("warning: ") and `what`.
void tell(const char* kind, std::string_view what);

/// The lines of an error on stderr: what, and what to do next.
void tellError(std::string_view what, std::string_view hint = {});

/// A line that tells what a person should know although the command was done.
void tellWarning(std::string_view what);

/// A line of the same kind that is no warning.
void tellNote(std::string_view what);

/// Writes to standard output. Throws Failure where that cannot be written.
void write(std::string_view text);

/// Writes what is still held back. Throws Failure as write does.
void flushOutput();

}  // namespace zorva::cli
