#include "cli/output/Capture.h"

#include "cli/output/Console.h"

namespace zorva::cli {

namespace {

thread_local Capture* ofThisThread = nullptr;

}  // namespace

Capture::Capture() { ofThisThread = this; }

Capture::~Capture() { ofThisThread = nullptr; }

Capture* Capture::current() noexcept { return ofThisThread; }

void writeTable(const Table& table, const Layout& layout) {
  if (Capture* capture = Capture::current()) {
    capture->tables.push_back(table);
  } else {
    write(table.text(layout));
  }
}

}  // namespace zorva::cli
