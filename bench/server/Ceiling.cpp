// The best that the HTTP library can do: the same bytes from memory, with as many threads as the server has.
//
//   ceiling FILE THREADS handover    each request goes to another thread and back, as the server has to do it, since no
//                                    provider may hold up an event thread
//   ceiling FILE THREADS direct      the event threads answer by themselves
//
// Answers each request with the file's bytes, prints its port, ends with standard input.

#include <arpa/inet.h>
#include <microhttpd.h>
#include <netinet/in.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <deque>
#include <fstream>
#include <iterator>
#include <mutex>
#include <semaphore>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "util/NotCopied.h"

namespace {

/// Threads that only wake the connection of a request again.
class Workers : zorva::util::NotCopied {
 public:
  explicit Workers(int count) {
    for (int i = 0; i < count; ++i) threads_.emplace_back([this] { run(); });
  }
  ~Workers() {
    for (std::size_t i = 0; i < threads_.size(); ++i) submit(nullptr);
    for (std::thread& thread : threads_) thread.join();
  }

  void submit(MHD_Connection* connection) {
    {
      const std::lock_guard lock(mutex_);
      queue_.push_back(connection);
    }
    ready_.release();
  }

 private:
  void run() {
    while (true) {
      ready_.acquire();
      MHD_Connection* connection = nullptr;
      {
        const std::lock_guard lock(mutex_);
        connection = queue_.front();
        queue_.pop_front();
      }
      if (connection == nullptr) return;
      MHD_resume_connection(connection);
    }
  }

  std::mutex mutex_;
  std::counting_semaphore<> ready_{0};
  std::deque<MHD_Connection*> queue_;
  std::vector<std::thread> threads_;
};

struct Server {
  MHD_Response* response = nullptr;
  Workers* workers = nullptr;  ///< null: direct
};

char arrived;
char handedOver;

MHD_Result onRequest(void* context, MHD_Connection* connection, const char*, const char*, const char*, const char*,
                     std::size_t* size, void** seen) {
  const Server& server = *static_cast<Server*>(context);
  if (*seen == nullptr) {
    *seen = &arrived;
    return MHD_YES;
  }
  if (*size > 0) {
    *size = 0;
    return MHD_YES;
  }
  if (server.workers != nullptr && *seen == &arrived) {
    *seen = &handedOver;
    MHD_suspend_connection(connection);
    server.workers->submit(connection);
    return MHD_YES;
  }
  return MHD_queue_response(connection, MHD_HTTP_OK, server.response);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 4) return 2;
  std::ifstream file(argv[1], std::ios::binary);
  std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  const int threads = std::atoi(argv[2]);
  const bool handsOver = std::string_view(argv[3]) == "handover";
  Workers workers(handsOver ? threads : 0);
  Server server;
  server.workers = handsOver ? &workers : nullptr;
  server.response = MHD_create_response_from_buffer(text.size(), text.data(), MHD_RESPMEM_PERSISTENT);
  MHD_add_response_header(server.response, MHD_HTTP_HEADER_CONTENT_TYPE, "application/xml; charset=\"utf-8\"");
  MHD_add_response_header(server.response, "CIMOperation", "MethodResponse");

  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  MHD_Daemon* daemon = MHD_start_daemon(                            //
      MHD_USE_EPOLL_INTERNAL_THREAD | MHD_ALLOW_SUSPEND_RESUME, 0,  //
      nullptr, nullptr, &onRequest, &server,                        //
      MHD_OPTION_SOCK_ADDR, reinterpret_cast<sockaddr*>(&address),  //
      MHD_OPTION_THREAD_POOL_SIZE, static_cast<unsigned>(threads), MHD_OPTION_END);
  if (daemon == nullptr) return 1;
  std::printf("%u\n", MHD_get_daemon_info(daemon, MHD_DAEMON_INFO_BIND_PORT)->port);
  std::fflush(stdout);
  char byte = 0;
  while (::read(STDIN_FILENO, &byte, 1) > 0) {
  }
  MHD_stop_daemon(daemon);
  MHD_destroy_response(server.response);
  return 0;
}
