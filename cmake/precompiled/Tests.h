#pragma once

// The headers that most tests include, precompiled. Templates that each test would instantiate again are instantiated
// once, in Tests.cpp.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <sstream>

#include "Standard.h"

#define ZORVA_TEST_INSTANTIATIONS(INSTANTIATE)                                             \
  INSTANTIATE(std::basic_string<char>);                                                    \
  INSTANTIATE(std::vector<std::string>);                                                   \
  INSTANTIATE(std::optional<std::string>);                                                 \
  INSTANTIATE(std::set<std::string>);                                                      \
  INSTANTIATE(std::map<std::string, std::string>);                                         \
  INSTANTIATE(testing::Matcher<const std::string&>);                                       \
  INSTANTIATE(testing::internal::MatcherBase<const std::string&>);                         \
  INSTANTIATE(std::vector<testing::Matcher<const std::string&>>);                          \
  INSTANTIATE(testing::Matcher<const std::vector<std::string>&>);                          \
  INSTANTIATE(testing::internal::MatcherBase<const std::vector<std::string>&>);            \
  INSTANTIATE(testing::internal::ElementsAreMatcherImpl<const std::vector<std::string>&>); \
  INSTANTIATE(testing::internal::UnorderedElementsAreMatcherImpl<const std::vector<std::string>&>)

#define ZORVA_INSTANTIATED_ELSEWHERE(...) extern template class __VA_ARGS__
ZORVA_TEST_INSTANTIATIONS(ZORVA_INSTANTIATED_ELSEWHERE);
#undef ZORVA_INSTANTIATED_ELSEWHERE
