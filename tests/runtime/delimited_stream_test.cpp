#include <orv/delimited_stream.hpp>

#include <gtest/gtest.h>

#include <utility>

#include <orv/all_messages.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

using Cause = StreamError::Cause;

// Reads from a string, at most `pieceSize` bytes at a time; fails where it ends if it is told to.
ReadFunction readerOf(std::string bytes, std::size_t pieceSize, bool fails = false) {
  return
      [bytes = std::move(bytes), pieceSize, fails, at = std::size_t{0}](std::span<std::byte> room) mutable {
        const std::size_t count = std::min({room.size(), pieceSize, bytes.size() - at});
        std::ranges::copy(std::as_bytes(std::span(bytes).subspan(at, count)), room.begin());
        at += count;
        return count == 0 && fails ? std::ptrdiff_t{-1} : static_cast<std::ptrdiff_t>(count);
      };
}

TEST(DelimitedStream, GivesTheMessagesWhateverPiecesItComesIn) {
  const std::string bodies[] = {
      "", "a", std::string(127, 'b'), std::string(128, 'c'), std::string(200'000, 'd'), ""};
  std::string stream;
  for (const std::string& body : bodies) stream += varint(body.size()) + body;
  for (const std::size_t pieceSize : {std::size_t{1}, std::size_t{3}, std::size_t{4096}, SIZE_MAX}) {
    DelimitedReader reader(readerOf(stream, pieceSize));
    std::size_t offset = 0;
    for (const std::string& body : bodies) {
      const auto bytes = reader.next();
      ASSERT_TRUE(bytes && *bytes);
      EXPECT_TRUE(std::ranges::equal(**bytes, std::as_bytes(std::span(body))));
      offset += varint(body.size()).size();
      EXPECT_EQ(reader.messageOffset(), offset);
      offset += body.size();
    }
    for (int again = 0; again < 2; ++again) {
      const auto end = reader.next();
      EXPECT_TRUE(end && !*end);
    }
  }
}

TEST(DelimitedStream, SaysWhatIsWrongAndWhere) {
  const struct {
    const char* name;
    const char* stream;
    bool fails;
    Cause cause;
    std::size_t offset;
    const char* message;
  } cases[] = {
      {"ends in a length", "02 08 00 80", false, Cause::truncated, 3,
       "the stream ends inside a message, at byte 3"},
      {"ends before a body", "02 08 00 02", false, Cause::truncated, 3,
       "the stream ends inside a message, at byte 3"},
      {"ends in a body", "02 08 00 02 08", false, Cause::truncated, 3,
       "the stream ends inside a message, at byte 3"},
      {"a length of six bytes", "80 80 80 80 80 00", false, Cause::malformedLength, 0,
       "length of 2^31 or more, or spelled in more than five bytes, at byte 0"},
      {"a length of 2^31", "02 08 00 80 80 80 80 08", false, Cause::malformedLength, 3,
       "length of 2^31 or more, or spelled in more than five bytes, at byte 3"},
      {"a length of 2^32", "80 80 80 80 10", false, Cause::malformedLength, 0,
       "length of 2^31 or more, or spelled in more than five bytes, at byte 0"},
      {"longer than allowed", "02 08 00 65 61", false, Cause::tooLarge, 3,
       "message longer than is allowed (101 bytes), at byte 3"},
      {"a malformed message", "02 08 00 02 08 80", false, Cause::malformedMessage, 5,
       "orv.SessionMessage.version: the input ends inside a record, at byte 5"},
      {"cannot be read", "02 08 00", true, Cause::readFailed, 3, "the stream could not be read, at byte 3"},
      {"cannot be read in a length", "02 08 00 80", true, Cause::readFailed, 3,
       "the stream could not be read, at byte 3"},
      {"cannot be read in a body", "02 08", true, Cause::readFailed, 0,
       "the stream could not be read, at byte 0"},
  };
  for (const auto& row : cases) {
    for (const std::size_t pieceSize : {std::size_t{1}, SIZE_MAX}) {
      SCOPED_TRACE(row.name);
      DelimitedReader reader(readerOf(hex(row.stream), pieceSize, row.fails), 100);
      auto message = reader.read<SessionMessage>();
      if (message && *message) message = reader.read<SessionMessage>();
      ASSERT_FALSE(message);
      EXPECT_EQ(message.error().cause, row.cause);
      EXPECT_EQ(message.error().offset, row.offset);
      EXPECT_EQ(message.error().message(), row.message);
      if (row.cause == Cause::malformedMessage) continue;  // the next message can be read
      const auto again = reader.next();
      ASSERT_FALSE(again);
      EXPECT_EQ(again.error().message(), row.message);
    }
  }
}

TEST(DelimitedStream, TakesMemoryForWhatArrivesNotForWhatIsAnnounced) {
  constexpr std::size_t most = std::numeric_limits<std::int32_t>::max();
  const HeapMeter meter;
  DelimitedReader reader(readerOf(varint(most) + std::string(1000, 'x'), SIZE_MAX), most);
  EXPECT_EQ(reader.next().error().cause, Cause::truncated);
  EXPECT_LT(meter.peakBytes(), 200'000U);
}

TEST(DelimitedStream, ReadsNoFurtherThanTheReadFunctionGave) {
  // A peer that waits for an answer sends nothing behind its message, and nothing at all behind an empty one.
  for (const std::string& stream : {hex("02 08 01"), hex("00")}) {
    int calls = 0;
    DelimitedReader reader([&](std::span<std::byte> room) -> std::ptrdiff_t {
      if (++calls > 1) {
        ADD_FAILURE() << "would wait for ever";
        return 0;
      }
      std::ranges::copy(std::as_bytes(std::span(stream)), room.begin());
      return static_cast<std::ptrdiff_t>(stream.size());
    });
    EXPECT_EQ(reader.read<SessionMessage>().value()->encodedSize(), stream.size() - 1);
  }
}

TEST(DelimitedStream, AppendsMessagesBehindTheirLengths) {
  std::string stream = "x";
  SessionMessage message;
  ASSERT_TRUE(appendDelimited(message, stream));
  message.setData(ByteBuffer(std::string(200, 'd')));
  ASSERT_TRUE(appendDelimited(message, stream));
  ASSERT_TRUE(appendDelimited("y", stream));
  EXPECT_EQ(toHex(stream), toHex("x" + hex("00 CB 01") + record(3, std::string(200, 'd')) + "\x01y"));
}

TEST(DelimitedStream, AppendsItsOwnBytes) {
  for (const std::size_t size : {std::size_t{1}, std::size_t{15}, std::size_t{16}, std::size_t{200}}) {
    const std::string before(size, 's');
    std::string stream = before;
    ASSERT_TRUE(appendDelimited(std::string_view(stream).substr(size / 2), stream));
    EXPECT_EQ(stream, before + varint(size - size / 2) + before.substr(size / 2));
    ASSERT_TRUE(appendDelimited(std::string_view(stream).substr(0, 0), stream));
    EXPECT_TRUE(stream.ends_with('\0'));
  }
}

TEST(DelimitedStream, EndsWhereTheReadFunctionLies) {
  constexpr std::int64_t lies[] = {PTRDIFF_MIN, -1,         PTRDIFF_MIN + 1, 1 << 20,
                                   PTRDIFF_MAX, 0xFFFFFFFF, 0x100000001};
  for (const std::int64_t number : lies) {
    if (!std::in_range<std::ptrdiff_t>(number)) continue;  // where the machine has 32 bits
    const auto lie = static_cast<std::ptrdiff_t>(number);
    SCOPED_TRACE(lie);
    DelimitedReader reader([&](std::span<std::byte> room) {
      std::ranges::fill(room, std::byte{0x01});
      return lie;
    });
    EXPECT_EQ(reader.next().error().cause, Cause::readFailed);
  }
}

TEST(DelimitedStream, ReadsNothingAfterAnExceptionFromInside) {
  // A message takes memory as its bytes arrive and when it is made of them; where it ran out while the stream was
  // read nobody knows where the stream is.
  const std::string first = record(3, std::string(100'000, 'd'));
  const std::string stream = varint(first.size()) + first + hex("02 08 07");
  std::size_t broken = 0;
  const std::size_t failures =
      runOutOfMemory([&] { return DelimitedReader(readerOf(stream, SIZE_MAX)); },
                     [](DelimitedReader& reader) { EXPECT_TRUE(reader.read<SessionMessage>()); },
                     [&](DelimitedReader& reader) {
                       const auto next = reader.read<SessionMessage>();
                       broken += !next;
                       if (next) {
                         EXPECT_EQ((*next)->version(), 7U);
                       } else {
                         EXPECT_EQ(next.error().cause, Cause::readFailed);
                       }
                     });
  EXPECT_GT(broken, 1U);
  EXPECT_LT(broken, failures);
}

TEST(DelimitedStream, GoesOnInAReaderThatWasMovedTo) {
  DelimitedReader first(readerOf(hex("02 08 01 02 08 02"), 1));
  EXPECT_EQ(first.read<SessionMessage>().value()->version(), 1U);
  DelimitedReader second(readerOf("", 1));
  second = std::move(first);
  DelimitedReader third(std::move(second));
  EXPECT_EQ(third.read<SessionMessage>().value()->version(), 2U);
  EXPECT_FALSE(third.read<SessionMessage>().value());
}

}  // namespace
}  // namespace orv::test
