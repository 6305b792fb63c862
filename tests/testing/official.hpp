// An independent implementation of the messages: the code that protoc generates from the schema, in a package
// of its own.
#pragma once

#include <google/protobuf/message.h>

#include <memory>
#include <string>
#include <string_view>

#include "tests/testing/any_message.hpp"
#include "tests/testing/random.hpp"

namespace orv::test {

// An empty message of the type that has this full name in the schema.
std::unique_ptr<google::protobuf::Message> newOfficial(std::string_view fullName);

// Sets random fields to random values, edge values and unknown fields among them.
void fillRandomly(google::protobuf::Message& message, Random& random);

// The encoding of a random message. No two texts in it are canonically equivalent unless they are the same.
std::string randomEncoding(std::string_view fullName, Random& random);

// What both implementations make of the same bytes: the same verdict, encoding, unknown fields and, when wanted,
// description; or else the fault.
struct OfficialVerdict {
  bool isAccepted = false;
  std::string fault{};
};
OfficialVerdict readBesideOfficial(const AnyMessage& type, std::string_view input, bool isDescribed = true);

}  // namespace orv::test
