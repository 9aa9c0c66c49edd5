#include "http/testing/TestWire.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <zlib.h>

#include <algorithm>
#include <cctype>
#include <charconv>
#include <stdexcept>

namespace zorva::http::testing {

namespace {

using Clock = std::chrono::steady_clock;

std::string lowered(std::string text) {
  std::transform(text.begin(), text.end(), text.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return text;
}

bool waitReadable(int socket, Clock::time_point deadline) {
  const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
  pollfd wait{socket, POLLIN, 0};
  return left.count() > 0 && ::poll(&wait, 1, static_cast<int>(left.count())) > 0;
}

std::size_t number(std::string_view text, int base) {
  std::size_t value = 0;
  std::from_chars(text.data(), text.data() + text.size(), value, base);
  return value;
}

}  // namespace

Wire::Wire(int port, int receiveBuffer) : socket_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
  if (receiveBuffer > 0) ::setsockopt(socket_.get(), SOL_SOCKET, SO_RCVBUF, &receiveBuffer, sizeof receiveBuffer);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  if (::connect(socket_.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    throw std::runtime_error("no server listens on port " + std::to_string(port));
  }
}

bool Wire::send(std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t sent = ::send(socket_.get(), bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (sent <= 0) return false;
    bytes.remove_prefix(static_cast<std::size_t>(sent));
  }
  return true;
}

bool Wire::fill(Clock::time_point deadline) {
  if (!waitReadable(socket_.get(), deadline)) return false;
  char buffer[65536];
  const ssize_t got = ::recv(socket_.get(), buffer, sizeof buffer, 0);
  if (got <= 0) return false;
  unread_.append(buffer, static_cast<std::size_t>(got));
  return true;
}

std::optional<std::string> Wire::line(Clock::time_point deadline) {
  for (;;) {
    const std::size_t end = unread_.find("\r\n");
    if (end != std::string::npos) {
      std::string text = unread_.substr(0, end);
      unread_.erase(0, end + 2);
      return text;
    }
    if (!fill(deadline)) return std::nullopt;
  }
}

bool Wire::bytes(std::size_t count, std::string& out, Clock::time_point deadline) {
  while (unread_.size() < count && fill(deadline)) {
  }
  const std::size_t there = std::min(count, unread_.size());
  out.append(unread_, 0, there);
  unread_.erase(0, there);
  return there == count;
}

bool Wire::fields(std::map<std::string, std::string>& out, Clock::time_point deadline) {
  for (;;) {
    const auto text = line(deadline);
    if (!text.has_value()) return false;
    if (text->empty()) return true;
    const std::size_t colon = text->find(':');
    if (colon == std::string::npos) return false;
    const std::size_t value = text->find_first_not_of(' ', colon + 1);
    out[lowered(text->substr(0, colon))] = value == std::string::npos ? "" : text->substr(value);
  }
}

bool Wire::chunks(WireResponse& response, Clock::time_point deadline) {
  for (;;) {
    const auto size = line(deadline);
    if (!size.has_value()) return false;
    const std::size_t count = number(*size, 16);
    if (count == 0) return fields(response.trailers, deadline);
    if (!bytes(count, response.body, deadline) || !line(deadline).has_value()) return false;
  }
}

WireResponse Wire::receive(std::chrono::milliseconds most) {
  const auto deadline = Clock::now() + most;
  WireResponse response;
  const auto first = line(deadline);
  if (!first.has_value() || first->size() < 12) return response;
  response.status = static_cast<int>(number(std::string_view(*first).substr(9, 3), 10));
  if (!fields(response.headers, deadline)) return response;
  if (response.status == 100) {
    response.complete = true;
  } else if (response.headers.count("transfer-encoding") > 0) {
    response.complete = chunks(response, deadline);
  } else if (response.headers.count("content-length") > 0) {
    response.complete = bytes(number(response.headers["content-length"], 10), response.body, deadline);
  } else {
    while (fill(deadline)) {
    }
    response.complete = bytes(unread_.size(), response.body, deadline);
  }
  return response;
}

bool Wire::isClosedWithin(std::chrono::milliseconds time) {
  const auto deadline = Clock::now() + time;
  char buffer[65536];
  while (waitReadable(socket_.get(), deadline)) {
    if (::recv(socket_.get(), buffer, sizeof buffer, 0) <= 0) return true;
  }
  return false;
}

std::string Wire::take(std::size_t most, std::chrono::milliseconds time) {
  const auto deadline = Clock::now() + time;
  std::string taken;
  while (taken.size() < most && waitReadable(socket_.get(), deadline)) {
    char buffer[4096];
    const ssize_t got = ::recv(socket_.get(), buffer, std::min(sizeof buffer, most - taken.size()), 0);
    if (got <= 0) break;
    taken.append(buffer, static_cast<std::size_t>(got));
  }
  return taken;
}

std::string posting(std::string_view body, std::string_view fields) {
  std::string text = "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml; charset=\"utf-8\"\r\n";
  text += fields;
  text += "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n";
  text += body;
  return text;
}

std::string enumeration(std::string_view operation, std::string_view className, std::string_view fields) {
  const std::string name(operation);
  return posting(
      "<?xml version=\"1.0\" encoding=\"utf-8\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\">"
      "<MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"" +
          name +
          "\"><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"cimv2\"/></LOCALNAMESPACEPATH>"
          "<IPARAMVALUE NAME=\"ClassName\"><CLASSNAME NAME=\"" +
          std::string(className) + "\"/></IPARAMVALUE></IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>",
      "CIMOperation: MethodCall\r\nCIMMethod: " + name + "\r\nCIMObject: root/cimv2\r\n" + std::string(fields));
}

std::string gunzipped(const std::string& text) {
  z_stream stream{};
  if (inflateInit2(&stream, 15 + 16) != Z_OK) return {};
  stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(text.data()));
  stream.avail_in = static_cast<uInt>(text.size());
  std::string out;
  int rc = Z_OK;
  while (rc == Z_OK) {
    char buffer[65536];
    stream.next_out = reinterpret_cast<Bytef*>(buffer);
    stream.avail_out = sizeof buffer;
    rc = inflate(&stream, Z_NO_FLUSH);
    out.append(buffer, sizeof buffer - stream.avail_out);
  }
  inflateEnd(&stream);
  return rc == Z_STREAM_END ? out : std::string();
}

}  // namespace zorva::http::testing
