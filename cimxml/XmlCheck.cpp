#include "cimxml/XmlCheck.h"

#include <algorithm>
#include <charconv>

#include "util/Names.h"
#include "util/Utf8.h"

namespace zorva::cimxml {

namespace {

// After so many bytes the checker checks whether its time is over.
constexpr std::size_t kBytesBetweenLooks = std::size_t{64} << 10;

constexpr bool isSpace(char c) noexcept { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }

constexpr bool isXmlCharacter(std::uint32_t code) noexcept {
  return code == '\t' || code == '\n' || code == '\r' || (code >= 0x20 && code < 0xD800) ||
         (code >= 0xE000 && code <= 0x10FFFF && code != 0xFFFE && code != 0xFFFF);
}

class Checker {
 public:
  Checker(std::string_view text, const XmlLimits& limits) : text_(text), limits_(limits) {}

  Expected<void, XmlProblem> run() {
    if (!characters()) return unexpected(std::move(problem_));
    if (text_.starts_with("\xEF\xBB\xBF")) at_ = 3;
    nextLook_ = kBytesBetweenLooks;
    while (at_ < text_.size() && goesOn(at_) && content()) {
    }
    if (problem_.message.empty() && depth_ > 0) fail(text_.size(), "the text ends within an element");
    if (problem_.message.empty() && elements_ == 0) fail(text_.size(), "the text has no element");
    if (problem_.message.empty()) return {};
    return unexpected(std::move(problem_));
  }

 private:
  bool fail(std::size_t position, std::string message, bool isLimit = false) {
    problem_ = {position, std::move(message), isLimit};
    return false;
  }

  /// False once the time is over.
  bool goesOn(std::size_t position) {
    if (position < nextLook_) return true;
    nextLook_ = position + kBytesBetweenLooks;
    if (!limits_.isOver || !limits_.isOver()) return true;
    problem_ = {position, kTimeIsOver, false, true};
    return false;
  }

  /// Whether all is UTF-8, and allowed in XML.
  bool characters() {
    for (std::size_t i = 0; i < text_.size();) {
      if (!goesOn(i)) return false;
      const auto byte = static_cast<unsigned char>(text_[i]);
      if (byte >= 0x20 && byte < 0x80) {
        ++i;
        continue;
      }
      const std::size_t length = util::utf8Length(text_.substr(i));
      if (length == 0) return fail(i, "this is no UTF-8");
      if (!isXmlCharacter(util::utf8Decode(text_.substr(i)))) return fail(i, "XML 1.0 has no such character");
      i += length;
    }
    return true;
  }

  /// One piece of content, or one piece of markup.
  bool content() {
    const char c = text_[at_];
    if (c == '<') return markup();
    if (depth_ == 0) {
      if (!isSpace(c)) return fail(at_, "text outside the root element");
      ++at_;
      return true;
    }
    if (c == '&') return reference();
    at_ = std::min(text_.find_first_of("<&", at_), text_.size());
    return true;
  }

  bool markup() {
    const std::string_view rest = text_.substr(at_);
    if (rest.starts_with("<!--")) return skipTo("-->", 4, "a comment");
    if (rest.starts_with("<![CDATA[")) {
      if (depth_ == 0) return fail(at_, "text outside the root element");
      return skipTo("]]>", 9, "a CDATA section");
    }
    if (rest.starts_with("<?")) return instruction();
    if (rest.starts_with("<!")) return documentType();
    if (rest.starts_with("</")) return endTag();
    return startTag();
  }

  bool skipTo(std::string_view end, std::size_t opening, const char* what) {
    const std::size_t found = text_.find(end, at_ + opening);
    if (found == std::string_view::npos) return fail(at_, std::string(what) + " does not end");
    at_ = found + end.size();
    return true;
  }

  /// The XML declaration may name UTF-8, or its part US-ASCII, as the encoding.
  bool instruction() {
    const std::size_t begin = at_;
    if (!skipTo("?>", 2, "a processing instruction")) return false;
    const std::string_view piece = text_.substr(begin, at_ - begin);
    const std::size_t name = piece.find("encoding");
    if (!piece.starts_with("<?xml") || piece.size() < 6 || !isSpace(piece[5]) || name == std::string_view::npos) {
      return true;
    }
    const std::size_t open = piece.find_first_of("\"'", name);
    const std::size_t close = open == std::string_view::npos ? open : piece.find(piece[open], open + 1);
    if (close == std::string_view::npos) return fail(begin, "the XML declaration is malformed");
    const std::string_view encoding = piece.substr(open + 1, close - open - 1);
    if (util::sameName(encoding, "utf-8") || util::sameName(encoding, "us-ascii")) return true;
    return fail(begin, "the encoding is not UTF-8 but " + std::string(encoding.substr(0, 40)));
  }

