#include "tests/testing/official.hpp"

#include <google/protobuf/unknown_field_set.h>
#include <orv_official.pb.h>

#include <array>
#include <cstdint>
#include <utility>
#include <vector>

namespace orv::test {

namespace {

using google::protobuf::FieldDescriptor;
using google::protobuf::Message;
using google::protobuf::UnknownFieldSet;

std::string randomText(Random& random) {
  static const std::array<std::string, 10> texts{
      "",       "a",    "zoë",     "guest@example.com", "\U0001F600 grin", "한글", "a\u0316\u0301b",
      "\u212B", "\"\n", "tab\t'\\"};
  // The lengths around those that are kept in place, and around those that take another byte to write.
  static constexpr std::array<std::size_t, 5> lengths{38, 39, 40, 127, 128};
  if (random.oneIn(100)) return std::string((std::size_t{1} << 14) - random.below(20), 'y');
  return random.oneIn(3) ? std::string(random.pick(lengths), 'x') : random.pick(texts);
}

std::string randomBytes(Random& random) {
  return random.oneIn(2) ? random.bytes(random.below(20)) : randomText(random);
}

void addRandomly(UnknownFieldSet& fields, const google::protobuf::Descriptor* known, Random& random,
                 int depth) {
  int number = random.oneIn(4) ? static_cast<int>(1 + random.number() % ((1 << 29) - 1))
                               : static_cast<int>(1 + random.below(20));
  while (known != nullptr && known->FindFieldByNumber(number) != nullptr) ++number;
  switch (random.below(5)) {
    case 0: fields.AddVarint(number, random.edgyNumber()); break;
    case 1: fields.AddFixed32(number, static_cast<std::uint32_t>(random.number())); break;
    case 2: fields.AddFixed64(number, random.number()); break;
    case 3: {
      UnknownFieldSet body;
      while (depth > 0 && random.oneIn(2)) addRandomly(body, nullptr, random, depth - 1);
      std::string bytes;
      body.SerializeToString(&bytes);
      fields.AddLengthDelimited(number, random.oneIn(2) ? bytes : randomBytes(random));
      break;
    }
    default: {
      UnknownFieldSet& group = *fields.AddGroup(number);
      while (depth > 0 && random.oneIn(2)) addRandomly(group, nullptr, random, depth - 1);
    }
  }
}

void setRandomly(Message& message, const FieldDescriptor* field, Random& random) {
  const auto& reflection = *message.GetReflection();
  const bool isRepeated = field->is_repeated();
  switch (field->cpp_type()) {
    case FieldDescriptor::CPPTYPE_STRING: {
      const std::string value =
          field->type() == FieldDescriptor::TYPE_STRING ? randomText(random) : randomBytes(random);
      if (isRepeated) {
        reflection.AddString(&message, field, value);
      } else {
        reflection.SetString(&message, field, value);
      }
      break;
    }
    case FieldDescriptor::CPPTYPE_BOOL: reflection.SetBool(&message, field, random.oneIn(2)); break;
    case FieldDescriptor::CPPTYPE_UINT32:
      reflection.SetUInt32(&message, field, static_cast<std::uint32_t>(random.edgyNumber()));
      break;
    case FieldDescriptor::CPPTYPE_ENUM:
      reflection.SetEnumValue(
          &message, field,
          random.oneIn(2) ? static_cast<int>(random.below(8)) : static_cast<int>(random.edgyNumber()));
      break;
    default:
      fillRandomly(
          isRepeated ? *reflection.AddMessage(&message, field) : *reflection.MutableMessage(&message, field),
          random);
  }
}

}  // namespace

std::unique_ptr<Message> newOfficial(std::string_view fullName) {
  // Malformed input is expected, and its verdict is in what it answers: nothing need be logged.
  [[maybe_unused]] static auto* const silenced = google::protobuf::SetLogHandler(nullptr);
  const auto* const pool = official::SessionMessage::descriptor()->file()->pool();
  const std::string name = "official" + std::string(fullName.substr(fullName.find('.')));
  const auto* const type = pool->FindMessageTypeByName(name);
  return std::unique_ptr<Message>(
      google::protobuf::MessageFactory::generated_factory()->GetPrototype(type)->New());
}

void fillRandomly(Message& message, Random& random) {
  const auto* const type = message.GetDescriptor();
  for (int at = 0; at < type->field_count(); ++at) {
    if (random.oneIn(4)) continue;
    std::size_t count = type->field(at)->is_repeated() ? random.below(4) : 1;
    for (; count > 0; --count) setRandomly(message, type->field(at), random);
  }
  UnknownFieldSet& unknownFields = *message.GetReflection()->MutableUnknownFields(&message);
  while (random.oneIn(4)) addRandomly(unknownFields, type, random, 3);
}

std::string randomEncoding(std::string_view fullName, Random& random) {
  const auto message = newOfficial(fullName);
  fillRandomly(*message, random);
  return message->SerializeAsString();
}

namespace {

// Whether the message or one in it holds unknown fields.
bool hasUnknownFields(const Message& message) {
  const auto& reflection = *message.GetReflection();
  if (!reflection.GetUnknownFields(message).empty()) return true;
  std::vector<const FieldDescriptor*> fields;
  reflection.ListFields(message, &fields);
  for (const FieldDescriptor* const field : fields) {
    if (field->cpp_type() != FieldDescriptor::CPPTYPE_MESSAGE) continue;
    const int count = field->is_repeated() ? reflection.FieldSize(message, field) : 1;
    for (int at = 0; at < count; ++at) {
      if (hasUnknownFields(field->is_repeated() ? reflection.GetRepeatedMessage(message, field, at)
                                                : reflection.GetMessage(message, field))) {
        return true;
      }
    }
  }
  return false;
}

// The one known difference: the official code drops the bits above 2^32 of a tag of five bytes, where we
// refuse it. Clears those bits in the tag that the error points to; answers whether there were any.
bool clearExcessBits(std::string& bytes, const DecodeError& error) {
  constexpr std::size_t lastByte = 4;
  if (error.cause != DecodeCause::malformedTag || bytes.size() - error.offset <= lastByte) return false;
  for (std::size_t at = 0; at < lastByte; ++at) {
    if (static_cast<signed char>(bytes[error.offset + at]) >= 0) return false;
  }
  char& last = bytes[error.offset + lastByte];
  if (static_cast<signed char>(last) < 0x10) return false;
  last = static_cast<char>(last & 0xF);
  return true;
}

}  // namespace

OfficialVerdict readBesideOfficial(const AnyMessage& type, std::string_view input, bool isDescribed) {
  const auto official = newOfficial(type.fullName());
  OfficialVerdict verdict{.isAccepted =
                              official->ParseFromArray(input.data(), static_cast<int>(input.size()))};
  auto message = type.parse(input);
  if (message.has_value() != verdict.isAccepted) {
    std::string bytes(input);
    while (!message && clearExcessBits(bytes, message.error())) message = type.parse(bytes);
  }
  if (message.has_value() != verdict.isAccepted) {
    verdict.fault =
        message ? "it is refused by the other" : "it is accepted by the other: " + message.error().message();
    return verdict;
  }
  if (!verdict.isAccepted) return verdict;

  const std::string encoded = (*message)->serialize().value();
  const std::string officiallyEncoded = official->SerializeAsString();
  if (encoded != officiallyEncoded) {
    // Ours keeps unknown fields as they came; the official code spells them the shortest way.
    const auto again = newOfficial(type.fullName());
    if (!hasUnknownFields(*official)) {
      verdict.fault = "its encoding is another";
    } else if (!again->ParseFromString(encoded) || again->SerializeAsString() != officiallyEncoded) {
      verdict.fault = "its encoding holds something else";
    }
  }
  if (isDescribed && !hasUnknownFields(*official) &&
      (*message)->debugDescription() != official->DebugString())
    verdict.fault = "its description is another";
  return verdict;
}

}  // namespace orv::test
