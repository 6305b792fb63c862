// Values in std::format, where the standard library has it.
#include <orv/format.hpp>

#include <gtest/gtest.h>

#include <memory>

#include <orv/group.hpp>
#include <orv/session_message.hpp>

#ifdef __cpp_lib_format

namespace orv::test {
namespace {

struct Abstract {
  virtual ~Abstract() = default;
  virtual void call() = 0;
};
static_assert(std::formattable<Group, char>);
static_assert(!std::formattable<UnknownField, char>);
static_assert(!std::formattable<Abstract, char>);
static_assert(!std::formattable<std::unique_ptr<Group>, char>);

TEST(Format, ShowsValuesAndErrorsAsStreamsDo) {
  const DecodeError error = Group::parse("\x12\x05").error();
  const StreamError streamError{
      .cause = StreamError::Cause::malformedMessage, .offset = 7, .decodeError = error};
  Member member;
  member.setHandle("zo\u00EB");
  const std::pair<std::string, const char*> cases[] = {
      {std::format("{}", member), "orv.Member { handle: \"zo\\303\\253\" }"},
      {std::format("{:*>6}|{:.2}", member.handle(), member.handle()), "***zo\u00EB|zo"},
      {std::format("{:6}|", ByteBuffer("\x0a\xff")), "0aff  |"},
      {std::format("{}", VessaSessionMessageType::groupMessage), "groupMessage"},
      {std::format("{}", error), "orv.Group.memberAdded: length 5 runs 5 bytes past the end, at byte 1"},
      {std::format("{}", error.cause), "length runs past the end"},
      {std::format("{}", error.path), "orv.Group.memberAdded"},
      {std::format("{}", streamError),
       "orv.Group.memberAdded: length 5 runs 5 bytes past the end, at byte 7"},
      {std::format("{}", streamError.cause), "malformed message"},
      {std::format("{}", EncodeError::bufferTooSmall), "the buffer is too small for the encoding"},
      {std::format("{}", Text::checked("ab\xff").error()), "ill-formed UTF-8 at byte 2"},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(text, expected);
}

}  // namespace
}  // namespace orv::test

#elif defined(_LIBCPP_VERSION)
#error "libc++ has std::format"
#endif
