#include "access/Users.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <utility>

#include "util/Names.h"
#include "util/Text.h"
#include "util/Utf8.h"

namespace zorva::access {

namespace {

constexpr std::size_t kLongestLine = 4096;
constexpr std::size_t kLongestName = 64;
constexpr std::size_t kLongestNameSpace = 200;
constexpr std::size_t kMostNameSpaces = 64;
constexpr std::size_t kMostFingerprints = 16;
constexpr std::size_t kFingerprintLength = 64;
constexpr std::string_view kFingerprintField = "fingerprint=";
constexpr std::string_view kSubjectField = "subject=";

constexpr std::array<std::pair<std::string_view, Role>, 3> kRoles{
    {{"none", Role::None}, {"read", Role::Read}, {"operate", Role::Operate}}};

constexpr bool isLetterOrDigit(char c) noexcept {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
}

constexpr bool isControl(char c) noexcept { return static_cast<unsigned char>(c) < 0x20 || c == 0x7F; }

[[noreturn]] void refuse(const std::string& what) { throw std::invalid_argument(what); }

/// Takes the text up to the separator, and the separator.
std::string_view takeField(std::string_view& rest, char separator) {
  const std::size_t end = std::min(rest.find(separator), rest.size());
  const std::string_view field = rest.substr(0, end);
  rest.remove_prefix(std::min(end + 1, rest.size()));
  return field;
}

Role requiredRole(std::string_view word, const char* where) {
  const auto role = roleOf(word);
  if (!role) refuse(std::string(where) + " must be read, operate or none");
  return *role;
}

/// "root/cimv2=operate,interop=none"
void readNameSpaces(std::string_view field, Grants& grants) {
  while (!field.empty()) {
    std::string_view one = takeField(field, ',');
    const std::string_view name = takeField(one, '=');
    if (!isNameSpaceName(name)) refuse("a field after the role is neither NAMESPACE=ROLE nor of a certificate");
    if (grants.byNameSpace().count(name) != 0) refuse("a namespace is there twice");
    if (grants.byNameSpace().size() == kMostNameSpaces) refuse("there are more than 64 namespaces");
    grants.set(std::string(name), requiredRole(one, "the role in a namespace"));
  }
}

void readFingerprint(std::string_view text, User& user) {
  std::string fingerprint = canonicalFingerprint(text);
  if (fingerprint.empty()) refuse("a fingerprint must be 64 hexadecimal digits");
  if (user.fingerprints.size() == kMostFingerprints) refuse("there are more than 16 fingerprints");
  user.fingerprints.push_back(std::move(fingerprint));
}

void readSubject(std::string_view text, User& user) {
  user.subject = canonicalSubject(text);
  if (user.subject.empty()) refuse("the subject must be a distinguished name such as CN=alice,O=Example");
}

/// Throws std::invalid_argument. Its text contains nothing of the line but the name: a hash may be anywhere in it.
User readUser(std::string_view line) {
  User user;
  const std::string_view name = takeField(line, ':');
  if (!isUserName(name)) {
    refuse("the name must be 1 to 64 of A-Z a-z 0-9 . _ @ - and begin with a letter or a digit");
  }
  user.name = name;
  user.hash = takeField(line, ':');
  if (user.hash != kNoPassword && !isPasswordHash(user.hash)) {
    refuse("the hash of " + user.name + " must be * or a hash by yescrypt as zorvactl user makes it");
  }
  user.grants = Grants(requiredRole(takeField(line, ':'), "the role"));
  while (!line.empty()) {
    if (line.starts_with(kSubjectField)) {
      readSubject(line.substr(kSubjectField.size()), user);
      break;
    }
    const std::string_view field = takeField(line, ':');
    if (field.starts_with(kFingerprintField)) {
      readFingerprint(field.substr(kFingerprintField.size()), user);
    } else {
      readNameSpaces(field, user.grants);
    }
  }
  return user;
}

std::string lineOf(const User& user) {
  std::string line = user.name + ":" + user.hash + ":" + std::string(wordOf(user.grants.everywhere()));
  char separator = ':';
  for (const auto& [name, role] : user.grants.byNameSpace()) {
    line += separator + name + "=" + std::string(wordOf(role));
    separator = ',';
  }
  for (const std::string& each : user.fingerprints) line += ":" + std::string(kFingerprintField) + each;
  if (!user.subject.empty()) line += ":" + std::string(kSubjectField) + user.subject;
  return line;
}

/// The position of the first of these characters without a backslash before it.
std::size_t findUnescaped(std::string_view text, std::string_view characters) {
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\') {
      ++i;
    } else if (characters.find(text[i]) != std::string_view::npos) {
      return i;
    }
  }
  return std::string_view::npos;
}

