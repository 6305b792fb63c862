#include "tools/orv/messages/message_type.hpp"

#include <algorithm>
#include <vector>

#include <orv/spelling/nearest_name.hpp>

namespace orv::tool {

namespace {

constexpr auto types = [] {
  std::array<MessageType, AllMessages::size> list{};
  std::size_t index = 0;
  AllMessages::forEach([&]<class M>() {
    list[index] = {index, &M::descriptor()};
    ++index;
  });
  return list;
}();

std::string_view lastWord(std::string_view name) { return name.substr(name.rfind('.') + 1); }

}  // namespace

std::span<const MessageType> allMessageTypes() { return types; }

const MessageType& typeOf(const MessageDescriptor& descriptor) {
  return *std::ranges::find(types, &descriptor, &MessageType::descriptor);
}

std::expected<const MessageType*, std::string> findMessageType(std::string_view name) {
  std::vector<const MessageType*> sameLastWord;
  for (const MessageType& type : types) {
    if (name == type.fullName() || name == type.shortName()) return &type;
    if (name == lastWord(type.fullName())) sameLastWord.push_back(&type);
  }
  if (sameLastWord.size() == 1) return sameLastWord.front();
  const std::string quoted = "\"" + std::string(name) + "\"";
  if (sameLastWord.empty()) {
    return std::unexpected("unknown message type " + quoted +
                           spelling::suggestion(name, types, &MessageType::shortName));
  }
  std::string error = quoted + " could be ";
  for (const MessageType* type : sameLastWord) {
    if (type != sameLastWord.front()) error += type == sameLastWord.back() ? " or " : ", ";
    error += type->shortName();
  }
  return std::unexpected(error);
}

}  // namespace orv::tool
