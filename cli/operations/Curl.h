#pragma once

// libcurl, loaded when the first transfer is made: only --url needs it, and loading is slow. Private to operations/.

#include <curl/curl.h>

#include <string>

#include "cli/output/Failure.h"
#include "util/NotCopied.h"

namespace zorva::cli {

/// The used functions of libcurl, and a transfer. Used by one thread; each thread may have its own.
struct Curl : private util::NotCopied {
  /// Throws Failure if libcurl cannot be loaded.
  Curl();
  ~Curl();

  template <typename Value>
  void set(CURLoption option, Value value) {
    const CURLcode code = setopt(easy, option, value);
    if (code != CURLE_OK) throw Failure(ExitCode::Failed, std::string("libcurl refused an option: ") + strerror(code));
  }

  /// Why the last transfer ended so, made printable.
  std::string why(CURLcode code) const;

  void* library = nullptr;
  decltype(&::curl_easy_init) init = nullptr;
  decltype(&::curl_easy_cleanup) cleanup = nullptr;
  CURLcode (*setopt)(CURL*, CURLoption, ...) = nullptr;
  CURLcode (*getinfo)(CURL*, CURLINFO, ...) = nullptr;
  decltype(&::curl_easy_perform) perform = nullptr;
  decltype(&::curl_easy_strerror) strerror = nullptr;
  decltype(&::curl_slist_append) append = nullptr;
  decltype(&::curl_slist_free_all) freeAll = nullptr;
  CURL* easy = nullptr;
  char problem[CURL_ERROR_SIZE] = {};  ///< of the last transfer, more detailed than its code

 private:
  template <typename Function>
  void find(Function& function, const char* name);
};

}  // namespace zorva::cli
