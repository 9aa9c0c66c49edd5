#pragma once

// For tests: a DNS server on a loopback address that sends what a test says.

#include <atomic>
#include <cstdint>
#include <functional>
#include <string>
#include <thread>
#include <vector>

namespace zorva::dns::testing {

class UdpServer {
 public:
  struct Packet {
    std::string bytes;
    bool isFromElsewhere = false;  ///< sent from another port
  };
  /// The packets to send after a query.
  using Reply = std::function<std::vector<Packet>(const std::string& query)>;

  /// Port 0 is any free one. Throws std::runtime_error if the address cannot be used.
  UdpServer(const std::string& address, std::uint16_t port, Reply reply);
  ~UdpServer();
  UdpServer(const UdpServer&) = delete;
  UdpServer& operator=(const UdpServer&) = delete;

  std::uint16_t port() const { return port_; }
  int queries() const { return queries_; }

  /// The response with that code to a query; with code 0 it has one record of the asked type.
  static std::string response(const std::string& query, unsigned code = 0);
  static Reply answering(unsigned code = 0);

 private:
  void serve(const Reply& reply);

  int socket_;
  int stop_[2];
  std::uint16_t port_;
  std::atomic<int> queries_{0};
  std::thread thread_;
};

}  // namespace zorva::dns::testing
