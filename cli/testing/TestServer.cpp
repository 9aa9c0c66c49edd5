#include "cli/testing/TestServer.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <stdexcept>

#include "cli/testing/TestHost.h"

namespace zorva::cli {

namespace {

/// The text from a pipe until a line has ended, or nothing arrives for ten seconds.
std::string firstLine(int pipe) {
  std::string line;
  pollfd waiting{pipe, POLLIN, 0};
  for (char c = 0; c != '\n';) {
    if (::poll(&waiting, 1, 10000) <= 0 || ::read(pipe, &c, 1) != 1) return line;
    line += c;
  }
  return line;
}

/// The length of the whole request with this beginning; 0 if that is not known yet.
std::size_t requestLength(const std::string& text) {
  const std::size_t end = text.find("\r\n\r\n");
  if (end == std::string::npos) return 0;
  const std::size_t field = text.find("Content-Length: ");
  return end + 4 + (field < end ? std::stoul(text.substr(field + 16)) : 0);
}

std::string readRequest(int connection) {
  std::string text;
  char buffer[4096];
  while (requestLength(text) == 0 || text.size() < requestLength(text)) {
    const ssize_t count = ::recv(connection, buffer, sizeof buffer, 0);
    if (count <= 0) break;
    text.append(buffer, static_cast<std::size_t>(count));
  }
  return text;
}

void sendAll(int connection, std::string_view text) {
  while (!text.empty()) {
    const ssize_t count = ::send(connection, text.data(), text.size(), MSG_NOSIGNAL);
    if (count <= 0) return;
    text.remove_prefix(static_cast<std::size_t>(count));
  }
}

}  // namespace

TestServer::TestServer(const TestHost& host, const std::string& text) {
  const std::string config = host.directory().write("zorvacimd.toml", text);
  const std::string agent = host.directory() / "agent.toml";
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
  process_ = ::fork();
  if (process_ == 0) {
    ::prctl(PR_SET_PDEATHSIG, SIGTERM);
    ::dup2(ends[1], STDOUT_FILENO);
    ::execl(ZORVA_BIN_DIR "/zorvacimd", "zorvacimd", "--config", config.c_str(), "--agent-config", agent.c_str(),
            "--listen", "127.0.0.1", "--port", "0", "--log-level", "9999", nullptr);
    ::_exit(127);
  }
  ::close(ends[1]);
  const std::string line = firstLine(ends[0]);
  ::close(ends[0]);
  const auto urlOf = [&line](const char* scheme) {
    const std::size_t from = line.find(scheme);
    return from == std::string::npos ? std::string() : line.substr(from, line.find_first_of(" \n", from) - from);
  };
  url_ = urlOf("http://");
  tlsUrl_ = urlOf("https://");
}

TestServer::~TestServer() {
  if (process_ <= 0) return;
  ::kill(process_, SIGTERM);
  ::waitpid(process_, nullptr, 0);
}

ScriptedServer::ScriptedServer(std::vector<std::string> replies)
    : ScriptedServer([all = std::move(replies), next = std::size_t{0}](const std::string&) mutable {
        return next < all.size() ? std::optional(all[next++]) : std::nullopt;
      }) {}

ScriptedServer::ScriptedServer(Answer answer) : listener_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  if (::bind(listener_, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 || ::listen(listener_, 8) != 0) {
    throw std::runtime_error("no port");
  }
  thread_ = std::thread([this, answers = std::move(answer)] { serve(answers); });
}

ScriptedServer::~ScriptedServer() {
  ::shutdown(listener_, SHUT_RDWR);
  thread_.join();
  ::close(listener_);
}

std::string ScriptedServer::url() const {
  sockaddr_in address{};
  socklen_t size = sizeof address;
  ::getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &size);
  return "http://127.0.0.1:" + std::to_string(ntohs(address.sin_port));
}

std::vector<std::string> ScriptedServer::requests() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return requests_;
}

void ScriptedServer::serve(const Answer& answer) {
  for (;;) {
    const int connection = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
    if (connection < 0) return;
    const std::string request = readRequest(connection);
    const std::optional<std::string> reply = answer(request);
    if (reply) {
      const std::lock_guard<std::mutex> lock(mutex_);
      requests_.push_back(request);
    }
    if (reply) sendAll(connection, *reply);
    ::close(connection);
    if (!reply) break;
  }
  ::shutdown(listener_, SHUT_RDWR);
}

std::string ScriptedServer::reply(const std::string& body, const std::string& status, const std::string& fields) {
  return "HTTP/1.1 " + status + "\r\nContent-Length: " + std::to_string(body.size()) + "\r\nConnection: close\r\n" +
         fields + "\r\n" + body;
}

namespace {

std::string cimDocument(const std::string& content) {
  return R"(<?xml version="1.0"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0">)"
         R"(<SIMPLERSP><IMETHODRESPONSE NAME="X">)" +
         content + "</IMETHODRESPONSE></SIMPLERSP></MESSAGE></CIM>";
}

}  // namespace

std::string ScriptedServer::cimReply(const std::string& content) { return reply(cimDocument(content)); }

std::string ScriptedServer::failedReply(const std::string& content, const std::string& code,
                                        const std::string& description) {
  const std::string document = cimDocument(content);
  char size[20];
  std::snprintf(size, sizeof size, "%zx", document.size());
  return std::string("HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\nTrailer: CIMStatusCode\r\n") +
         "Connection: close\r\n\r\n" + size + "\r\n" + document + "\r\n0\r\nCIMStatusCode: " + code +
         "\r\nCIMStatusCodeDescription: " + description + "\r\n\r\n";
}

}  // namespace zorva::cli
