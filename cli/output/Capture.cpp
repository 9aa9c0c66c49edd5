#include "cli/output/Capture.h"

namespace zorva::cli {

namespace {

thread_local Capture* ofThisThread = nullptr;

}  // namespace

Capture::Capture() { ofThisThread = this; }

Capture::~Capture() { ofThisThread = nullptr; }

Capture* Capture::current() noexcept { return ofThisThread; }

}  // namespace zorva::cli
