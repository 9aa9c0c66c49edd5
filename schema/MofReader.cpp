#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "schema/Mof.h"
#include "schema/MofLexer.h"
#include "util/Names.h"
#include "util/ReadFile.h"

namespace zorva::schema {

namespace {

// Words for an error, such as "after property" and the property's name; only composed when there is an error.
struct What {
  std::string_view words;
  std::string_view name;

  What(std::string_view words_, std::string_view name_ = {}) : words(words_), name(name_) {}
  What(const char* words_) : words(words_) {}
  std::string text() const {
    return name.empty() ? std::string(words) : std::string(words) + " '" + std::string(name) + "'";
  }
};

// The resources used by one reading, over all included texts.
struct Budget {
  const MofLimits& limits;
  std::size_t bytes = 0;
  unsigned depth = 0;
  unsigned files = 0;
};

// Reads one text; an included text gets its own parser. The grammar has no nesting except braces around plain values,
// so only includes recurse, and their depth is limited.
class MofParser {
 public:
  MofParser(std::string_view text, std::string_view file, MofSink& sink, const MofIncluder& includer, Budget& budget)
      : lexer_(text, file), sink_(sink), includer_(includer), budget_(budget) {}

  void parse();

 private:
  void parsePragma();
  void include(const std::string& name, Place place);
  void parseQualifierType();
  void parseQualifierScope(QualifierType& type);
  void parseQualifierFlavors(QualifierType& type);
  void parseClass(Qualifiers qualifiers);
  void parseFeature(ClassDeclaration& declaration);
  void parseMethodRest(Method& method);
  void parseInstance(Qualifiers qualifiers);
  void parseInstanceProperty(InstanceDeclaration& instance);

  Qualifiers parseQualifiers();
  Qualifier parseQualifier();
  void parseStatedFlavor(StatedFlavor& stated);
  Value parseValue(What what);
  Scalar parseScalar(What what);
  std::string parseString();
  // The type of a property, parameter or method: a data type, or a class and REF.
  Type parseType(std::string& referenceClass, What what);
  // "[]" or "[12]" after a name.
  bool parseArrayMark(std::optional<std::uint32_t>& size);
  // "= value", checked against the type.
  Value parseDefault(Type type, bool isArray, What what);

  const Token& token() const noexcept { return lexer_.token(); }
  Place place() const noexcept { return lexer_.token().place; }
  [[noreturn]] void unexpected(What expected) const;
  void take(char mark, What where);
  bool takeIf(char mark);
  void takeWord(std::string_view word, What where);
  bool takeWordIf(std::string_view word);
  std::string takeName(What what);
  void hand(Expected<void, SchemaError> taken, Place place) const;

