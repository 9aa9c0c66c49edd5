#include "cimxml/ResponseWriter.h"

#include <utility>

#include "cimxml/XmlText.h"

namespace zorva::cimxml {

ResponseWriter::ResponseWriter(std::string& buffer, std::size_t most, Drain drain)
    : buffer_(buffer), most_(most), drain_(std::move(drain)) {
  buffer_.clear();
}

void ResponseWriter::drain() {
  drain_(buffer_);
  buffer_.clear();
  isPartlyGone_ = true;
}

void ResponseWriter::beginMessage(std::string_view id, bool isMultiple) {
  isMultiple_ = isMultiple;
  buffer_ += R"(<?xml version="1.0" encoding="utf-8"?>)"
             "\n"
             R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE)";
  appendAttribute(buffer_, "ID", id);
  buffer_ += R"( PROTOCOLVERSION="1.0">)";
  if (isMultiple) buffer_ += "<MULTIRSP>";
}

void ResponseWriter::endMessage() {
  if (isMultiple_) buffer_ += "</MULTIRSP>";
  buffer_ += "</MESSAGE></CIM>\n";
  drain();
}

void ResponseWriter::beginResponse(std::string_view method, bool isExtrinsic) {
  isExtrinsic_ = isExtrinsic;
  buffer_ += isExtrinsic ? "<SIMPLERSP><METHODRESPONSE" : "<SIMPLERSP><IMETHODRESPONSE";
  appendAttribute(buffer_, "NAME", method);
  buffer_ += '>';
  responseBegin_ = buffer_.size();
  isPartlyGone_ = false;
}

void ResponseWriter::endResponse() {
  buffer_ += isExtrinsic_ ? "</METHODRESPONSE></SIMPLERSP>" : "</IMETHODRESPONSE></SIMPLERSP>";
}

bool ResponseWriter::putError(std::uint32_t code, std::string_view description) {
  if (isPartlyGone_) return false;
  buffer_.resize(responseBegin_);
  buffer_ += "<ERROR";
  appendAttribute(buffer_, "CODE", std::to_string(code));
  if (!description.empty()) appendAttribute(buffer_, "DESCRIPTION", description);
  buffer_ += "/>";
  return true;
}

}  // namespace zorva::cimxml
