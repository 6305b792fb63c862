#pragma once

#include <cstddef>
#include <span>
#include <string>
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

// One message with everything that the operations need of it. All bytes come from code that protoc generates.
struct Workload {
  std::string name;
  Kind kind{};
  // The message as it arrives, and the same without its unknown fields, for peers that drop them.
  std::string bytes;
  std::string knownBytes;
  // The contents of its texts and byte fields and its unknown fields, in wire order: what any decoder must
  // copy.
  std::vector<std::string> payloads;
  // The same message with its texts decomposed. Empty where that changes nothing.
  std::string decomposed;
  // The first 60 percent of the bytes.
  std::string truncated;
  // An ill-formed byte in the middle of the first text, or of the last. Empty where there is no text.
  std::string illFormedFirst;
  std::string illFormedLast;
  // How many members the group has; 0 for other messages.
  std::size_t members = 0;
};

// The messages that every operation is measured with.
const std::vector<Workload>& workloads();

// Groups of 1 to 100,000 members, for the cost per member.
const std::vector<Workload>& scalingWorkloads();

}  // namespace bench
