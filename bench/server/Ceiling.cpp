// What the HTTP library can do at best: the same bytes from memory, in the threading mode of the server.
//
//   ceiling FILE THREADS    answers each request with the file's bytes, prints its port, ends with standard input
#include <arpa/inet.h>
#include <microhttpd.h>
#include <netinet/in.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>

namespace {

MHD_Result onRequest(void* response, MHD_Connection* connection, const char*, const char*, const char*, const char*,
                     std::size_t* size, void** seen) {
  if (*seen == nullptr) {
    *seen = connection;
    return MHD_YES;
  }
  if (*size > 0) {
    *size = 0;
    return MHD_YES;
  }
  return MHD_queue_response(connection, MHD_HTTP_OK, static_cast<MHD_Response*>(response));
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) return 2;
  std::ifstream file(argv[1], std::ios::binary);
  std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  MHD_Response* response = MHD_create_response_from_buffer(text.size(), text.data(), MHD_RESPMEM_PERSISTENT);
  MHD_add_response_header(response, MHD_HTTP_HEADER_CONTENT_TYPE, "application/xml; charset=\"utf-8\"");
  MHD_add_response_header(response, "CIMOperation", "MethodResponse");

  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  MHD_Daemon* daemon = MHD_start_daemon(                                                             //
      MHD_USE_EPOLL_INTERNAL_THREAD | MHD_USE_ERROR_LOG, 0, nullptr, nullptr, &onRequest, response,  //
      MHD_OPTION_SOCK_ADDR, reinterpret_cast<sockaddr*>(&address),                                   //
      MHD_OPTION_THREAD_POOL_SIZE, static_cast<unsigned>(std::atoi(argv[2])), MHD_OPTION_END);
  if (daemon == nullptr) return 1;
  std::printf("%u\n", MHD_get_daemon_info(daemon, MHD_DAEMON_INFO_BIND_PORT)->port);
  std::fflush(stdout);
  char byte = 0;
  while (::read(STDIN_FILENO, &byte, 1) > 0) {
  }
  MHD_stop_daemon(daemon);
  MHD_destroy_response(response);
  return 0;
}
