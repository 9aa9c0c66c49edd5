#pragma once

// VALUE.NAMEDINSTANCE of instances as providers made them, without plain values between the two.

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "broker/objects/Convert.h"
#include "broker/objects/Objects.h"
#include "cimxml/ElementWriter.h"
#include "util/NotCopied.h"

namespace zorva::cimxml {

/// Writes many instances. The text around the values is made once and used again while the instances have the same
/// class and the same properties in the same order. Used by one thread at a time.
class ObjectWriter {
 public:
  explicit ObjectWriter(const InstanceDetail& detail) : instances_(detail) {}

  /// Appends an instance with its name. `wanted` is the same for all objects of a class.
  void append(std::string& out, const broker::InstanceObject& object, const broker::PropertyMask& wanted);

  /// Objects of a new request may come with other masks. A form of all properties stays good for as long as the classes
  /// do.
  void beginRequest() noexcept {
    if (wanted_ != nullptr) info_ = nullptr;
  }

  /// Whether there is a form that the next instance may fit.
  bool hasForm() const noexcept { return info_ != nullptr; }

 private:
  enum class Kind {
    Key,    ///< the content of a KEYVALUE
    Plain,  ///< the content of a VALUE, which the form has; left out with it if it is null
    Other,  ///< everything that a value may be
  };
  struct Hole {
    Kind kind;
    std::uint32_t slot;  ///< of the object
    std::size_t place;   ///< in text_
  };

  bool fits(const broker::InstanceObject& object, const broker::PropertyMask& wanted) const noexcept;
  void makeForm(const broker::InstanceObject& object, const broker::PropertyMask& wanted);
  void addName(const broker::InstanceObject& object);
  void addProperties(const broker::InstanceObject& object, const broker::PropertyMask& wanted);
  void fillForm(std::string& out, const broker::InstanceObject& object);

  InstanceWriter instances_;
  broker::Instance instance_;
  broker::Value value_;
  const broker::ClassInfo* info_ = nullptr;
  const std::uint64_t* wanted_ = nullptr;
  std::vector<const broker::PropertyInfo*> slots_;  ///< the properties that are set, in their order
  std::string text_;
  std::vector<Hole> holes_;  ///< the keys first
};

/// Writers without details that nobody uses now, with the forms that they made: to make one costs as much as to write a
/// dozen instances. Thread-safe. It lives no longer than the classes.
class ObjectWriters : util::NotCopied {
  struct Entry {
    std::string className;  ///< that it was used for
    ObjectWriter writer{InstanceDetail()};
  };

 public:
  /// More are not kept.
  static constexpr std::size_t kMost = 16;

  ObjectWriters() { idle_.reserve(kMost); }

  /// How many are kept now.
  std::size_t size() const;

  /// A writer that goes back when this ends.
  class Loan : util::NotCopied {
   public:
    Loan(ObjectWriters& from, std::string_view className) : from_(from), lent_(from.take(className)) {}
    ~Loan() { from_.giveBack(std::move(lent_)); }
    ObjectWriter& operator*() noexcept { return lent_->writer; }

   private:
    ObjectWriters& from_;
    std::unique_ptr<Entry> lent_;
  };

 private:
  std::unique_ptr<Entry> take(std::string_view className);
  void giveBack(std::unique_ptr<Entry> entry) noexcept;

  mutable std::mutex mutex_;
  std::vector<std::unique_ptr<Entry>> idle_;
};

}  // namespace zorva::cimxml
