#pragma once

// Plain values as CMPI objects and back, by CMPI alone: what a provider that is part of the program needs. The objects
// belong to the request in which they are made.

#include <cmpidt.h>
#include <cmpift.h>

#include "broker/objects/Value.h"

namespace zorva::cimom {

/// Null if the broker refuses it.
CMPIObjectPath* makePath(const CMPIBroker* broker, const broker::ObjectPath& path);
CMPIInstance* makeInstance(const CMPIBroker* broker, const broker::Instance& instance);

/// The empty path for null. Keys are texts, booleans, whole numbers and references; others are null.
broker::ObjectPath readPath(const CMPIObjectPath* path);

}  // namespace zorva::cimom