  /// One without its own declarations has no effect.
  bool documentType() {
    if (!text_.substr(at_).starts_with("<!DOCTYPE") || elements_ > 0)
      return fail(at_, "a declaration within a document");
    const std::size_t end = text_.find_first_of("[>", at_);
    if (end == std::string_view::npos) return fail(at_, "the document type does not end");
    if (text_[end] == '[') return fail(end, "a document type with declarations is not taken");
    at_ = end + 1;
    return true;
  }

  bool endTag() {
    const std::size_t end = text_.find('>', at_);
    if (depth_ == 0 || end == std::string_view::npos) return fail(at_, "an end tag that ends nothing");
    --depth_;
    at_ = end + 1;
    return true;
  }

  bool startTag() {
    if (depth_ == 0 && elements_ > 0) return fail(at_, "a second root element");
    if (++elements_ > limits_.elements) {
      return fail(at_, "more than " + std::to_string(limits_.elements) + " elements", true);
    }
    const std::size_t begin = at_++;
    char quote = '\0';
    for (; at_ < text_.size(); ++at_) {
      const char c = text_[at_];
      if (c == '<') return fail(at_, "'<' within a tag");
      if (quote != '\0') {
        if (c == quote) quote = '\0';
        if (c == '&') {
          if (!reference()) return false;
          --at_;
        }
      } else if (c == '"' || c == '\'') {
        quote = c;
      } else if (c == '>') {
        break;
      }
    }
    if (at_ == text_.size()) return fail(begin, "a tag that does not end");
    const bool isEmpty = text_[at_ - 1] == '/';
    ++at_;
    if (isEmpty || ++depth_ <= limits_.depth) return true;
    return fail(begin, "elements nested deeper than " + std::to_string(limits_.depth), true);
  }

  bool reference() {
    const std::size_t end = text_.find(';', at_);
    // The longest is "&#1114111;"; leading zeros may make it a little longer.
    if (end == std::string_view::npos || end - at_ > 20) return fail(at_, "'&' that begins no reference");
    const std::string_view name = text_.substr(at_ + 1, end - at_ - 1);
    if (name.starts_with('#') ? !isCharacterReference(name.substr(1)) : !isKnownEntity(name)) {
      return fail(at_, "a reference to what is no character: &" + std::string(name) + ";");
    }
    at_ = end + 1;
    return true;
  }

  static bool isKnownEntity(std::string_view name) {
    constexpr std::string_view kNames[] = {"amp", "lt", "gt", "quot", "apos"};
    return std::find(std::begin(kNames), std::end(kNames), name) != std::end(kNames);
  }

  static bool isCharacterReference(std::string_view digits) {
    const bool isHex = digits.starts_with('x');
    if (isHex) digits.remove_prefix(1);
    std::uint32_t code = 0;
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), code, isHex ? 16 : 10);
    return result.ec == std::errc() && result.ptr == digits.data() + digits.size() && isXmlCharacter(code);
  }

  const std::string_view text_;
  const XmlLimits& limits_;
  std::size_t at_ = 0;
  std::size_t nextLook_ = kBytesBetweenLooks;
  std::size_t depth_ = 0;
  std::size_t elements_ = 0;
  XmlProblem problem_;
};

}  // namespace

Expected<void, XmlProblem> checkXml(std::string_view text, const XmlLimits& limits) {
  return Checker(text, limits).run();
}

std::string placeText(std::string_view text, std::size_t position) {
  const std::string_view before = text.substr(0, std::min(position, text.size()));
  const auto line = std::count(before.begin(), before.end(), '\n') + 1;
  const std::size_t lineBegin = before.rfind('\n') + 1;  // npos + 1 is 0
  return "line " + std::to_string(line) + ", column " + std::to_string(before.size() - lineBegin + 1);
}

}  // namespace zorva::cimxml
