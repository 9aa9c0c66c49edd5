#include "cli/output/JsonDocument.h"

#include "cli/output/Text.h"

namespace zorva::cli {

std::string documentText(const Json& content) {
  Json document;
  document["version"] = kJsonVersion;
  if (content.is_object()) {
    document.update(content);
  } else {
    document["results"] = content;
  }
  return document.dump(2);
}

Json jsonOfTexts(const std::vector<std::string>& texts) {
  Json list = Json::array();
  for (const std::string& text : texts) list.push_back(asUtf8(text));
  return list;
}

}  // namespace zorva::cli
