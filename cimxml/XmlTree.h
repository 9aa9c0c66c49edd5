#pragma once

// A text as a tree of XML elements, the steps of a reader in it, and the errors of a reader. Only for the readers of
// this folder.

#include <cstddef>
#include <initializer_list>
#include <pugixml.hpp>
#include <set>
#include <string>
#include <string_view>

#include "cimxml/ReaderLimits.h"
#include "util/Names.h"

namespace zorva::cimxml {

/// Thrown to leave the reading. The functions that are called from outside this folder catch it.
struct Refusal {
  Fault fault;
  std::ptrdiff_t position;  ///< in bytes; negative: unknown
  std::string message;
};

[[noreturn]] void refuse(pugi::xml_node node, std::string message, Fault fault = Fault::NotLooselyValid);

/// The state of reading one text, including the texts embedded in it.
class Reading {
 public:
  /// `most` must outlive this.
  explicit Reading(const ReaderLimits& most) : limits(most) {}

  /// Call it for each element, so that the reading ends soon after its time is over.
  void step();

  const ReaderLimits& limits;

 private:
  unsigned steps_ = 0;
};

/// The parser options for all texts of this folder: everything except comments and processing instructions is kept, and
/// also blanks that are the only content of an element.
inline constexpr unsigned kParseFlags = pugi::parse_cdata | pugi::parse_escapes | pugi::parse_eol |
                                        pugi::parse_wconv_attribute | pugi::parse_ws_pcdata_single;

/// Checks a text and parses it. `document` refers to `buffer`.
void parse(std::string_view text, Reading& reading, std::string& buffer, pugi::xml_document& document);

bool is(pugi::xml_node node, const char* name) noexcept;

inline bool isElement(pugi::xml_node node) noexcept { return node.type() == pugi::node_element; }

/// Whether the name of the element is one of several.
bool isOneOf(pugi::xml_node node, std::initializer_list<const char*> names) noexcept;

/// The name of an element for a message.
std::string elementName(pugi::xml_node node);

/// The first child element with one of these names; other elements are skipped.
pugi::xml_node firstOf(pugi::xml_node node, std::initializer_list<const char*> names);

/// The same; an error if there is none.
pugi::xml_node required(pugi::xml_node node, std::initializer_list<const char*> names);

/// The text in double quotes for a message, cut to a length that one can read.
std::string quoted(std::string_view text);

/// `text` without blanks at either end.
std::string_view trimmed(std::string_view text) noexcept;

/// Counts repeated elements, and refuses one too many.
class Count {
 public:
  Count(std::size_t most, const char* what) : most_(most), what_(what) {}

  /// `node` is one more, within `outer`.
  void add(pugi::xml_node node, pugi::xml_node outer);

 private:
  const std::size_t most_;
  const char* const what_;
  std::size_t count_ = 0;
};

/// Names that may be there only once in one element.
class UniqueNames {
 public:
  /// `name` must live as long as this object.
  void add(pugi::xml_node node, const char* what, std::string_view name);

 private:
  /// Ordered, not hashed: a client that knows the hash could choose names that collide.
  std::set<std::string_view, util::NameLess> names_;
};

}  // namespace zorva::cimxml
