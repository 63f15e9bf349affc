#ifndef FILEINDEX_TESTS_MATCHERS_H
#define FILEINDEX_TESTS_MATCHERS_H

// What tests say of a value without naming where the words come from.

#include <gmock/gmock.h>

namespace VANO::TESTS {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::Field;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::StartsWith;
using ::testing::UnorderedElementsAre;

} // namespace VANO::TESTS

#endif
