#pragma once

#include <string>
#include <vector>

#include "NodeLexicon.h"

namespace ZV {

class Instrumentation {
 public:
  Instrumentation();
  virtual ~Instrumentation();

  void selectNode(NodeLexicon::NodeType type);
  void selectNode(const std::string& path);
  operator bool();
  void operator++();
  bool getProperty(NodeLexicon::Properties property, std::string& value);
  bool getProperty(NodeLexicon::Properties property, unsigned int& value);
  bool getProperty(NodeLexicon::Properties property, std::vector<std::string>& value);
  bool setProperty(NodeLexicon::Properties property, std::string& value);
  bool setProperty(NodeLexicon::Properties property, std::vector<std::string> value);
  std::string getPathToParentNode();
  std::string getNodeDescription();

 private:
  void* node_;
};

}  // namespace ZV
