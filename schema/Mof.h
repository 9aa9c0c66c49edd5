#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "schema/ClassRepository.h"
#include "schema/Declarations.h"

// MOF texts (DSP0004 2.x, Annex A): reading and writing.
//
// The reader takes any bytes: what is no MOF ends in an error that names file, line, column, what was expected and what
// was found. Time and memory grow with the text alone. No function here keeps state; each may be called on any thread.

namespace zorva::schema {

/// What takes the declarations of a text, each as soon as it is read, in the text's order. A function that gives back a
/// message refuses the declaration and ends the reading; the reader adds file, line and column unless the error has
/// them.
class MofSink {
 public:
  virtual ~MofSink() = default;
  virtual std::optional<SchemaError> qualifierType(QualifierType type, std::string_view file) = 0;
  virtual std::optional<SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) = 0;
  virtual std::optional<SchemaError> instance(InstanceDeclaration instance, std::string_view file) = 0;
};

/// A sink that adds qualifier types and classes to a repository and refuses instances.
class RepositorySink : public MofSink {
 public:
  /// `repository` must outlive the sink.
  explicit RepositorySink(ClassRepository& repository) : repository_(repository) {}
  std::optional<SchemaError> qualifierType(QualifierType type, std::string_view file) override;
  std::optional<SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) override;
  std::optional<SchemaError> instance(InstanceDeclaration instance, std::string_view file) override;

 private:
  ClassRepository& repository_;
};

/// What a `#pragma include` brought: the name under which errors speak of it, and its text; or why there is none.
struct MofInclude {
  std::string file;
  std::string text;
  std::string error;  ///< not empty: the file cannot be had
};

/// Finds an included text: `name` as the pragma has it, `from` the file in which it stands.
using MofIncluder = std::function<MofInclude(std::string_view name, std::string_view from)>;

/// Bounds on one reading, its included texts counted in.
struct MofLimits {
  std::size_t bytes = 16U << 20U;  ///< of all texts together
  unsigned includeDepth = 16;
  unsigned includedFiles = 1000;
};

/// Reads `text` and hands what it declares to `sink`. `file` is the name that errors carry. Without `includer` an
/// include is an error. Gives the first error, of the text or of the sink; what was handed to the sink before it stays
/// there.
std::optional<SchemaError> parseMof(std::string_view text, std::string_view file, MofSink& sink,
                                    const MofIncluder& includer = {}, const MofLimits& limits = {});

/// Reads the file at `path`; its includes are resolved relative to the file in which they stand. Only regular files are
/// read, so nothing blocks.
std::optional<SchemaError> parseMofFile(const std::string& path, MofSink& sink, const MofLimits& limits = {});

/// A declaration as MOF, ended by a line feed. Long texts are split at blanks so that lines stay within 100 columns
/// where that is possible. What writeMof writes, parseMof reads back to the same declaration.
std::string writeMof(const QualifierType& type);
std::string writeMof(const ClassDeclaration& declaration);
std::string writeMof(const InstanceDeclaration& instance);

/// A value as a MOF initializer: `"a"`, `{ 1, 2 }`, `null`.
std::string writeMofValue(const Value& value);

}  // namespace zorva::schema
