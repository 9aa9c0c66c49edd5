#include "cimxml/XmlTree.h"

#include <algorithm>
#include <cstring>

#include "util/Text.h"
#include "util/Utf8.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

// After so many steps the reader checks whether its time is over.
constexpr unsigned kStepsBetweenLooks = 256;

/// In XML all attributes of an element must have different names.
void checkAttributes(const Reading& reading, xml_node node) {
  std::size_t count = 0;
  for (pugi::xml_attribute one = node.first_attribute(); one; one = one.next_attribute()) {
    if (++count <= reading.limits.attributes) continue;
    refuse(node,
           std::string(node.name()) + " has more than " + std::to_string(reading.limits.attributes) + " attributes");
  }
  for (const pugi::xml_attribute one : node.attributes()) {
    for (pugi::xml_attribute other = one.next_attribute(); other; other = other.next_attribute()) {
      if (std::strcmp(one.name(), other.name()) == 0) {
        refuse(node, std::string(node.name()) + " has the attribute " + one.name() + " twice", Fault::NotWellFormed);
      }
    }
  }
}

class AttributeWalk : public pugi::xml_tree_walker {
 public:
  explicit AttributeWalk(Reading& reading) : reading_(reading) {}

  bool for_each(xml_node& node) override {
    reading_.step();
    checkAttributes(reading_, node);
    return true;
  }

 private:
  Reading& reading_;
};

}  // namespace

void refuse(xml_node node, std::string message, Fault fault) {
  throw Refusal{fault, node.offset_debug(), std::move(message)};
}

void Reading::step() {
  if (++steps_ % kStepsBetweenLooks != 0 || !limits.xml.isOver || !limits.xml.isOver()) return;
  throw Refusal{Fault::TimeIsOver, -1, kTimeIsOver};
}

void parse(std::string_view text, Reading& reading, std::string& buffer, pugi::xml_document& document) {
  if (const auto checked = checkXml(text, reading.limits.xml); !checked) {
    const XmlProblem& problem = checked.error();
    if (problem.isOver) throw Refusal{Fault::TimeIsOver, -1, problem.message};
    throw Refusal{Fault::NotWellFormed, static_cast<std::ptrdiff_t>(problem.position), problem.message};
  }
  buffer.assign(text);
  const pugi::xml_parse_result result =
      document.load_buffer_inplace(buffer.data(), buffer.size(), kParseFlags, pugi::encoding_utf8);
  if (!result) throw Refusal{Fault::NotWellFormed, result.offset, result.description()};
  AttributeWalk walk(reading);
  document.traverse(walk);
}

bool is(xml_node node, const char* name) noexcept { return std::strcmp(node.name(), name) == 0; }

bool isOneOf(xml_node node, std::initializer_list<const char*> names) noexcept {
  return std::any_of(names.begin(), names.end(), [node](const char* name) { return is(node, name); });
}

std::string quoted(std::string_view text) { return "\"" + std::string(text.substr(0, util::utf8Cut(text, 80))) + "\""; }

std::string elementName(xml_node node) { return node ? node.name() : "nothing"; }

xml_node firstOf(xml_node node, std::initializer_list<const char*> names) {
  for (const xml_node child : node.children()) {
    if (isElement(child) && isOneOf(child, names)) return child;
  }
  return {};
}

xml_node required(xml_node node, std::initializer_list<const char*> names) {
  const xml_node found = firstOf(node, names);
  if (found) return found;
  std::string wanted;
  for (const char* name : names) wanted += (wanted.empty() ? "" : " or ") + std::string(name);
  refuse(node, std::string(node.name()) + " has no " + wanted);
}

std::string_view trimmed(std::string_view text) noexcept { return util::trimmed(text, util::kWhiteSpace); }

void Count::add(xml_node node, xml_node outer) {
  if (++count_ <= most_) return;
  refuse(node, std::string(outer.name()) + " has more than " + std::to_string(most_) + " " + what_);
}

void UniqueNames::add(xml_node node, const char* what, std::string_view name) {
  if (!names_.insert(name).second) refuse(node, std::string("the ") + what + " " + quoted(name) + " is given twice");
}

}  // namespace zorva::cimxml
