#pragma once

#include "cli/Arguments.h"

// The subcommands. Each does what its arguments say and writes to standard output; each throws Failure where it cannot.

namespace zorva::cli {

void showTree(const Arguments& arguments);
void showHost(const Arguments& arguments);
void listClasses(const Arguments& arguments);

void enumerateNames(const Arguments& arguments);
void enumerateInstances(const Arguments& arguments);
void getInstance(const Arguments& arguments);

}  // namespace zorva::cli
