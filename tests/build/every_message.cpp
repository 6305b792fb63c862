// What a program does with messages, for the compiler to look at.
#include <iostream>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include <orv/orv.hpp>

namespace {

template <class M>
bool isTreatedAsAValue(std::string_view bytes) {
  const auto parsed = M::parse(bytes);
  if (!parsed) return std::cout << parsed.error() << '\n' && false;
  M message = *parsed;
  M moved = std::move(message);
  message = moved;
  std::swap(message, moved);
  std::optional<M> optional;
  if (bytes.size() > 1) optional = message;
  const std::optional<M> other = std::move(optional);
  std::vector<M> list{message, moved};
  list.push_back(other.value_or(M()));
  list.insert(list.begin(), std::move(list.back()));
  list.erase(list.begin() + 1);
  std::unordered_set<M> set(list.begin(), list.end());
  if (!message.merge(bytes) || !message.reparse(bytes)) return false;
  std::vector<unsigned char> buffer(message.encodedSize());
  if (!message.serializeInto(buffer)) return false;
  const auto text = message.serialize();
  std::cout << message << message.debugDescription() << message.redactedDescription();
  return text && M::parse(*text) == message && set.contains(moved) && message <= moved;
}

orv::Group event(const orv::Text& handle, std::optional<orv::Text> token) {
  orv::Group::Initialization start;
  start.setGroupUuid(orv::ByteBuffer("group"));
  orv::Member member;
  member.setHandle(handle + "@home");
  if (token) member.setTokenID(*std::move(token));
  start.mutableMembers().assign(3, member);
  orv::Group group;
  group.setInitialize(std::move(start));
  if (member.hasTokenID()) group.mutableMemberAdded().setMember(std::move(member));
  return group;
}

orv::SessionMessage sessionMessage(std::uint32_t version, const orv::Group& group) {
  orv::SessionMessage message;
  message.setVersion(version);
  message.setType(orv::VessaSessionMessageType::groupMessage);
  message.setData(group.serialize().value_or(""));
  if (version == 0) message.clearVersion();
  return message;
}

orv::JoinResponse::Content response(bool isApproved) {
  orv::JoinResponse::Content content;
  content.setIdentifier("anna");
  if (!isApproved) return content.setDenied({}), content;
  orv::JoinResponse::Content::ApprovalContent approval;
  approval.setMemberHandles({"anna", "ben"});
  approval.setUserInfo(orv::ByteBuffer("\x01\x02"));
  content.setOperation(approval);
  return content;
}

}  // namespace

int main(int count, char** arguments) {
  const std::string_view bytes = count > 1 ? arguments[1] : "";
  std::cout << sessionMessage(static_cast<std::uint32_t>(count), event(bytes, std::nullopt))
            << response(count > 1);
  bool isSound = true;
  orv::AllMessages::forEach([&]<class M>() { isSound = isTreatedAsAValue<M>(bytes) && isSound; });
  return isSound ? 0 : 1;
}
