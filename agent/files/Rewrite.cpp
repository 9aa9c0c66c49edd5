#include "agent/files/Rewrite.h"

#include <algorithm>
#include <iterator>

namespace zorva::agent {
namespace {

// These begin a line with a new value.
constexpr std::string_view kChangeable[] = {"HOSTNAME=", "DOMAINNAME=", "DNSSERVERS=", "CONFIG_NAME=", "DNSSUFFIXES="};
constexpr std::size_t kLongestPiece = 511;

template <typename Fits>
bool anyKey(Fits fits) {
  return std::any_of(std::begin(kChangeable), std::end(kChangeable), fits);
}

std::string_view takePiece(std::string_view& text) {
  const std::size_t end = text.substr(0, kLongestPiece).find('\n');
  const std::string_view piece = text.substr(0, end == std::string_view::npos ? kLongestPiece : end + 1);
  text.remove_prefix(piece.size());
  return piece;
}

bool holdsKey(std::string_view piece) {
  return anyKey([piece](std::string_view key) {
    key.remove_suffix(1);
    return piece.find(key) != std::string_view::npos;
  });
}

bool beginsWithKey(std::string_view line) {
  return anyKey([line](std::string_view key) { return line.starts_with(key); });
}

bool mayBeginWithKey(std::string_view cut) {
  return beginsWithKey(cut) || anyKey([cut](std::string_view key) { return key.starts_with(cut); });
}

}  // namespace

Rewrite compareRewrite(std::string_view before, std::string_view now) {
  while (!before.empty()) {
    const std::string_view piece = takePiece(before);
    if (now.starts_with(piece)) {
      now.remove_prefix(piece.size());
      continue;
    }
    if (piece.starts_with(now)) return Rewrite::CutShort;
    if (!holdsKey(piece)) return Rewrite::Foreign;
    const std::size_t end = now.find('\n');
    if (end == std::string_view::npos) return mayBeginWithKey(now) ? Rewrite::CutShort : Rewrite::Foreign;
    if (!beginsWithKey(now)) return Rewrite::Foreign;
    now.remove_prefix(end + 1);
  }
  return now.empty() ? Rewrite::Whole : Rewrite::Foreign;
}

}  // namespace zorva::agent
