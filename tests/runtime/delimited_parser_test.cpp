#include <orv/delimited_parser.hpp>
#include <orv/delimited_writer.hpp>

#include <gtest/gtest.h>

#include <orv/session_message.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

using Cause = StreamError::Cause;

TEST(DelimitedParser, GivesTheMessagesWhateverPiecesAreAndHoweverTheyArePopped) {
  const std::string bodies[] = {
      "", "a", std::string(127, 'b'), std::string(128, 'c'), std::string(200'000, 'd'), ""};
  std::string stream;
  for (const std::string& body : bodies) stream += varint(body.size()) + body;
  for (const std::size_t pieceSize : {std::size_t{1}, std::size_t{3}, std::size_t{4096}, stream.size()}) {
    for (const bool popsAtTheEnd : {false, true}) {
      DelimitedParser parser;
      std::vector<std::string> popped;
      const auto pop = [&] {
        for (;;) {
          const auto bytes = parser.next();
          ASSERT_TRUE(bytes);
          if (!bytes->has_value()) return;
          popped.emplace_back(ByteView(**bytes).characters());
          EXPECT_EQ(stream.substr(static_cast<std::size_t>(parser.messageOffset()), popped.back().size()),
                    popped.back());
        }
      };
      for (std::size_t at = 0; at < stream.size(); at += pieceSize) {
        parser.push(stream.substr(at, pieceSize));
        if (!popsAtTheEnd) pop();
      }
      pop();
      EXPECT_TRUE(std::ranges::equal(popped, bodies));
      EXPECT_TRUE(parser.finish());
    }
  }
}

TEST(DelimitedParser, SaysWhatIsWrongAndWhere) {
  const struct {
    const char* name;
    const char* stream;
    Cause cause;
    std::size_t offset;
    std::size_t length;
  } cases[] = {
      {"ends in a length", "02 08 00 80", Cause::truncated, 3, 0},
      {"ends before a body", "02 08 00 02", Cause::truncated, 3, 0},
      {"ends in a body", "02 08 00 02 08", Cause::truncated, 3, 0},
      {"a length of six bytes", "80 80 80 80 80", Cause::malformedLength, 0, 0},
      {"a length of 2^31", "02 08 00 80 80 80 80 08", Cause::malformedLength, 3, 0},
      {"a length of 2^32", "80 80 80 80 10", Cause::malformedLength, 0, 0},
      {"longer than allowed", "02 08 00 65", Cause::tooLarge, 3, 101},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    DelimitedParser parser(100);
    std::expected<std::optional<SessionMessage>, StreamError> message;
    // Whatever is wrong is said when the byte is there that shows it.
    for (const char byte : hex(row.stream)) {
      ASSERT_TRUE(message);
      parser.push(std::string_view(&byte, 1));
      message = parser.read<SessionMessage>();
    }
    const auto end = parser.finish();
    ASSERT_FALSE(end);
    EXPECT_EQ(end.error(), (StreamError{.cause = row.cause, .offset = row.offset, .length = row.length}));
    EXPECT_EQ(message.has_value(), row.cause == Cause::truncated);
    parser.push("\x00"_bytes);
    EXPECT_EQ(parser.next().error(), end.error());
    EXPECT_NE(parser.next().error(), StreamError());
  }
}

TEST(DelimitedParser, GoesOnBehindAMalformedMessage) {
  DelimitedParser parser;
  parser.push({});
  parser.push(hex("02 08 00 02 08 80 02 08 07"));
  EXPECT_EQ(parser.read<SessionMessage>().value()->version(), 0U);
  EXPECT_EQ(parser.read<SessionMessage>().error().message(),
            "orv.SessionMessage.version: the input ends inside a record, at byte 5");
  EXPECT_EQ(parser.read<SessionMessage>().value()->version(), 7U);
  EXPECT_FALSE(parser.read<SessionMessage>().value());
}

TEST(DelimitedParser, TakesMemoryForWhatIsWaiting) {
  const std::string messages = varint(1000) + std::string(1000, 'x');
  const std::string announcement = varint(50'000'000);
  const HeapMeter meter;
  DelimitedParser parser;
  for (int round = 0; round < 1000; ++round) {
    parser.push(messages);
    EXPECT_EQ(parser.next().value()->size(), 1000U);
  }
  parser.push(announcement);
  EXPECT_FALSE(parser.next().value());
  EXPECT_LT(meter.peakBytes(), 10'000U);
}

TEST(DelimitedHeader, IsTheLengthThatStandsBeforeAMessage) {
  for (const std::size_t size : {0U, 1U, 127U, 128U, 16383U, 16384U, 0x7FFFFFFFU}) {
    const std::string expected = varint(size);
    EXPECT_TRUE(std::ranges::equal(DelimitedHeader(size), std::as_bytes(std::span(expected)))) << size;
  }
}

}  // namespace
}  // namespace orv::test
