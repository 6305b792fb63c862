// The field tables, names and full names against the descriptors that protoc makes of proto/orv.proto, and these
// against the ones that peers were built with.
#include <google/protobuf/descriptor.h>
#include <google/protobuf/descriptor.pb.h>
#include <google/protobuf/text_format.h>
#include <google/protobuf/util/message_differencer.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <set>
#include <span>
#include <sstream>

#include <orv/all_messages.hpp>
#include <orv/session_message.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

using google::protobuf::Descriptor;
using google::protobuf::FieldDescriptor;
using google::protobuf::FileDescriptorSet;

FileDescriptorSet schemaFiles() {
  std::ifstream file(ORV_SCHEMA_DESCRIPTORS, std::ios::binary);
  FileDescriptorSet files;
  EXPECT_TRUE(files.ParseFromIstream(&file));
  return files;
}

const google::protobuf::DescriptorPool& schema() {
  static const auto* const pool = [] {
    const FileDescriptorSet files = schemaFiles();
    auto* const built = new google::protobuf::DescriptorPool;
    for (const auto& one : files.file()) EXPECT_NE(built->BuildFile(one), nullptr);
    return built;
  }();
  return *pool;
}

// Those of the protocol; the tests' own have no part in its schema.
std::span<const MessagePointer> protocolMessages() {
  return std::span(allMessages()).first(AllMessages::size);
}

// Runs the body with each message and its descriptor.
template <class Body>
void forEachMessage(Body&& body) {
  for (const MessagePointer& message : protocolMessages()) {
    SCOPED_TRACE(message->fullName());
    const Descriptor* const type = schema().FindMessageTypeByName(std::string(message->fullName()));
    ASSERT_NE(type, nullptr);
    body(*message, *type);
  }
}

void collectNames(const Descriptor& type, std::set<std::string>& names) {
  names.insert(type.full_name());
  for (int at = 0; at < type.nested_type_count(); ++at) collectNames(*type.nested_type(at), names);
}

TEST(Schema, IsTheOneThatPeersWereBuiltWith) {
  std::ifstream file(ORV_GOLDEN_DESCRIPTORS);
  std::ostringstream text;
  text << file.rdbuf();
  FileDescriptorSet golden;
  ASSERT_TRUE(google::protobuf::TextFormat::ParseFromString(text.str(), &golden));
  google::protobuf::util::MessageDifferencer differencer;
  std::string differences;
  differencer.ReportDifferencesToString(&differences);
  EXPECT_TRUE(differencer.Compare(golden, schemaFiles()))
      << differences << "what to do stands in " << ORV_GOLDEN_DESCRIPTORS;
}

TEST(Schema, HasTheMessagesOfTheListAndNoOthers) {
  std::set<std::string> listed, inSchema;
  for (const MessagePointer& message : protocolMessages()) listed.emplace(message->fullName());
  const auto* const file = schema().FindFileContainingSymbol("orv.Group");
  for (int at = 0; at < file->message_type_count(); ++at) collectNames(*file->message_type(at), inSchema);
  EXPECT_EQ(listed, inSchema);
  EXPECT_EQ(protocolMessages().size(), inSchema.size());
}

TEST(Schema, HasTheFieldNamesOfTheNameMaps) {
  forEachMessage([](const AnyMessage& message, const Descriptor& type) {
    const NameMap names = message.nameMap();
    ASSERT_EQ(names.entries().size(), static_cast<std::size_t>(type.field_count()));
    bool nestsMessages = false;
    for (int at = 0; at < type.field_count(); ++at)
      nestsMessages = nestsMessages || type.field(at)->message_type() != nullptr;
    EXPECT_EQ(message.descriptor().nestsMessages(), nestsMessages);
    std::int64_t last = 0;
    for (const NameMap::Entry& entry : names.entries()) {
      EXPECT_LT(std::exchange(last, entry.number), entry.number) << "not in ascending order";
      const FieldDescriptor* const field = type.FindFieldByNumber(static_cast<int>(entry.number));
      ASSERT_NE(field, nullptr) << entry.number;
      EXPECT_EQ(entry.name, field->name());
      EXPECT_EQ(entry.name, field->json_name());
      EXPECT_EQ(names.name(entry.number), entry.name);
      EXPECT_EQ(names.number(entry.name), entry.number);
    }
    EXPECT_EQ(names.name(15), std::nullopt);
    EXPECT_EQ(names.number("nothing"), std::nullopt);
  });
}

