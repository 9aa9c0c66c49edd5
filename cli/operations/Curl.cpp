#include "cli/operations/Curl.h"

#include <dlfcn.h>

#include <mutex>

#include "cli/output/Text.h"

namespace zorva::cli {

template <typename Function>
void Curl::find(Function& function, const char* name) {
  function = reinterpret_cast<Function>(::dlsym(library, name));
  if (function != nullptr) return;
  throw Failure(ExitCode::Failed, std::string("libcurl has no function ") + name);
}

Curl::Curl() : library(::dlopen("libcurl.so.4", RTLD_NOW | RTLD_LOCAL)) {
  if (library == nullptr) library = ::dlopen("libcurl-gnutls.so.4", RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    const char* reason = ::dlerror();
    throw Failure(
        ExitCode::Failed,
        "a server is asked with libcurl, and that cannot be loaded: " + printable(reason == nullptr ? "" : reason),
        "install it (apt-get install libcurl4)");
  }
  find(init, "curl_easy_init");
  find(cleanup, "curl_easy_cleanup");
  find(setopt, "curl_easy_setopt");
  find(getinfo, "curl_easy_getinfo");
  find(perform, "curl_easy_perform");
  find(strerror, "curl_easy_strerror");
  find(append, "curl_slist_append");
  find(freeAll, "curl_slist_free_all");
  decltype(&::curl_global_init) initAll = nullptr;
  find(initAll, "curl_global_init");
  // Not safe on two threads at once, in all versions.
  static std::once_flag isReady;
  std::call_once(isReady, [&] { (void)initAll(CURL_GLOBAL_DEFAULT); });
  easy = init();
  if (easy == nullptr) throw Failure(ExitCode::Failed, "libcurl cannot be started");
  set(CURLOPT_NOSIGNAL, 1L);
  set(CURLOPT_ERRORBUFFER, static_cast<char*>(problem));
}

Curl::~Curl() {
  if (easy != nullptr) cleanup(easy);
  // The library stays loaded: its dependencies may not support unloading.
}

std::string Curl::why(CURLcode code) const { return printable(problem[0] == '\0' ? strerror(code) : problem); }

}  // namespace zorva::cli
