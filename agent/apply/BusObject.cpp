#include "agent/apply/BusObject.h"

#include "agent/sources/BusNames.h"

namespace zorva::agent {

void BusWriter::keep(int result) {
  if (result_ >= 0) result_ = result;
}

void BusWriter::basic(char type, const void* value) {
  if (result_ >= 0) keep(::sd_bus_message_append_basic(message_, type, value));
}

void BusWriter::flag(bool value) {
  const int number = value ? 1 : 0;
  basic(SD_BUS_TYPE_BOOLEAN, &number);
}

void BusWriter::bytes(const std::vector<unsigned char>& value) {
  if (result_ >= 0) keep(::sd_bus_message_append_array(message_, SD_BUS_TYPE_BYTE, value.data(), value.size()));
}

Expected<void, std::string> BusObject::call(const std::string& interface, const std::string& member, const Fill& fill,
                                            const Read& read) const {
  const auto fillMessage = [&](sd_bus_message* message) {
    BusWriter writer(message);
    if (fill) fill(writer);
    return writer.result();
  };
  return bus_->call({daemon_, path_, interface, member}, fillMessage, read);
}

Expected<void, std::string> BusObject::readProperties(const std::string& interface, const Each& each) const {
  return call(
      kBusProperties, "GetAll", [&](BusWriter& arguments) { arguments.text(interface); },
      [&](BusReader& reader) { reader.forEachProperty([&](const std::string& name) { each(reader, name); }); });
}

}  // namespace zorva::agent
