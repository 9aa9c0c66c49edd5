#include "server/SelfSigned.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <gnutls/crypto.h>
#include <grp.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <memory>
#include <stdexcept>

#include "http/GnutlsHandles.h"
#include "http/TlsIdentity.h"
#include "util/FileDescriptor.h"
#include "util/FileError.h"
#include "util/NotCopied.h"
#include "util/ReplaceFile.h"

namespace zorva::server {

namespace {

using http::checkGnutls;

constexpr std::time_t kHour = std::time_t{60} * 60;
constexpr std::time_t kYear = std::time_t{365} * 24 * kHour;

void addName(gnutls_x509_crt_t certificate, const std::string& name) {
  unsigned char bytes[sizeof(in6_addr)];
  for (const int family : {AF_INET, AF_INET6}) {
    if (::inet_pton(family, name.c_str(), bytes) != 1) continue;
    const unsigned int size = family == AF_INET ? sizeof(in_addr) : sizeof(in6_addr);
    return checkGnutls(
        gnutls_x509_crt_set_subject_alt_name(certificate, GNUTLS_SAN_IPADDRESS, bytes, size, GNUTLS_FSAN_APPEND));
  }
  checkGnutls(gnutls_x509_crt_set_subject_alt_name(certificate, GNUTLS_SAN_DNSNAME, name.data(),
                                                   static_cast<unsigned int>(name.size()), GNUTLS_FSAN_APPEND));
}

void setSerial(gnutls_x509_crt_t certificate) {
  unsigned char serial[16];
  checkGnutls(gnutls_rnd(GNUTLS_RND_NONCE, serial, sizeof serial));
  serial[0] = static_cast<unsigned char>((serial[0] & 0x3F) | 0x40);  // positive, and of full length
  checkGnutls(gnutls_x509_crt_set_serial(certificate, serial, sizeof serial));
}

/// What the certificate may be used for: to serve TLS, and not to sign others.
void setPurpose(gnutls_x509_crt_t certificate) {
  checkGnutls(gnutls_x509_crt_set_basic_constraints(certificate, 0, -1));
  checkGnutls(gnutls_x509_crt_set_key_usage(certificate, GNUTLS_KEY_DIGITAL_SIGNATURE));
  checkGnutls(gnutls_x509_crt_set_key_purpose_oid(certificate, GNUTLS_KP_TLS_WWW_SERVER, 0));
  unsigned char id[64];
  std::size_t size = sizeof id;
  checkGnutls(gnutls_x509_crt_get_key_id(certificate, 0, id, &size));
  checkGnutls(gnutls_x509_crt_set_subject_key_id(certificate, id, size));
  checkGnutls(gnutls_x509_crt_set_authority_key_id(certificate, id, size));
}

/// A file under another name until all of them are written.
class Draft : util::NotCopied {
 public:
  explicit Draft(const NewFile& file) : file_(file), path_(file.path + ".new." + std::to_string(::getpid())) {
    struct stat there {};
    if (::lstat(file.path.c_str(), &there) == 0) throw std::runtime_error(file.path + ": is there already");
    const util::FileDescriptor out(
        ::open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC | O_NOFOLLOW, S_IRUSR | S_IWUSR));
    if (!out) util::throwFileError(path_, "cannot be made");
    if (const group* own = file.group.empty() ? nullptr : ::getgrnam(file.group.c_str())) {
      (void)!::fchown(out.get(), static_cast<uid_t>(-1), own->gr_gid);
    }
    if (::fchmod(out.get(), file.mode) != 0 || !util::writeAll(out, file.text) || ::fsync(out.get()) != 0) {
      const int error = errno;
      ::unlink(path_.c_str());
      errno = error;
      util::throwFileError(path_, "cannot be written");
    }
  }
  ~Draft() {
    ::unlink(path_.c_str());
    if (isPublished_ && !isKept_) ::unlink(file_.path.c_str());
  }

  /// Fails if there is a file of that name by now.
  void publish() {
    if (::link(path_.c_str(), file_.path.c_str()) != 0) util::throwFileError(file_.path, "cannot be made");
    isPublished_ = true;
  }
  void keep() { isKept_ = true; }

 private:
  const NewFile& file_;
  const std::string path_;
  bool isPublished_ = false;
  bool isKept_ = false;
};

}  // namespace

SelfSigned makeSelfSigned(const std::vector<std::string>& names, std::time_t now) {
  constexpr std::size_t kLongestSubject = 64;
  const http::X509Key key = http::newKey();
  const http::X509Certificate owner = http::newCertificate();
  gnutls_x509_crt_int* certificate = owner.get();
  checkGnutls(gnutls_x509_crt_set_version(certificate, 3));
  setSerial(certificate);
  checkGnutls(gnutls_x509_crt_set_activation_time(certificate, now - kHour));  // clients' clocks may be slow
  checkGnutls(gnutls_x509_crt_set_expiration_time(certificate, now + kYear));
  checkGnutls(gnutls_x509_crt_set_key(certificate, key.get()));
  const std::string subject = names.front().substr(0, kLongestSubject);
  checkGnutls(gnutls_x509_crt_set_dn_by_oid(certificate, GNUTLS_OID_X520_COMMON_NAME, 0, subject.data(),
                                            static_cast<unsigned int>(subject.size())));
  for (const std::string& each : names) addName(certificate, each);
  setPurpose(certificate);
  checkGnutls(gnutls_x509_crt_sign2(certificate, certificate, key.get(), GNUTLS_DIG_SHA256, 0));
  return {http::pemOf(owner), http::pemOf(key), http::fingerprintOf(owner)};
}

void writeNewFiles(const std::vector<NewFile>& files) {
  std::vector<std::unique_ptr<Draft>> drafts;
  for (const NewFile& each : files) {
    std::error_code error;
    const std::filesystem::path directory = std::filesystem::path(each.path).parent_path();
    std::filesystem::create_directories(directory, error);
    if (error) throw std::runtime_error(directory.string() + ": cannot be made: " + error.message());
    drafts.push_back(std::make_unique<Draft>(each));
  }
  for (const auto& each : drafts) each->publish();
  for (const auto& each : drafts) each->keep();
  for (const NewFile& each : files) util::syncDirectory(std::filesystem::path(each.path).parent_path().string());
}

}  // namespace zorva::server
