// JSON against the Protocol Buffers runtime, over random messages of every type.
#include <google/protobuf/util/json_util.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <string>

#include <orv/all_messages.hpp>
#include <orv/json.hpp>
#include "tests/testing/official.hpp"
#include "tests/testing/random.hpp"

namespace orv::test {
namespace {

namespace pb = google::protobuf;

constexpr std::size_t roundsPerType = 2000;

std::string officialJson(const pb::Message& message, bool withDefaults, bool enumerationsAsNumbers) {
  pb::util::JsonPrintOptions options;
  options.preserve_proto_field_names = true;
  options.always_print_primitive_fields = withDefaults;
  options.always_print_enums_as_ints = enumerationsAsNumbers;
  std::string json;
  EXPECT_TRUE(pb::util::MessageToJsonString(message, &json, options).ok());
  return json;
}

// Calls the check with random messages of every type and their encodings.
template <class Check>
void forRandomMessages(Check check) {
  Random random;
  const std::size_t rounds = Random::rounds(roundsPerType);
  AllMessages::forEach([&]<class M>() {
    SCOPED_TRACE(M::protoMessageName);
    for (std::size_t round = 0; round < rounds && !testing::Test::HasFailure(); ++round) {
      const auto official = newOfficial(M::protoMessageName);
      fillRandomly(*official, random);
      const auto message = M::parse(official->SerializeAsString());
      ASSERT_TRUE(message.has_value());
      check(*message, *official, random);
    }
  });
}

TEST(OfficialJson, IsRenderedAlike) {
  forRandomMessages([]<class M>(const M& message, const pb::Message& official, Random& random) {
    const std::string json = json::render(message, {.isIndented = random.oneIn(2)});
    const auto ours = nlohmann::json::parse(json, nullptr, false);
    const auto theirs = nlohmann::json::parse(officialJson(official, false, false));
    EXPECT_EQ(ours, theirs) << json;
  });
}

TEST(OfficialJson, IsReadAlike) {
  forRandomMessages([]<class M>(const M&, pb::Message& official, Random& random) {
    // The documents do not have the unknown fields.
    official.DiscardUnknownFields();
    const std::string json = officialJson(official, random.oneIn(2), random.oneIn(2));
    const auto message = json::parse<M>(json);
    ASSERT_TRUE(message.has_value()) << message.error().message() << '\n' << json;
    EXPECT_EQ(message->serialize().value(), official.SerializeAsString()) << json;
  });
}

TEST(OfficialJson, IsReadByTheOtherRuntime) {
  forRandomMessages([]<class M>(const M& message, pb::Message& official, Random&) {
    official.DiscardUnknownFields();
    const auto read = newOfficial(M::protoMessageName);
    const std::string json = json::render(message);
    ASSERT_TRUE(pb::util::JsonStringToMessage(json, read.get()).ok()) << json;
    EXPECT_EQ(read->SerializeAsString(), official.SerializeAsString()) << json;
  });
}

}  // namespace
}  // namespace orv::test
