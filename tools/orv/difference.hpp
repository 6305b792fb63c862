// Where two messages of one type differ.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "tools/orv/message_value.hpp"

namespace orv::tool {

struct Difference {
  enum class Kind : std::uint8_t { changed, removed, added };

  Kind kind;
  std::string path;
  // As people read it; empty on the side that has nothing there. Long values are shown from where they
  // differ.
  std::string before;
  std::string after;
};

// By the model's own equality: no differences when the messages are equal, and at least one when they are
// not. In the order of the fields.
std::vector<Difference> differences(const MessageValue& before, const MessageValue& after);

}  // namespace orv::tool
