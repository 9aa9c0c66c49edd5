#pragma once

// The matchers of GoogleMock that tests of this namespace call by their plain names.

#include <gmock/gmock.h>

namespace ZV::Test {

using ::testing::AllOf;
using ::testing::AnyOf;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Optional;
using ::testing::SizeIs;
using ::testing::StartsWith;

}  // namespace ZV::Test
