#pragma once

#include <cstddef>
#include <memory_resource>
#include <string>
#include <string_view>
#include <vector>

namespace bench {

// The message types that the workloads use. A peer lists its own types in this order.
enum class Kind {
  sessionMessage,
  connectionRequest,
  connectionResponseContent,
  joinRequest,
  joinRequestContent,
  joinResponseContent,
  group,
};

// The workloads that have been measured from the beginning; those that came later, whose data nobody has tuned
// for; and groups of 1 to 100,000 members, for the cost per member.
enum class Set { first, later, scaling };

// They lie in memory of their own. Were they strewn over the heap, whoever takes many small blocks of it would
// pay for the holes between them.
using ByteStrings = std::pmr::vector<std::pmr::string>;

// Bytes that a decoder has to refuse, one for each message of the workload.
struct Refused {
  std::string operation;
  // Whether only those refuse them who check text. Of bytes made at random not every peer refuses all.
  bool onlyForText = false;
  bool random = false;
  ByteStrings bytes;
};

// One message, or many that take turns, with everything that the operations need of them. All bytes come from
// code that protoc generates.
struct Workload {
  std::string name;
  Set set{};
  Kind kind{};
  // The messages as they arrive, and the same without their unknown fields, for peers that drop them.
  ByteStrings bytes;
  ByteStrings knownBytes;
  std::vector<Refused> refused;
  // The contents of the texts and byte fields of a single message and its unknown fields, in wire order: what
  // any decoder must copy.
  ByteStrings payloads;
  // A single message with its texts decomposed. Empty where that changes nothing.
  ByteStrings decomposed;
  // How many members the group has; 0 for other messages.
  std::size_t members = 0;
};

// All of them, made when first asked for.
const std::vector<Workload>& workloads();

}  // namespace bench
