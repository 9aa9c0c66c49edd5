#pragma once

// The base of classes whose objects are neither copied nor moved: others hold a pointer to them, or their destructor
// undoes something.

namespace zorva::util {

class NotCopied {
 public:
  NotCopied(const NotCopied&) = delete;
  NotCopied& operator=(const NotCopied&) = delete;

 protected:
  NotCopied() = default;
  ~NotCopied() = default;
};

}  // namespace zorva::util
