#include "cli/output/ResultWriter.h"

#include <string>

#include "cimxml/ElementWriter.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonDocument.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/MofOutput.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"

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
      table.add({property.name, property.value.isNull ? "-" : valueText(property.value, property.declaration)});
    }
    write(table.text(layout_));
  }

  void add(const broker::ObjectPath& path) override { write(printable(shortPathText(path)) + "\n"); }

 private:
  Layout layout_;
  bool any_ = false;
};

/// Rows, to be put together with those of other hosts.
class RowsWriter : public ResultWriter {
 public:
  RowsWriter(const Layout& layout, Results results)
      : layout_(layout),
        table_(results == Results::Names ? std::vector<std::string>{"OBJECT"}
                                         : std::vector<std::string>{"OBJECT", "PROPERTY", "VALUE"}) {}

  void add(const broker::Instance& instance) override {
    const std::string name = shortPathText(instance.path);
    for (const broker::Property& property : instance.properties) {
      table_.add({name, property.name, property.value.isNull ? "-" : valueText(property.value, property.declaration)});
    }
  }

  void add(const broker::ObjectPath& path) override { table_.add({shortPathText(path)}); }

  void finish() override { writeTable(table_, layout_); }

 private:
  Layout layout_;
  Table table_;
};

/// A single instance, or a document whose list is written while it comes.
class JsonWriter : public ResultWriter {
 public:
  explicit JsonWriter(Count count) : count_(count) {}

  void add(const broker::Instance& instance) override {
    if (count_ == Count::One) return write(instanceDocument(instance) + "\n");
    addText(instanceJson(instance, 4));
  }
  void add(const broker::ObjectPath& path) override { addText(pathJson(path)); }

  void finish() override {
    if (count_ == Count::One) return;
    if (!any_) write(begin_);
    write(any_ ? "\n  ]\n}\n" : "]\n}\n");
  }

 private:
  void addText(const std::string& text) {
    write(any_ ? std::string(",") : begin_);
    any_ = true;
    write("\n    " + text);
  }

  const std::string begin_ = "{\n  \"version\": " + std::to_string(kJsonVersion) + ",\n  \"results\": [";
  Count count_;
  bool any_ = false;
};

class MofWriter : public ResultWriter {
 public:
  void add(const broker::Instance& instance) override {
    if (any_) write("\n");
    any_ = true;
    write(instanceMof(instance));
  }

 private:
  bool any_ = false;
};

/// A declaration document: instances with their paths, which any CIM-XML reader accepts.
class XmlWriter : public ResultWriter {
 public:
  void add(const broker::Instance& instance) override {
    begin();
    std::string element = "<VALUE.OBJECTWITH";
    const bool isLocal = instance.path.host.empty();
    element += isLocal ? "LOCALPATH>" : "PATH>";
    cimxml::appendInstancePath(element, instance.path);
    cimxml::appendInstance(element, instance);
    write(element + (isLocal ? "</VALUE.OBJECTWITHLOCALPATH>\n" : "</VALUE.OBJECTWITHPATH>\n"));
  }

  void finish() override {
    begin();
    write("</DECLGROUP.WITHPATH></DECLARATION></CIM>\n");
  }

 private:
  void begin() {
    if (begun_) return;
    begun_ = true;
    write(
        "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n"
        "<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.4\"><DECLARATION><DECLGROUP.WITHPATH>\n");
  }

  bool begun_ = false;
};

}  // namespace

std::unique_ptr<ResultWriter> makeResultWriter(OutputFormat format, const Layout& layout, Count count,
                                               Results results) {
  if (results == Results::Names && (format == OutputFormat::Mof || format == OutputFormat::Xml)) {
    throw Failure(ExitCode::WrongUsage, std::string("names of instances cannot be written as ") + formatName(format),
                  "use --output json, or ask for the instances themselves");
  }
  switch (format) {
    case OutputFormat::Table:
      if (layout.rowsAlone) return std::make_unique<RowsWriter>(layout, results);
      return std::make_unique<TableWriter>(layout);
    case OutputFormat::Json:
      return std::make_unique<JsonWriter>(count);
    case OutputFormat::Mof:
      return std::make_unique<MofWriter>();
    case OutputFormat::Xml:
      return std::make_unique<XmlWriter>();
    default:
      break;
  }
  throw Failure(ExitCode::WrongUsage, std::string("--output ") + formatName(format) + " does not fit these results");
}

}  // namespace zorva::cli
