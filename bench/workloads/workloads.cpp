#include "bench/workloads/workloads.hpp"

#include <cstdint>
#include <cstdio>
#include <string_view>

#include "orv_official.pb.h"

namespace bench {
namespace {

using google::protobuf::FieldDescriptor;
using google::protobuf::Message;

// The same pseudo-random bytes in every run, for the byte fields.
std::string opaqueBytes(std::size_t count, std::uint64_t seed) {
  std::string bytes(count, '\0');
  for (char& byte : bytes) {
    seed = seed * 6364136223846793005u + 1442695040888963407u;
    byte = static_cast<char>(seed >> 56);
  }
  return bytes;
}

// A token or identifier in the usual form of a UUID: 36 characters.
std::string identifier(std::uint64_t number) {
  const std::uint64_t mixed = (number + 1) * 0x9E3779B97F4A7C15u;
  char text[37];
  std::snprintf(text, sizeof text, "%08X-%04X-4%03X-A%03X-%012llX", static_cast<unsigned>(mixed >> 32),
                static_cast<unsigned>(mixed >> 16 & 0xFFFF), static_cast<unsigned>(mixed & 0xFFF),
                static_cast<unsigned>(mixed >> 52), static_cast<unsigned long long>(mixed & 0xFFFFFFFFFFFF));
  return text;
}

// A handle of 24 characters.
std::string handle(std::size_t number) {
  char text[32];
  std::snprintf(text, sizeof text, "member-%05zu@example.org", number);
  return text;
}

enum class Form { composed, decomposed };

std::string displayName(Form form) {
  return form == Form::composed ? "Zo\u00EB M\u00FCller-\u00C5ngstr\u00F6m"
                                : "Zoe\u0308 Mu\u0308ller-A\u030Angstro\u0308m";
}

orv_official::SessionMessage envelope() {
  orv_official::SessionMessage message;
  message.set_version(1);
  message.set_type(orv_official::groupMessage);
  message.set_data(opaqueBytes(300, 1));
  return message;
}

orv_official::ConnectionRequest connectionRequest(Form form) {
  orv_official::ConnectionRequest message;
  message.set_identifier(identifier(0));
  message.set_handle(handle(0));
  message.set_displayname(displayName(form));
  message.set_userinfo(opaqueBytes(64, 2));
  return message;
}

orv_official::ConnectionResponse::Content connectionApproval() {
  orv_official::ConnectionResponse::Content message;
  message.set_identifier(identifier(0));
  message.set_handle(handle(0));
  message.mutable_approved()->set_invitationdata(opaqueBytes(128, 3));
  return message;
}

orv_official::JoinRequest joinRequest() {
  orv_official::JoinRequest message;
  message.set_publickey(opaqueBytes(65, 4));
  message.set_encrypteddata(opaqueBytes(512, 5));
  return message;
}

orv_official::JoinRequest::Content joinRequestContent(Form form) {
  orv_official::JoinRequest::Content message;
  message.set_identifier(identifier(0));
  message.set_displayname(displayName(form));
  message.set_userinfo(opaqueBytes(64, 6));
  message.set_wantstokenuri(true);
  return message;
}

orv_official::JoinResponse::Content joinApproval(std::size_t handles) {
  orv_official::JoinResponse::Content message;
  message.set_identifier(identifier(0));
  message.mutable_approved()->set_sessionidentifier(identifier(1));
  for (std::size_t i = 0; i < handles; ++i) message.mutable_approved()->add_memberhandles(handle(i));
  return message;
}

orv_official::Group groupOf(std::size_t members) {
  orv_official::Group message;
  message.mutable_initialize()->set_groupuuid(opaqueBytes(16, 7));
  for (std::size_t i = 0; i < members; ++i) {
    auto* member = message.mutable_initialize()->add_members();
    member->set_handle(handle(i));
    member->set_tokenid(identifier(i));
  }
  return message;
}

orv_official::Group memberLeft() {
  orv_official::Group message;
  message.mutable_memberleft()->set_groupuuid(opaqueBytes(16, 7));
  message.mutable_memberleft()->set_usestoken(true);
  return message;
}

// Field 2 as text, field 6 as a varint and field 100 as a fixed 32-bit number: none is in the schema.
constexpr std::string_view unknownFields(
    "\x12\x10not in the schema"
    "\x30\x96\x01"
    "\xA5\x06\x01\x02\x03\x04",
    18 + 3 + 6);

struct Contents {
  std::vector<std::string> payloads;
  std::vector<std::string> texts;
};

void collect(const Message& message, Contents& contents) {
  const auto& reflection = *message.GetReflection();
  std::vector<const FieldDescriptor*> fields;
  reflection.ListFields(message, &fields);
  for (const FieldDescriptor* field : fields) {
    const int count = field->is_repeated() ? reflection.FieldSize(message, field) : 1;
    for (int i = 0; i < count; ++i) {
      if (field->cpp_type() == FieldDescriptor::CPPTYPE_MESSAGE) {
        collect(field->is_repeated() ? reflection.GetRepeatedMessage(message, field, i)
                                     : reflection.GetMessage(message, field),
                contents);
      } else if (field->cpp_type() == FieldDescriptor::CPPTYPE_STRING) {
        contents.payloads.push_back(field->is_repeated() ? reflection.GetRepeatedString(message, field, i)
                                                         : reflection.GetString(message, field));
        if (field->type() == FieldDescriptor::TYPE_STRING) contents.texts.push_back(contents.payloads.back());
      }
    }
  }
}

std::string withIllFormedByteIn(const std::string& text, std::string bytes) {
  bytes[bytes.rfind(text) + text.size() / 2] = '\xFF';
  return bytes;
}

Workload workload(std::string name, Kind kind, const Message& message, std::string_view unknown = {}) {
  Contents contents;
  collect(message, contents);
  Workload result;
  result.name = std::move(name);
  result.kind = kind;
  result.knownBytes = message.SerializeAsString();
  result.bytes = result.knownBytes + std::string(unknown);
  result.payloads = std::move(contents.payloads);
  if (!unknown.empty()) result.payloads.emplace_back(unknown);
  result.truncated = result.bytes.substr(0, result.bytes.size() * 60 / 100);
  if (!contents.texts.empty()) {
    result.illFormedFirst = withIllFormedByteIn(contents.texts.front(), result.bytes);
    result.illFormedLast = withIllFormedByteIn(contents.texts.back(), result.bytes);
  }
  return result;
}

Workload withDecomposed(Workload workload, const Message& decomposed, std::string_view unknown = {}) {
  workload.decomposed = decomposed.SerializeAsString().append(unknown);
  return workload;
}

Workload groupWorkload(std::size_t members) {
  Workload result = workload("group-" + std::to_string(members), Kind::group, groupOf(members));
  result.members = members;
  return result;
}

}  // namespace

const std::vector<Workload>& workloads() {
  static const auto* const all = new std::vector<Workload>{
      workload("envelope", Kind::sessionMessage, envelope()),
      withDecomposed(
          workload("connection-request", Kind::connectionRequest, connectionRequest(Form::composed)),
          connectionRequest(Form::decomposed)),
      workload("connection-approval", Kind::connectionResponseContent, connectionApproval()),
      workload("join-request", Kind::joinRequest, joinRequest()),
      withDecomposed(
          workload("join-request-content", Kind::joinRequestContent, joinRequestContent(Form::composed)),
          joinRequestContent(Form::decomposed)),
      workload("join-approval", Kind::joinResponseContent, joinApproval(8)),
      groupWorkload(2),
      groupWorkload(8),
      groupWorkload(100),
      groupWorkload(10'000),
      workload("member-left", Kind::group, memberLeft()),
      withDecomposed(workload("unknown-fields", Kind::joinRequestContent, joinRequestContent(Form::composed),
                              unknownFields),
                     joinRequestContent(Form::decomposed), unknownFields),
  };
  return *all;
}

const std::vector<Workload>& scalingWorkloads() {
  static const auto* const all =
      new std::vector<Workload>{groupWorkload(1),     groupWorkload(10),     groupWorkload(100),
                                groupWorkload(1'000), groupWorkload(10'000), groupWorkload(100'000)};
  return *all;
}

}  // namespace bench
