#pragma once

// MOF texts (DSP0004 2.x, Annex A): reading and writing.
//
// The reader accepts any bytes: a text that is no MOF ends in an error that names file, line, column, the expected and
// the actual text. Time and memory grow with the text only. No function here keeps state; each may be called on any
// thread.

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

#include "schema/ClassRepository.h"
#include "schema/Declarations.h"

namespace zorva::schema {

/// Takes the declarations of a text, each as soon as it is read, in the text's order. A function that returns an error
/// refuses the declaration and ends the reading; the reader adds file, line and column unless the error has them.
class MofSink {
 public:
  virtual ~MofSink() = default;
  virtual Expected<void, SchemaError> qualifierType(QualifierType type, std::string_view file) = 0;
  virtual Expected<void, SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) = 0;
  virtual Expected<void, SchemaError> instance(InstanceDeclaration instance, std::string_view file) = 0;
};

/// A sink that adds qualifier types and classes to a repository and refuses instances.
class RepositorySink : public MofSink {
 public:
  /// `repository` must outlive the sink.
  explicit RepositorySink(ClassRepository& repository) : repository_(repository) {}
  Expected<void, SchemaError> qualifierType(QualifierType type, std::string_view file) override;
  Expected<void, SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) override;
  Expected<void, SchemaError> instance(InstanceDeclaration instance, std::string_view file) override;

 private:
  ClassRepository& repository_;
};

/// A sink that keeps qualifier types and classes and refuses instances.
class DeclarationsSink : public MofSink {
 public:
  Expected<void, SchemaError> qualifierType(QualifierType type, std::string_view file) override;
  Expected<void, SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) override;
  Expected<void, SchemaError> instance(InstanceDeclaration instance, std::string_view file) override;

  Declarations declarations;
};

/// The result of a `#pragma include`: its name in errors and its text, or why it cannot be read.
struct MofInclude {
  std::string file;
  std::string text;
  std::string error;  ///< not empty: the file cannot be read
};

/// Finds an included text: `name` is the pragma's text, `from` the file that contains it.
using MofIncluder = std::function<MofInclude(std::string_view name, std::string_view from)>;

/// Limits of one reading, including its included texts.
struct MofLimits {
  std::size_t bytes = 16U << 20U;  ///< of all texts together
  unsigned includeDepth = 16;
  unsigned includedFiles = 1000;
};

/// Reads `text` and passes its declarations to `sink`. `file` is the name in errors. Without `includer` an include is
/// an error. Returns the first error, of the text or of the sink; declarations that the sink got before stay there.
Expected<void, SchemaError> parseMof(std::string_view text, std::string_view file, MofSink& sink,
                                     const MofIncluder& includer = {}, const MofLimits& limits = {});

/// Reads the file at `path`; its includes are relative to the file that contains them. Only regular files are read, so
/// nothing blocks.
Expected<void, SchemaError> parseMofFile(const std::string& path, MofSink& sink, const MofLimits& limits = {});

/// A declaration as MOF, ended by a line feed. Long texts are split at blanks so that lines stay within 100 columns if
/// possible. parseMof reads the result back to the same declaration.
std::string writeMof(const QualifierType& type);
std::string writeMof(const ClassDeclaration& declaration);
std::string writeMof(const InstanceDeclaration& instance);

/// A value as a MOF initializer: `"a"`, `{ 1, 2 }`, `null`.
std::string writeMofValue(const Value& value);

}  // namespace zorva::schema
