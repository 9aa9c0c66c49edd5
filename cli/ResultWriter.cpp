#include "cli/ResultWriter.h"

#include <algorithm>
#include <string>

#include "cli/Failure.h"
#include "cli/JsonOutput.h"
#include "cli/Session.h"
#include "cli/Text.h"
#include "cli/ValueText.h"

namespace zorva::cli {

namespace {

class TableWriter : public ResultWriter {
 public:
  explicit TableWriter(const Layout& layout) : layout_(layout) {}

  void add(const broker::Instance& instance) override {
    if (any_) write("\n");
    any_ = true;
    write(styled(printable(shortPathText(instance.path)), Style::Heading, layout_) + "\n");
    Table table({}, 2);
    for (const broker::Property& property : instance.properties) {
      table.add({property.name, valueText(property.value, property.declaration)});
    }
    write(table.text(layout_));
  }

  void add(const broker::ObjectPath& path) override { write(printable(shortPathText(path)) + "\n"); }

 private:
  Layout layout_;
  bool any_ = false;
};

class JsonWriter : public ResultWriter {
 public:
  explicit JsonWriter(Count count) : count_(count) {}

  void add(const broker::Instance& instance) override { addText(instanceJson(instance, isList() ? 2 : 0)); }
  void add(const broker::ObjectPath& path) override { addText(pathJson(path)); }

  void finish() override {
    if (isList()) write(any_ ? "\n]\n" : "[]\n");
    if (!isList() && any_) write("\n");
  }

 private:
  bool isList() const noexcept { return count_ == Count::Many; }

  void addText(const std::string& text) {
    if (isList()) write(any_ ? ",\n  " : "[\n  ");
    any_ = true;
    write(text);
  }

  Count count_;
  bool any_ = false;
};

}  // namespace

std::unique_ptr<ResultWriter> makeResultWriter(OutputFormat format, const Layout& layout, Count count) {
  switch (format) {
    case OutputFormat::Table:
      return std::make_unique<TableWriter>(layout);
    case OutputFormat::Json:
      return std::make_unique<JsonWriter>(count);
    default:
      break;
  }
  throw Failure(ExitCode::WrongUsage, std::string("--output ") + formatName(format) + " does not fit these results");
}

void requireFormat(OutputFormat format, std::initializer_list<OutputFormat> allowed, const char* subcommand) {
  if (std::find(allowed.begin(), allowed.end(), format) != allowed.end()) return;
  std::vector<std::string> names;
  for (const OutputFormat each : allowed) names.emplace_back(formatName(each));
  throw Failure(ExitCode::WrongUsage, std::string("zorvactl ") + subcommand + " has no output as " + formatName(format),
                "it writes " + joined(names, ", "));
}

}  // namespace zorva::cli
