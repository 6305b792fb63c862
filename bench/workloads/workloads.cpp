#include "bench/workloads/workloads.hpp"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <memory>
#include <random>
#include <span>
#include <utility>

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
  char text[48];
  std::snprintf(text, sizeof text, "member-%05zu@example.org", number);
  return text;
}

enum class Form { composed, decomposed };

std::string displayName(Form form) {
  return form == Form::composed ? "Zo\u00EB M\u00FCller-\u00C5ngstr\u00F6m"
                                : "Zoe\u0308 Mu\u0308ller-A\u030Angstro\u0308m";
}

orv_official::SessionMessage envelope(std::size_t size) {
  orv_official::SessionMessage message;
  message.set_version(1);
  message.set_type(orv_official::groupMessage);
  message.set_data(opaqueBytes(size, 1));
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

bool isAccepted(const Message& prototype, const std::string& bytes) {
  const std::unique_ptr<Message> message(prototype.New());
  return message->ParseFromString(bytes);
}

// The longest beginning of at most `size` bytes that is not a message in itself.
std::string cut(const Message& message, const std::string& bytes, std::size_t size) {
  while (isAccepted(message, bytes.substr(0, size))) --size;
  return bytes.substr(0, size);
}

// As many bytes, which are not a message.
std::string garbage(const Message& message, std::size_t size, std::uint64_t seed) {
  for (;; seed += 1'000'003) {
    std::string bytes = opaqueBytes(size, seed);
    if (!isAccepted(message, bytes)) return bytes;
  }
}

void addRefused(Workload& workload, std::string operation, std::string_view bytes, bool onlyForText = false,
                bool random = false) {
  const auto same = [&](const Refused& refused) { return refused.operation == operation; };
  auto found = std::ranges::find_if(workload.refused, same);
  if (found == workload.refused.end())
    found = workload.refused.insert(found, {std::move(operation), onlyForText, random, {}});
  found->bytes.emplace_back(bytes);
}

void addRefusedOf(Workload& workload, const Message& message, const std::string& bytes,
                  const std::vector<std::string>& texts) {
  if (workload.set == Set::first) {
    addRefused(workload, "refuse-truncated", bytes.substr(0, bytes.size() * 60 / 100));
    if (texts.empty()) return;
    addRefused(workload, "refuse-text", withIllFormedByteIn(texts.front(), bytes), true);
    addRefused(workload, "refuse-last-text", withIllFormedByteIn(texts.back(), bytes), true);
  } else if (workload.set == Set::later) {
    addRefused(workload, "refuse-cut-middle", cut(message, bytes, bytes.size() / 2));
    addRefused(workload, "refuse-cut-end", cut(message, bytes, bytes.size() - 1));
    addRefused(workload, "refuse-garbage", garbage(message, bytes.size(), workload.bytes.size()), false,
               true);
    for (std::size_t seed = 0; workload.bytes.size() == 1 && seed < 15; ++seed)
      addRefused(workload, "refuse-garbage", garbage(message, bytes.size(), bytes.size() * 100 + seed), false,
                 true);
    if (!texts.empty())
      addRefused(workload, "refuse-text-end", withIllFormedByteIn(texts.back(), bytes), true);
  }
}

void addMessage(Workload& workload, const Message& message, std::string_view unknown = {}) {
  Contents contents;
  collect(message, contents);
  const std::string bytes = message.SerializeAsString();
  workload.knownBytes.emplace_back(bytes);
  workload.bytes.emplace_back(bytes + std::string(unknown));
  addRefusedOf(workload, message, bytes + std::string(unknown), contents.texts);
  workload.payloads.assign(contents.payloads.begin(), contents.payloads.end());
  if (!unknown.empty()) workload.payloads.emplace_back(unknown);
}

Workload single(Set set, std::string name, Kind kind, const Message& message, std::string_view unknown = {}) {
  Workload result;
  result.name = std::move(name);
  result.set = set;
  result.kind = kind;
  addMessage(result, message, unknown);
  return result;
}

Workload withDecomposed(Workload workload, const Message& decomposed, std::string_view unknown = {}) {
  workload.decomposed.emplace_back(decomposed.SerializeAsString().append(unknown));
  return workload;
}

Workload groupWorkload(Set set, std::size_t members) {
  Workload result = single(set, "group-" + std::to_string(members), Kind::group, groupOf(members));
  result.members = members;
  return result;
}

void addFirst(std::vector<Workload>& all) {
  const auto add = [&](std::string name, Kind kind, const Message& message) {
    all.push_back(single(Set::first, std::move(name), kind, message));
  };
  add("envelope", Kind::sessionMessage, envelope(300));
  all.push_back(withDecomposed(
      single(Set::first, "connection-request", Kind::connectionRequest, connectionRequest(Form::composed)),
      connectionRequest(Form::decomposed)));
  add("connection-approval", Kind::connectionResponseContent, connectionApproval());
  add("join-request", Kind::joinRequest, joinRequest());
  all.push_back(withDecomposed(single(Set::first, "join-request-content", Kind::joinRequestContent,
                                      joinRequestContent(Form::composed)),
                               joinRequestContent(Form::decomposed)));
  add("join-approval", Kind::joinResponseContent, joinApproval(8));
  for (const std::size_t members : {2, 8, 100, 10'000}) all.push_back(groupWorkload(Set::first, members));
  add("member-left", Kind::group, memberLeft());
  all.push_back(withDecomposed(single(Set::first, "unknown-fields", Kind::joinRequestContent,
                                      joinRequestContent(Form::composed), unknownFields),
                               joinRequestContent(Form::decomposed), unknownFields));
}

// Letters of several scripts, of one to four bytes each.
constexpr std::string_view latin[] = {"a", "e", "i", "n", "r", "s", "t", "o", "l", "-", " ", "m"};
constexpr std::string_view cyrillic[] = {"\u0410", "\u043B", "\u0435", "\u043A", "\u0441", "\u0430",
                                         "\u043D", "\u0434", "\u0440", "\u0438", "\u0439", " "};
constexpr std::string_view cjk[] = {"\u5F20", "\u4F1F", "\u738B", "\u82B3", "\u674E", "\u5A1C",
                                    "\u5C71", "\u7530", "\u592A", "\u90CE", "\u6771", "\u4EAC"};
constexpr std::string_view emoji[] = {"\U0001F600", "\U0001F389", "\U0001F680", "\U0001F98A",
                                      "\U0001F31F", "\U0001F3B8", "\U0001F355", "\U0001F4A1",
                                      "\U0001F525", "\U0001F30D", "\U0001F916", "\U0001F47D"};
using Script = std::span<const std::string_view, 12>;

// A text of at most `size` bytes, and of more than `size` - 4.
std::string written(Script script, std::size_t size, std::uint64_t seed) {
  std::string text;
  for (const char choice : opaqueBytes(size, seed)) {
    const std::string_view letter = script[static_cast<unsigned char>(choice) % script.size()];
    if (text.size() + letter.size() > size) break;
    text += letter;
  }
  return text;
}

orv_official::ConnectionRequest requestIn(Script script, std::size_t handleSize, std::size_t nameSize) {
  orv_official::ConnectionRequest message;
  message.set_identifier(identifier(1));
  message.set_handle(written(script, handleSize, 11));
  message.set_displayname(written(script, nameSize, 12));
  return message;
}

orv_official::ConnectionRequest requestWithUserInfo(std::size_t size) {
  orv_official::ConnectionRequest message = connectionRequest(Form::composed);
  message.set_userinfo(opaqueBytes(size, 13));
  return message;
}

orv_official::ConnectionRequest longTexts() {
  orv_official::ConnectionRequest message;
  message.set_identifier(written(latin, 45, 14));
  message.set_handle(written(latin, 52, 15));
  message.set_displayname(written(latin, 60, 16));
  return message;
}

orv_official::Group groupWithLongTexts() {
  orv_official::Group message;
  message.mutable_initialize()->set_groupuuid(opaqueBytes(16, 7));
  for (std::size_t i = 0; i < 8; ++i) {
    auto* member = message.mutable_initialize()->add_members();
    member->set_handle(written(latin, 40 + 3 * i, 20 + i));
    member->set_tokenid(written(latin, 64 - 2 * i, 30 + i));
  }
  return message;
}

orv_official::JoinResponse::Content approvalInManyScripts() {
  orv_official::JoinResponse::Content message = joinApproval(0);
  const Script scripts[] = {latin, cyrillic, cjk, emoji};
  for (std::size_t i = 0; i < 12; ++i)
    message.mutable_approved()->add_memberhandles(written(scripts[i % 4], 12 + 3 * i, 40 + i));
  return message;
}

// Choices that are the same in every run.
class Chance {
 public:
  explicit Chance(std::uint64_t seed) : engine_(seed) {}

  std::size_t between(std::size_t least, std::size_t most) { return least + engine_() % (most - least + 1); }
  bool inTen(std::size_t count) { return between(1, 10) <= count; }
  // Mostly short, now and then as long as `most`, mostly in Latin letters.
  std::string text(std::size_t most) {
    const Script scripts[] = {cyrillic, cjk, emoji};
    const Script script = inTen(7) ? Script(latin) : scripts[between(0, 2)];
    return written(script, between(4, inTen(8) ? 36 : most), engine_());
  }
  std::string bytes(std::size_t least, std::size_t most) {
    return opaqueBytes(between(least, most), engine_());
  }

 private:
  std::mt19937_64 engine_;
};

orv_official::ConnectionRequest anyRequest(Chance& chance) {
  orv_official::ConnectionRequest message;
  message.set_identifier(identifier(chance.between(0, 1'000'000)));
  if (chance.inTen(9)) message.set_handle(chance.text(64));
  if (chance.inTen(6)) message.set_displayname(chance.text(80));
  if (chance.inTen(5)) message.set_userinfo(chance.bytes(1, chance.inTen(9) ? 100 : 1'000));
  return message;
}

void fillMember(orv_official::Member& member, Chance& chance) {
  member.set_handle(chance.text(64));
  if (chance.inTen(6)) member.set_tokenid(identifier(chance.between(0, 1'000'000)));
}

orv_official::Group anyEvent(Chance& chance) {
  orv_official::Group message;
  const std::string uuid = chance.bytes(16, 16);
  switch (chance.between(1, 4)) {
    case 1:
      message.mutable_initialize()->set_groupuuid(uuid);
      for (std::size_t i = chance.between(0, chance.inTen(9) ? 6 : 40); i != 0; --i)
        fillMember(*message.mutable_initialize()->add_members(), chance);
      break;
    case 2:
      message.mutable_memberadded()->set_groupuuid(uuid);
      fillMember(*message.mutable_memberadded()->mutable_member(), chance);
      break;
    case 3:
      message.mutable_memberremoved()->set_groupuuid(uuid);
      fillMember(*message.mutable_memberremoved()->mutable_member(), chance);
      break;
    case 4:
      message.mutable_memberleft()->set_groupuuid(uuid);
      message.mutable_memberleft()->set_usestoken(chance.inTen(5));
      break;
  }
  return message;
}

// Distinct messages, so many that neither branch predictor nor cache learns them.
template <class MakeMessage>
Workload distinct(std::string name, Kind kind, std::size_t count, MakeMessage makeMessage) {
  Workload result;
  result.name = std::move(name) + "-" + std::to_string(count);
  result.set = Set::later;
  result.kind = kind;
  Chance chance(count);
  for (std::size_t i = 0; i < count; ++i) addMessage(result, makeMessage(chance));
  result.payloads.clear();
  return result;
}

void addLater(std::vector<Workload>& all) {
  const auto add = [&](std::string name, Kind kind, const Message& message) {
    all.push_back(single(Set::later, std::move(name), kind, message));
  };
  add("long-texts", Kind::connectionRequest, longTexts());
  add("long-texts-group", Kind::group, groupWithLongTexts());
  add("cyrillic", Kind::connectionRequest, requestIn(cyrillic, 30, 56));
  add("cjk", Kind::connectionRequest, requestIn(cjk, 24, 48));
  add("emoji", Kind::connectionRequest, requestIn(emoji, 24, 48));
  add("many-scripts", Kind::joinResponseContent, approvalInManyScripts());
  for (const std::size_t members : {3, 50, 5'000}) {
    all.push_back(groupWorkload(Set::later, members));
    add("approval-" + std::to_string(members), Kind::joinResponseContent, joinApproval(members));
  }
  for (const std::size_t kibibytes : {4, 64}) {
    const std::size_t size = kibibytes * 1024;
    const std::string suffix = std::to_string(kibibytes) + "KiB";
    add("envelope-" + suffix, Kind::sessionMessage, envelope(size));
    add("user-info-" + suffix, Kind::connectionRequest, requestWithUserInfo(size));
    add("text-" + suffix, Kind::connectionRequest, requestIn(latin, 24, size));
  }
  for (const std::size_t count : {1'000, 10'000})
    all.push_back(distinct("requests", Kind::connectionRequest, count, anyRequest));
  for (const std::size_t count : {1'000, 10'000, 100'000})
    all.push_back(distinct("events", Kind::group, count, anyEvent));
}

}  // namespace

const std::vector<Workload>& workloads() {
  static const auto* const all = [] {
    auto* const memory = new std::pmr::monotonic_buffer_resource(16 << 20);
    std::pmr::memory_resource* const before = std::pmr::set_default_resource(memory);
    auto* const made = new std::vector<Workload>;
    addFirst(*made);
    addLater(*made);
    for (const std::size_t members : {1, 10, 100, 1'000, 10'000, 100'000})
      made->push_back(groupWorkload(Set::scaling, members));
    std::pmr::set_default_resource(before);
    return made;
  }();
  return *all;
}

}  // namespace bench
