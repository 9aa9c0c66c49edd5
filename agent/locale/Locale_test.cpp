#include "agent/interface/Locale.h"

#include <gtest/gtest.h>

#include "agent/Seams.h"

namespace {

using ZV::ResourceString;
using ZV::Locale::getLanguageId;
using ZV::Locale::getResourceLibrary;

class Locale : public ::testing::Test {
 protected:
  ~Locale() override { zorva::agent::reset(); }
};

constexpr unsigned long kDnsClientLibrary = 2;

TEST_F(Locale, TheLanguageIsThatOfTheConfiguration) {
  zorva::agent::Config config;
  config.language = "de";
  zorva::agent::setConfig(config);
  EXPECT_EQ(getLanguageId(), "de");
}

TEST_F(Locale, TheTextsOfTheDnsClientProfileAreThere) {
  const std::wstring library = getResourceLibrary(kDnsClientLibrary, "en");
  EXPECT_EQ(ResourceString(library, L"MSGID_DNS_CLIENT_CAPTION"), L"DNS Client");
  EXPECT_EQ(ResourceString(library, L"MSGID_DNS_CLIENT_DESCRIPTION"), L"DNS client of a network interface");
  EXPECT_EQ(ResourceString(library, L"MSGID_DNS_SERVER_CAPTION"), L"DNS Server");
  EXPECT_EQ(ResourceString(library, L"MSGID_DNS_SERVER_DESCRIPTION"),
            L"DNS server that the system is configured to use");
}

TEST_F(Locale, EnglishReplacesALanguageThatALibraryLacks) {
  for (const char* language : {"de", "", "de_DE.UTF-8"}) {
    EXPECT_EQ(ResourceString(getResourceLibrary(kDnsClientLibrary, language), L"MSGID_DNS_SERVER_CAPTION"),
              L"DNS Server");
  }
}

TEST_F(Locale, AMessageOrALibraryThatDoesNotExistIsEmptyText) {
  EXPECT_EQ(ResourceString(getResourceLibrary(kDnsClientLibrary, "en"), L"MSGID_NONE"), L"");
  EXPECT_EQ(ResourceString(getResourceLibrary(22, "en"), L"MSGID_DNS_SERVER_CAPTION"), L"");
  EXPECT_EQ(ResourceString(L"", L"MSGID_DNS_SERVER_CAPTION"), L"");
}

}  // namespace
