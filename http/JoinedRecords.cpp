#include "http/JoinedRecords.h"

#include <sys/socket.h>
#include <sys/uio.h>

#include <algorithm>
#include <cerrno>
#include <utility>

namespace zorva::http {

namespace {

ssize_t push(gnutls_transport_ptr_t records, const void* data, std::size_t size) {
  return static_cast<JoinedRecords*>(records)->send(data, size);
}

}  // namespace

void JoinedRecords::attach(gnutls_session_t session) {
  gnutls_transport_set_ptr2(session, gnutls_transport_get_ptr(session), this);
  gnutls_transport_set_push_function(session, &push);
}

ssize_t JoinedRecords::send(const void* data, std::size_t size) {
  if (std::exchange(waits_, false)) {
    held_.append(static_cast<const char*>(data), size);
    return static_cast<ssize_t>(size);
  }
  iovec parts[] = {{held_.data(), held_.size()}, {const_cast<void*>(data), size}};
  msghdr message{};
  message.msg_iov = held_.empty() ? parts + 1 : parts;
  message.msg_iovlen = held_.empty() ? 1 : 2;
  const ssize_t sent = ::sendmsg(socket_, &message, MSG_NOSIGNAL);
  if (sent < 0) return sent;
  const std::size_t ofHeld = std::min(held_.size(), static_cast<std::size_t>(sent));
  held_.erase(0, ofHeld);
  const ssize_t rest = sent - static_cast<ssize_t>(ofHeld);
  if (rest > 0 || size == 0) return rest;
  errno = EAGAIN;  // none of the new record went out; the library comes again with it
  return -1;
}

}  // namespace zorva::http