/// Blanks around it that no backslash protects do not count (RFC 4514 2.4).
std::string_view withoutBlanks(std::string_view text) {
  text = text.substr(std::min(text.find_first_not_of(' '), text.size()));
  while (text.ends_with(' ') && !text.ends_with("\\ ")) text.remove_suffix(1);
  return text;
}

/// "cn = alice" as "CN=alice"; empty if it is none.
std::string canonicalPart(std::string_view part) {
  const std::size_t equals = part.find('=');
  if (equals == std::string_view::npos) return {};
  std::string type(withoutBlanks(part.substr(0, equals)));
  const bool isType = !type.empty() && std::all_of(type.begin(), type.end(),
                                                   [](char c) { return isLetterOrDigit(c) || c == '.' || c == '-'; });
  if (!isType) return {};
  for (char& c : type) {
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
  }
  return type + "=" + std::string(withoutBlanks(part.substr(equals + 1)));
}

}  // namespace

bool isUserName(std::string_view text) noexcept {
  return !text.empty() && text.size() <= kLongestName && isLetterOrDigit(text.front()) &&
         std::all_of(text.begin(), text.end(),
                     [](char c) { return isLetterOrDigit(c) || c == '.' || c == '_' || c == '@' || c == '-'; });
}

bool isNameSpaceName(std::string_view text) noexcept {
  return !text.empty() && text.size() <= kLongestNameSpace && text.front() != '/' && text.back() != '/' &&
         std::all_of(text.begin(), text.end(),
                     [](char c) { return isLetterOrDigit(c) || c == '/' || c == '_' || c == '.' || c == '-'; });
}

std::optional<Role> roleOf(std::string_view word) noexcept {
  for (const auto& [name, role] : kRoles) {
    if (name == word) return role;
  }
  return std::nullopt;
}

std::string_view wordOf(Role role) noexcept {
  for (const auto& [name, known] : kRoles) {
    if (known == role) return name;
  }
  return "none";
}

std::string canonicalFingerprint(std::string_view text) {
  std::string fingerprint;
  for (const char c : text.substr(0, 4 * kFingerprintLength)) {
    if (c == ':' || c == ' ') continue;
    const char digit = util::lowerAscii(c);
    if ((digit < '0' || digit > '9') && (digit < 'a' || digit > 'f')) return {};
    fingerprint += digit;
  }
  return fingerprint.size() == kFingerprintLength ? fingerprint : std::string();
}

std::string canonicalSubject(std::string_view text) {
  constexpr std::size_t kLongest = 1024;
  if (text.size() > kLongest || !util::isUtf8(text) || std::any_of(text.begin(), text.end(), isControl)) return {};
  std::string subject;
  while (!text.empty()) {
    const std::size_t end = std::min(findUnescaped(text, ",+"), text.size());
    const std::string part = canonicalPart(text.substr(0, end));
    if (part.empty() || end + 1 == text.size()) return {};
    subject += part;
    if (end == text.size()) break;
    subject += text[end];
    text.remove_prefix(end + 1);
  }
  return subject;
}

