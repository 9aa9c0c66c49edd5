#pragma once

// Classes as elements of CIM-XML (DSP0201 2.4, DTD DSP0203 2.4.0). As ElementWriter.h: each function
// appends one element, keeps no state, and may be called on any thread.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "schema/ClassRepository.h"

namespace zorva::cimxml {

/// Which parts of a class are written (DSP0200 5.3.2.1).
struct ClassDetail {
  bool localOnly = true;
  bool qualifiers = true;
  bool classOrigin = false;
  /// Absent: all properties. Methods are not affected.
  std::optional<std::vector<std::string>> propertyList;
};

/// CLASS with its properties and methods. `classes` knows the qualifiers' types.
void appendClass(std::string& out, const schema::Class& declared, const ClassDetail& detail,
                 const schema::ClassRepository& classes);

/// CLASSNAME.
void appendClassName(std::string& out, std::string_view name);

/// CLASSPATH.
void appendClassPath(std::string& out, std::string_view host, std::string_view nameSpace, std::string_view name);

}  // namespace zorva::cimxml
