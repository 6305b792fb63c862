// The message types by name, and tables of functions for each of them.
#pragma once

#include <array>
#include <cstddef>
#include <expected>
#include <span>
#include <string>
#include <string_view>

#include <orv/all_messages.hpp>

namespace orv::tool {

// One of the types in AllMessages. There is one object per type: two pointers are equal when the types are.
struct MessageType {
  std::size_t index;  // in AllMessages
  const MessageDescriptor* descriptor;

  std::string_view fullName() const { return descriptor->fullName; }
  // Without the package: "Group.MemberAdded".
  std::string_view shortName() const { return fullName().substr(fullName().find('.') + 1); }
  bool isEnvelope() const { return descriptor == &SessionMessage::descriptor(); }
};

std::span<const MessageType> allMessageTypes();

const MessageType& typeOf(const MessageDescriptor& descriptor);
template <class M>
const MessageType& typeOf() {
  return typeOf(M::descriptor());
}

// Finds a type by its full name, its name without the package, or the last word of it where that is one
// type's alone. The error says what is wrong with the name.
std::expected<const MessageType*, std::string> findMessageType(std::string_view name);

// One function per type, to be called by a type's index: `make` is called once with each message type as its
// template argument.
template <class Function, class Make>
constexpr std::array<Function*, AllMessages::size> functionPerType(Make make) {
  std::array<Function*, AllMessages::size> table{};
  std::size_t index = 0;
  AllMessages::forEach([&]<class M>() { table[index++] = make.template operator()<M>(); });
  return table;
}

}  // namespace orv::tool