  MofLexer lexer_;
  MofSink& sink_;
  const MofIncluder& includer_;
  Budget& budget_;
};

void parseText(std::string_view text, std::string_view file, MofSink& sink, const MofIncluder& includer,
               Budget& budget) {
  budget.bytes += text.size();
  if (budget.bytes > budget.limits.bytes) {
    throw MofFailure{SchemaError{std::string(file), 0, 0,
                                 "the text, with what it includes, is longer than the " +
                                     std::to_string(budget.limits.bytes) + " bytes allowed"}};
  }
  MofParser(text, file, sink, includer, budget).parse();
}

void MofParser::parse() {
  while (token().kind != TokenKind::End) {
    if (token().kind == TokenKind::Pragma) {
      parsePragma();
    } else if (token().isWord("qualifier")) {
      parseQualifierType();
    } else {
      Qualifiers qualifiers = parseQualifiers();
      if (token().isWord("class")) {
        parseClass(std::move(qualifiers));
      } else if (token().isWord("instance")) {
        parseInstance(std::move(qualifiers));
      } else {
        unexpected(qualifiers.empty() ? "'class', 'instance', 'qualifier', '[' or '#pragma'" : "'class' or 'instance'");
      }
    }
  }
}

// #pragma name ("text"). Only the directive include has an effect; the others are skipped.
void MofParser::parsePragma() {
  lexer_.advance();
  const Place at = place();
  const std::string name = takeName("the name of a directive after '#pragma'");
  take('(', "after the name of a directive");
  const std::string argument = parseString();
  if (!token().is(')')) unexpected("')' that closes the directive");
  if (util::sameName(name, "include")) include(argument, at);
  lexer_.advance();
}

void MofParser::include(const std::string& name, Place at) {
  if (!includer_) lexer_.fail(at, "cannot include \"" + name + "\": this text is read without included files");
  if (budget_.depth == budget_.limits.includeDepth) {
    lexer_.fail(at, "includes are nested deeper than " + std::to_string(budget_.limits.includeDepth) + " files");
  }
  if (++budget_.files > budget_.limits.includedFiles) {
    lexer_.fail(at, "more than " + std::to_string(budget_.limits.includedFiles) + " files are included");
  }
  const MofInclude included = includer_(name, lexer_.file());
  if (!included.error.empty()) lexer_.fail(at, "cannot include \"" + name + "\": " + included.error);
  ++budget_.depth;
  parseText(included.text, included.file, sink_, includer_, budget_);
  --budget_.depth;
}

void MofParser::parseQualifierType() {
  QualifierType type;
  type.place = place();
  lexer_.advance();
  type.name = takeName("the name of a qualifier");
  take(':', "after the name of a qualifier");
  const std::optional<Type> dataType =
      token().kind == TokenKind::Identifier ? typeFromName(token().lexeme) : std::nullopt;
  if (!dataType) unexpected("a data type");
  type.type = *dataType;
  lexer_.advance();
  type.isArray = parseArrayMark(type.arraySize);
  type.defaultValue = parseDefault(type.type, type.isArray, {"a default value of qualifier", type.name});
  parseQualifierScope(type);
  if (takeIf(',')) parseQualifierFlavors(type);
  take(';', {"after the declaration of qualifier", type.name});
  const Place at = type.place;
  hand(sink_.qualifierType(std::move(type), lexer_.file()), at);
}

void MofParser::parseQualifierScope(QualifierType& type) {
  static constexpr std::pair<std::string_view, std::uint16_t> kScopes[] = {
      {"class", ScopeClass},           {"association", ScopeAssociation},
      {"indication", ScopeIndication}, {"property", ScopeProperty},
      {"reference", ScopeReference},   {"method", ScopeMethod},
      {"parameter", ScopeParameter},   {"any", ScopeAny},
  };
  take(',', {"before the scope of qualifier", type.name});
  takeWord("scope", {"in the declaration of qualifier", type.name});
  take('(', "after 'scope'");
  do {
    const auto* scope = std::find_if(std::begin(kScopes), std::end(kScopes),
                                     [this](const auto& known) { return token().isWord(known.first); });
    if (scope == std::end(kScopes)) {
      unexpected("one of class, association, indication, property, reference, method, parameter, any");
    }
    type.scope = static_cast<std::uint16_t>(type.scope | scope->second);
    lexer_.advance();
  } while (takeIf(','));
  take(')', "after the scope");
}

void MofParser::parseQualifierFlavors(QualifierType& type) {
  takeWord("flavor", {"in the declaration of qualifier", type.name});
  take('(', "after 'flavor'");
  StatedFlavor stated;
  do {
    parseStatedFlavor(stated);
  } while (takeIf(','));
  take(')', "after the flavors");
  type.flavor.toSubclass = stated.toSubclass.value_or(type.flavor.toSubclass);
  type.flavor.overridable = stated.overridable.value_or(type.flavor.overridable);
  type.flavor.translatable = stated.translatable.value_or(type.flavor.translatable);
}

void MofParser::parseStatedFlavor(StatedFlavor& stated) {
  if (takeWordIf("enableoverride")) {
    stated.overridable = true;
  } else if (takeWordIf("disableoverride")) {
    stated.overridable = false;
  } else if (takeWordIf("tosubclass")) {
    stated.toSubclass = true;
  } else if (takeWordIf("restricted")) {
    stated.toSubclass = false;
  } else if (takeWordIf("translatable")) {
    stated.translatable = true;
  } else {
    unexpected("one of EnableOverride, DisableOverride, ToSubclass, Restricted, Translatable");
  }
}

void MofParser::parseClass(Qualifiers qualifiers) {
  ClassDeclaration declaration;
  lexer_.advance();
  declaration.place = place();
  declaration.qualifiers = std::move(qualifiers);
  declaration.name = takeName("the name of a class");
  if (takeIf(':')) declaration.superclass = takeName("the name of a superclass after ':'");
  take('{', {"that opens class", declaration.name});
  while (!takeIf('}')) parseFeature(declaration);
  take(';', {"after class", declaration.name});
  const Place at = declaration.place;
  hand(sink_.classDeclaration(std::move(declaration), lexer_.file()), at);
}

void MofParser::parseFeature(ClassDeclaration& declaration) {
  Qualifiers qualifiers = parseQualifiers();
  Property property;
  property.type = parseType(property.referenceClass, "'}', '[', a data type or the class of a reference");
  property.place = place();
  property.name = takeName("the name of a property or method");
  if (property.type != Type::Reference && token().is('(')) {
    Method& method = declaration.methods.emplace_back();
    method.qualifiers = std::move(qualifiers);
    method.returnType = property.type;
    method.name = std::move(property.name);
    method.place = property.place;
    parseMethodRest(method);
    return;
  }
  property.qualifiers = std::move(qualifiers);
  if (property.type != Type::Reference) property.isArray = parseArrayMark(property.arraySize);
  property.defaultValue = parseDefault(property.type, property.isArray, {"a default value of property", property.name});
  take(';', {"after property", property.name});
  declaration.properties.push_back(std::move(property));
}

void MofParser::parseMethodRest(Method& method) {
  take('(', {"after the name of method", method.name});
  while (!token().is(')')) {
    Parameter& parameter = method.parameters.emplace_back();
    parameter.qualifiers = parseQualifiers();
    parameter.type = parseType(parameter.referenceClass, "')', '[', a data type or the class of a reference");
    parameter.place = place();
    parameter.name = takeName({"the name of a parameter of method", method.name});
    parameter.isArray = parseArrayMark(parameter.arraySize);
    if (!takeIf(',')) break;
    if (token().is(')')) unexpected("a parameter after ','");
  }
  take(')', {"after the parameters of method", method.name});
  take(';', {"after method", method.name});
}

void MofParser::parseInstance(Qualifiers qualifiers) {
  InstanceDeclaration instance;
  lexer_.advance();
  takeWord("of", "after 'instance'");
  instance.place = place();
  instance.qualifiers = std::move(qualifiers);
  instance.className = takeName("the class of the instance");
  if (takeWordIf("as")) {
    if (token().kind != TokenKind::Alias) unexpected("an alias, like $x, after 'as'");
    instance.alias = std::string(token().lexeme);
    lexer_.advance();
  }
  take('{', {"that opens the instance of", instance.className});
  while (!takeIf('}')) parseInstanceProperty(instance);
  take(';', {"after the instance of", instance.className});
  const Place at = instance.place;
  hand(sink_.instance(std::move(instance), lexer_.file()), at);
}

void MofParser::parseInstanceProperty(InstanceDeclaration& instance) {
  InstanceProperty property;
  property.qualifiers = parseQualifiers();
  property.place = place();
  property.name =
      takeName(property.qualifiers.empty() ? "'}', '[' or the name of a property" : "the name of a property");
  take('=', {"after property", property.name});
  property.value = parseValue({"a value of property", property.name});
  take(';', {"after the value of property", property.name});
  instance.properties.push_back(std::move(property));
}

Qualifiers MofParser::parseQualifiers() {
  Qualifiers qualifiers;
  if (!takeIf('[')) return qualifiers;
  do {
    qualifiers.push_back(parseQualifier());
  } while (takeIf(','));
  if (!token().is(']')) unexpected({"',' or ']' after qualifier", qualifiers.back().name});
  lexer_.advance();
  return qualifiers;
}

Qualifier MofParser::parseQualifier() {
  Qualifier qualifier;
  qualifier.place = place();
  qualifier.name = takeName("the name of a qualifier");
  if (takeIf('(')) {
    qualifier.value = Value::of(parseScalar({"a value of qualifier", qualifier.name}));
    take(')', {"after the value of qualifier", qualifier.name});
  } else if (token().is('{')) {
    qualifier.value = parseValue({"a value of qualifier", qualifier.name});
  }
  if (takeIf(':')) {
    parseStatedFlavor(qualifier.stated);
    while (token().kind == TokenKind::Identifier) parseStatedFlavor(qualifier.stated);
  }
  return qualifier;
}

Value MofParser::parseValue(What what) {
  if (!takeIf('{')) return Value::of(parseScalar(what));
  std::vector<Scalar> elements;
  if (takeIf('}')) return Value::array(std::move(elements));
  do {
    elements.push_back(parseScalar(what));
  } while (takeIf(','));
  if (!token().is('}')) unexpected("',' or '}'");
  lexer_.advance();
  return Value::array(std::move(elements));
}

Scalar MofParser::parseScalar(What what) {
  Scalar scalar;
  switch (token().kind) {
    case TokenKind::String:
      return parseString();
    case TokenKind::Integer:
    case TokenKind::Real:
    case TokenKind::Character:
      scalar = token().number;
      break;
    case TokenKind::Alias:
      scalar = std::string(token().lexeme);
      break;
    default:
      if (token().isWord("true")) {
        scalar = true;
      } else if (token().isWord("false")) {
        scalar = false;
      } else if (!token().isWord("null")) {
        unexpected(what);
      }
  }
  lexer_.advance();
  return scalar;
}

std::string MofParser::parseString() {
  if (token().kind != TokenKind::String) unexpected("a text in double quotes");
  std::string all = std::move(lexer_.token().string);
  for (lexer_.advance(); token().kind == TokenKind::String; lexer_.advance()) all += token().string;
  return all;
}

Type MofParser::parseType(std::string& referenceClass, What what) {
  if (token().kind != TokenKind::Identifier) unexpected(what);
  if (const std::optional<Type> type = typeFromName(token().lexeme)) {
    lexer_.advance();
    return *type;
  }
  referenceClass = std::string(token().lexeme);
  const Place at = place();
  lexer_.advance();
  if (!token().isWord("ref")) {
    lexer_.fail(at, "expected a data type, or a class with 'REF' after it, found '" + referenceClass + "' and " +
                        token().describe());
  }
  lexer_.advance();
  return Type::Reference;
}

bool MofParser::parseArrayMark(std::optional<std::uint32_t>& size) {
  if (!takeIf('[')) return false;
  if (token().kind == TokenKind::Integer) {
    const auto* number = std::get_if<std::uint64_t>(&token().number);
    if (number == nullptr || *number == 0 || *number > UINT32_MAX)
      unexpected("the size of an array, from 1 to 4294967295");
    size = static_cast<std::uint32_t>(*number);
    lexer_.advance();
  }
  take(']', "that closes the array's size");
  return true;
}

Value MofParser::parseDefault(Type type, bool isArray, What what) {
  if (!takeIf('=')) return Value::null(isArray);
  const Place at = place();
  Value value = parseValue(what);
  if (const std::optional<std::string> misfit = fitValue(value, type, isArray)) {
    lexer_.fail(at, "expected " + what.text() + " of type " + std::string(typeName(type)) + (isArray ? "[]" : "") +
                        ": " + *misfit);
  }
  return value;
}

void MofParser::unexpected(What expected) const {
  lexer_.fail(place(), "expected " + expected.text() + ", found " + token().describe());
}

void MofParser::take(char mark, What where) {
  if (!token().is(mark)) unexpected(What(std::string("'") + mark + "' " + where.text()));
  lexer_.advance();
}

bool MofParser::takeIf(char mark) {
  if (!token().is(mark)) return false;
  lexer_.advance();
  return true;
}

void MofParser::takeWord(std::string_view word, What where) {
  if (!token().isWord(word)) unexpected(What("'" + std::string(word) + "' " + where.text()));
  lexer_.advance();
}

bool MofParser::takeWordIf(std::string_view word) {
  if (!token().isWord(word)) return false;
  lexer_.advance();
  return true;
}

std::string MofParser::takeName(What what) {
  if (token().kind != TokenKind::Identifier) unexpected(what);
  std::string name(token().lexeme);
  lexer_.advance();
  return name;
}

void MofParser::hand(Expected<void, SchemaError> taken, Place at) const {
  if (taken) return;
  SchemaError& refusal = taken.error();
  if (refusal.file.empty()) refusal.file = std::string(lexer_.file());
  if (refusal.line == 0) {
    refusal.line = at.line;
    refusal.column = at.column;
  }
  throw MofFailure{std::move(refusal)};
}

// A file's text, up to one byte over the limit, or why there is none.
MofInclude readFile(const std::string& path, std::size_t limit) {
  util::FileText file = util::readFile(path, limit + 1);
  MofInclude read{path, std::move(file.text), {}};
  if (file.error == EINVAL) {
    read.error = "it is no regular file";
  } else if (file.error != 0) {
    read.error = std::strerror(file.error);
  }
  return read;
}

Expected<void, SchemaError> refuseInstance(const InstanceDeclaration& instance, std::string_view file) {
  return unexpected(SchemaError{std::string(file), instance.place.line, instance.place.column,
                                "an instance of '" + instance.className + "' is among the classes"});
}

std::string besideFile(std::string_view name, std::string_view from) {
  const std::size_t slash = from.rfind('/');
  if (name.starts_with('/') || slash == std::string_view::npos) return std::string(name);
  return std::string(from.substr(0, slash + 1)) + std::string(name);
}

}  // namespace

Expected<void, SchemaError> RepositorySink::qualifierType(QualifierType type, std::string_view file) {
  return repository_.add(std::move(type), file);
}

Expected<void, SchemaError> RepositorySink::classDeclaration(ClassDeclaration declaration, std::string_view file) {
  return repository_.add(std::move(declaration), file);
}

Expected<void, SchemaError> RepositorySink::instance(InstanceDeclaration instance, std::string_view file) {
  return refuseInstance(instance, file);
}

Expected<void, SchemaError> DeclarationsSink::qualifierType(QualifierType type, std::string_view) {
  declarations.qualifierTypes.push_back(std::move(type));
  return {};
}

Expected<void, SchemaError> DeclarationsSink::classDeclaration(ClassDeclaration declaration, std::string_view) {
  declarations.classes.push_back(std::move(declaration));
  return {};
}

Expected<void, SchemaError> DeclarationsSink::instance(InstanceDeclaration instance, std::string_view file) {
  return refuseInstance(instance, file);
}

Expected<void, SchemaError> parseMof(std::string_view text, std::string_view file, MofSink& sink,
                                     const MofIncluder& includer, const MofLimits& limits) {
  Budget budget{limits};
  try {
    parseText(text, file, sink, includer, budget);
  } catch (MofFailure& failure) {
    return unexpected(std::move(failure.error));
  }
  return {};
}

Expected<void, SchemaError> parseMofFile(const std::string& path, MofSink& sink, const MofLimits& limits) {
  const MofInclude top = readFile(path, limits.bytes);
  if (!top.error.empty()) return unexpected(SchemaError{path, 0, 0, "cannot read the file: " + top.error});
  return parseMof(
      top.text, path, sink,
      [&limits](std::string_view name, std::string_view from) {
        return readFile(besideFile(name, from), limits.bytes);
      },
      limits);
}

}  // namespace zorva::schema
