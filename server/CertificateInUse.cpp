#include "server/CertificateInUse.h"

#include <exception>
#include <utility>

#include "http/Log.h"

namespace zorva::server {

namespace {

constexpr std::time_t kDay = std::time_t{24} * 60 * 60;
constexpr int kDaysBefore = 30;

}  // namespace

std::string dateText(std::time_t time) {
  std::tm date{};
  char text[32] = "";
  if (::gmtime_r(&time, &date) != nullptr) std::strftime(text, sizeof text, "%Y-%m-%d", &date);
  return text;
}

std::optional<std::string> expiryWarning(const http::TlsIdentity& identity, std::time_t now) {
  if (now < identity.validFrom()) return "the certificate is not valid before " + dateText(identity.validFrom());
  if (now > identity.validUntil()) return "the certificate has expired on " + dateText(identity.validUntil());
  const std::time_t days = (identity.validUntil() - now) / kDay;
  if (days >= kDaysBefore) return std::nullopt;
  return "the certificate expires on " + dateText(identity.validUntil()) + ", days left: " + std::to_string(days);
}

void CertificateInUse::use(const http::TlsFiles& files, http::HttpServer& server) {
  auto fresh = http::TlsIdentity::load(files);
  server.setTls(fresh);
  identity_ = std::move(fresh);
  lookedAt_ = {};
  lookAfter();
}

void CertificateInUse::renew(const http::TlsFiles& files, http::HttpServer& server) noexcept try {
  use(files, server);
  ZORVA_LOG(Warning, "the certificate was read again: SHA-256 fingerprint " + identity_->fingerprint() +
                         ", good until " + dateText(identity_->validUntil()));
} catch (const std::exception& error) {
  ZORVA_LOG(Error, std::string("the certificate stays as it was: ") + error.what());
}

void CertificateInUse::lookAfter() {
  constexpr std::chrono::hours kBetweenLooks{24};
  const Clock::time_point now = Clock::now();
  if (identity_ == nullptr || (lookedAt_ != Clock::time_point() && now - lookedAt_ < kBetweenLooks)) return;
  lookedAt_ = now;
  if (const auto warning = expiryWarning(*identity_, std::time(nullptr))) ZORVA_LOG(Warning, *warning);
}

}  // namespace zorva::server
