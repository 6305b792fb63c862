// The accessors of all messages, in step with the code that protoc generates.
#include "tests/testing/accessors.hpp"

#include <gtest/gtest.h>

#include <algorithm>

#include <orv/all_messages.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/random.hpp"

namespace orv::test {
namespace {

TEST(Accessors, AreListedForEveryField) {
  AllMessages::forEach([]<class M>() {
    for (const FieldDescriptor& field : M::descriptor().fields) {
      const auto row = std::ranges::find_if(allAccessors(), [&](const Accessors& accessors) {
        return accessors.message == M::protoMessageName && accessors.field == field.name;
      });
      ASSERT_NE(row, allAccessors().end()) << M::protoMessageName << "." << field.name;
      const bool hasPresence =
          field.kind == FieldKind::explicitPresence || field.kind == FieldKind::singularMessage;
      EXPECT_EQ(static_cast<bool>(row->has) && static_cast<bool>(row->clear), hasPresence)
          << M::protoMessageName << "." << field.name;
    }
  });
}

// Every accessor of a default message, and then every other one.
TEST(Accessors, DoAsTheOfficialOnesDoTwoByTwo) {
  constexpr std::string_view values[] = {"", "01", "0A 00", "0A 02 0A 00", "12 02 12 00", "61 62", "28 01"};
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t first = 0; first < 40; ++first) {
      for (std::size_t second = 0; second < 40; ++second) {
        std::string script;
        for (const std::size_t step : {first, second}) {
          const std::string value = hex(values[(first + second) % std::size(values)]);
          script += static_cast<char>(step / 4);
          script += static_cast<char>(value.size() << 2 | step % 4);
          script += value;
        }
        ASSERT_EQ(faultOfScript(*type, script), "") << type->fullName() << ", script " << toHex(script);
      }
    }
  }
}

TEST(Accessors, DoAsTheOfficialOnesDoStepByStep) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(50); round > 0; --round) {
      const std::string script = random.bytes(random.below(400));
      ASSERT_EQ(faultOfScript(*type, script), "") << type->fullName() << ", script " << toHex(script);
    }
  }
}

}  // namespace
}  // namespace orv::test
