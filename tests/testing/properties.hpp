// What holds for any input. Each function answers what does not hold, and nothing when all does; the tests try them
// on random inputs, the fuzzers on theirs.
#pragma once

#include <array>
#include <string>
#include <string_view>

#include "tests/testing/any_message.hpp"

namespace orv::test {

// The message's encoding has the size that is announced, fits where it should, and gives an equal message.
std::string faultOfEncoding(const AnyMessage& message);

// parse, merge and reparse agree on the bytes, an error is inside them, and what was read can be written.
std::string faultOfReading(const AnyMessage& type, std::string_view bytes);

// Reading one encoding and then the other is reading both in one, and so it is in the memory of a message that held
// something else before.
std::string faultOfMerging(const AnyMessage& type, std::string_view left, std::string_view right);

// A conflict hook that refuses at its k-th call, for each k, is not asked again; its error comes back as it was
// made, and the message holds the records before the one that was refused.
std::string faultOfRefusing(const AnyMessage& type, std::string_view bytes);

// Texts are equal when their slow decompositions are, and then hash alike; messages are equal when their texts are.
std::string faultOfComparing(const std::array<std::string_view, 3>& texts);

// A stream gives the messages that lie in it, and the same error behind them, in whatever pieces it comes: each
// byte of `pieces` is the size of one.
std::string faultOfStream(std::string_view stream, std::string_view pieces);

}  // namespace orv::test