TEST(Schema, HasTheCasesOfTheEnumeration) {
  const auto* const type = schema().FindEnumTypeByName("orv.VessaSessionMessageType");
  const auto entries = VessaSessionMessageType::_protobuf_nameMap().entries();
  const auto cases = VessaSessionMessageType::allCases();
  ASSERT_EQ(entries.size(), static_cast<std::size_t>(type->value_count()));
  ASSERT_EQ(cases.size(), entries.size());
  for (std::size_t at = 0; at < entries.size(); ++at) {
    EXPECT_EQ(entries[at].number, type->value(static_cast<int>(at))->number());
    EXPECT_EQ(entries[at].name, type->value(static_cast<int>(at))->name());
    EXPECT_EQ(cases[at].rawValue(), entries[at].number);
    EXPECT_FALSE(cases[at].isUnrecognized());
  }
}

// The decoder's operation for a field, as ScriptedDecoder notes it.
std::string operationFor(const FieldDescriptor& field) {
  const std::string presence = field.is_repeated() ? "repeated " : field.has_presence() ? "optional " : "";
  switch (field.type()) {
    case FieldDescriptor::TYPE_MESSAGE:
      return (field.is_repeated() ? "repeated message " : "message ") + field.message_type()->full_name();
    default: return presence + field.type_name();
  }
}

TEST(Schema, HasTheTypeAndPresenceOfEveryField) {
  forEachMessage([](const AnyMessage& message, const Descriptor& type) {
    for (std::uint32_t number = 1; number < 40; ++number) {
      SCOPED_TRACE(number);
      const ScriptedField script[] = {{number}};
      Journal journal;
      ScriptedDecoder decoder(script, journal);
      ASSERT_TRUE(message.copied()->decode(decoder));
      std::vector<std::string> expected{"nextFieldNumber", "nextFieldNumber"};
      const FieldDescriptor* const field = type.FindFieldByNumber(static_cast<int>(number));
      if (field != nullptr) expected.insert(expected.begin() + 1, operationFor(*field));
      EXPECT_EQ(journal.calls, expected);
      if (field == nullptr) continue;

      // A default that is there is emitted if the field is explicitly present or an element.
      const bool isVarint = field->type() == FieldDescriptor::TYPE_BOOL ||
                            field->type() == FieldDescriptor::TYPE_UINT32 ||
                            field->type() == FieldDescriptor::TYPE_ENUM;
      EXPECT_EQ(wireTypeOf(message.descriptor().field(number)->type),
                isVarint ? WireType::varint : WireType::lengthDelimited);
      const std::string defaultValue = varint(number << 3 | (isVarint ? 0 : 2)) + '\0';
      const bool isEmitted = field->has_presence() || field->is_repeated();
      EXPECT_EQ(message.parse(defaultValue).value()->serialize(), isEmitted ? defaultValue : "");
    }
  });
}

TEST(Schema, HasTheMembersOfEveryOneof) {
  forEachMessage([](const AnyMessage& message, const Descriptor& type) {
    for (int first = 0; first < type.field_count(); ++first) {
      for (int second = 0; second < type.field_count(); ++second) {
        const std::vector<ScriptedField> empty;
        const ScriptedField script[] = {{static_cast<std::uint32_t>(type.field(first)->number()), empty},
                                        {static_cast<std::uint32_t>(type.field(second)->number()), empty}};
        Journal journal;
        ScriptedDecoder decoder(script, journal);
        ASSERT_TRUE(message.copied()->decode(decoder));
        const auto* const group = type.field(first)->real_containing_oneof();
        const bool isConflict = group != nullptr && group == type.field(second)->real_containing_oneof();
        EXPECT_EQ(std::ranges::count(journal.calls, "handleConflictingOneOf"), isConflict ? 1 : 0);
      }
    }
  });
}

}  // namespace
}  // namespace orv::test
