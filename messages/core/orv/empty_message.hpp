// Messages that say all by their type.
#pragma once

#include <string_view>
#include <tuple>

#include <orv/message.hpp>

namespace orv::inline v0 {

// The base of a message without fields. It keeps unknown fields as any message does.
template <class M>
class EmptyMessage : public Message<M> {
 protected:
  EmptyMessage() noexcept {}

 private:
  friend Message<M>;  // the rules read the table
  static constexpr std::tuple<> fields{};
};

}  // namespace orv