Users::Users(const std::string& text, const std::string& file) {
  std::size_t number = 1;
  try {
    if (text.size() > kLargest) refuse("the file is larger than 1 MiB");
    for (std::string_view rest = text; !rest.empty(); ++number) {
      if (number > kMostLines) refuse("the file has more than 10,000 lines");
      addLine(takeField(rest, '\n'));
    }
  } catch (const std::invalid_argument& error) {
    throw UsersError(file + ":" + std::to_string(number) + ": " + error.what());
  }
}

void Users::addLine(std::string_view line) {
  if (line.size() > kLongestLine) refuse("the line is longer than 4096 bytes");
  if (!util::isUtf8(line)) refuse("the line is not UTF-8");
  lines_.emplace_back(line);
  if (line.empty() || line.front() == '#' || util::trimmed(line).empty()) return;
  if (std::any_of(line.begin(), line.end(), isControl)) refuse("the line has a control character");
  User user = readUser(line);
  if (users_.count(user.name) != 0) refuse("the user " + user.name + " is there twice");
  index(std::move(user), lines_.size() - 1);
}

/// Changes nothing if a certificate belongs to another user.
void Users::index(User user, std::size_t line) {
  const auto refuseOthers = [&](const auto& names, const std::string& key, const char* what) {
    const auto found = names.find(key);
    if (found != names.end() && found->second != user.name) {
      refuse(std::string("the ") + what + " of " + user.name + " is also of the user " + found->second);
    }
  };
  for (const std::string& each : user.fingerprints) refuseOthers(byFingerprint_, each, "fingerprint");
  if (!user.subject.empty()) refuseOthers(bySubject_, user.subject, "subject");
  for (const std::string& each : user.fingerprints) byFingerprint_[each] = user.name;
  if (!user.subject.empty()) bySubject_[user.subject] = user.name;
  const std::string name = user.name;
  users_.insert_or_assign(name, Entry{std::move(user), line});
}

void Users::forget(const User& user) {
  for (const std::string& each : user.fingerprints) byFingerprint_.erase(each);
  bySubject_.erase(user.subject);
}

std::vector<const User*> Users::all() const {
  std::vector<const User*> all;
  all.reserve(users_.size());
  for (const auto& [name, entry] : users_) all.push_back(&entry.user);
  return all;
}

const User* Users::find(std::string_view name) const {
  const auto found = users_.find(name);
  return found == users_.end() ? nullptr : &found->second.user;
}

const User* Users::ofCertificate(const Certificate& certificate) const {
  const auto print = byFingerprint_.find(certificate.fingerprint);
  if (print != byFingerprint_.end()) return find(print->second);
  const auto subject = bySubject_.find(canonicalSubject(certificate.subject));
  return subject == bySubject_.end() ? nullptr : find(subject->second);
}

void Users::put(const User& user) {
  const std::string line = lineOf(user);
  // Whatever is written can be read again.
  readUser(line);
  if (line.size() > kLongestLine) refuse("the line of " + user.name + " would be longer than 4096 bytes");
  Users changed = *this;
  const User* old = changed.find(user.name);
  const std::size_t place = old == nullptr ? lines_.size() : users_.find(user.name)->second.line;
  if (old != nullptr) changed.forget(*old);
  changed.index(user, place);
  if (place == lines_.size()) changed.lines_.emplace_back();
  changed.lines_[place] = line;
  if (changed.lines_.size() > kMostLines || changed.text().size() > kLargest) {
    refuse("the file of users would be too large");
  }
  *this = std::move(changed);
}

bool Users::remove(std::string_view name) {
  const auto found = users_.find(name);
  if (found == users_.end()) return false;
  forget(found->second.user);
  lines_[found->second.line].reset();
  users_.erase(found);
  return true;
}

std::string Users::text() const {
  std::string text;
  for (const auto& line : lines_) {
    if (line) text += *line + "\n";
  }
  return text;
}

}  // namespace zorva::access
