#include "util/Nearest.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include "util/Names.h"

namespace zorva::util {
namespace {

constexpr std::size_t kLongestWord = 64;

using Row = std::array<std::size_t, kLongestWord + 1>;

bool same(char a, char b) { return lowerAscii(a) == lowerAscii(b); }

/// The number of edits (optimal string alignment). Neither is longer than kLongestWord.
std::size_t edits(std::string_view from, std::string_view to) {
  Row before{};
  Row last{};
  Row now{};
  for (std::size_t j = 0; j <= to.size(); ++j) last[j] = j;
  for (std::size_t i = 1; i <= from.size(); ++i) {
    now[0] = i;
    for (std::size_t j = 1; j <= to.size(); ++j) {
      const std::size_t replaced = last[j - 1] + (same(from[i - 1], to[j - 1]) ? 0 : 1);
      now[j] = std::min({replaced, last[j] + 1, now[j - 1] + 1});
      const bool areExchanged = i > 1 && j > 1 && same(from[i - 1], to[j - 2]) && same(from[i - 2], to[j - 1]);
      if (areExchanged) now[j] = std::min(now[j], before[j - 2] + 1);
    }
    before = last;
    last = now;
  }
  return last[to.size()];
}

}  // namespace

std::string nearest(std::string_view word, const std::vector<std::string>& candidates) {
  if (word.empty() || word.size() > kLongestWord) return {};
  std::size_t least = std::max<std::size_t>(1, word.size() / 3) + 1;
  std::string found;
  for (const std::string& candidate : candidates) {
    if (candidate.empty() || candidate.size() > kLongestWord) continue;
    const std::size_t count = edits(word, candidate);
    // An edit of all characters makes any word of any other.
    if (count >= least || count >= candidate.size()) continue;
    least = count;
    found = candidate;
  }
  return found;
}

std::string didYouMean(std::string_view word, const std::vector<std::string>& candidates) {
  const std::string found = nearest(word, candidates);
  return found.empty() ? found : "did you mean " + found + "?";
}

}  // namespace zorva::util
