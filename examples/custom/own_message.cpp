// A message of one's own: a class with a table, and a line that makes the library's rules for it. It then does
// what the protocol's messages do, and may hold them.
#include <cstdint>
#include <cstdio>
#include <optional>
#include <string_view>
#include <tuple>
#include <unordered_map>
#include <utility>
#include <variant>
#include <vector>

#include <orv/instantiate.hpp>
#include <orv/member.hpp>
#include <orv/text.hpp>

namespace example {

class Talk final : public orv::Message<Talk> {
 public:
  static constexpr std::string_view protoMessageName = "example.Talk";

  const orv::Text& title() const { return title_; }
  void setTitle(orv::Text value) { title_ = std::move(value); }

 private:
  friend Message;  // the rules read the table
  orv::Text title_;

  static constexpr std::tuple fields{
      orv::field<&Talk::title_>(1, "title"),
  };
};

// What a room is booked for. The type of the storage says how a field is kept: with implicit or explicit
// presence, as a list, or as one case of a oneof. The rows give the numbers and the names.
class Booking final : public orv::Message<Booking> {
 public:
  static constexpr std::string_view protoMessageName = "example.Booking";

  const orv::Text& room() const { return room_; }
  void setRoom(orv::Text value) { room_ = std::move(value); }

  std::optional<std::uint32_t> minutes() const { return minutes_; }
  void setMinutes(std::optional<std::uint32_t> value) { minutes_ = value; }

  const std::vector<orv::Member>& guests() const { return guests_; }
  void addGuest(orv::Member value) { guests_.push_back(std::move(value)); }

  // A talk or a member's birthday: setting one drops the other.
  const Talk* talk() const { return occasion_ ? std::get_if<Talk>(&*occasion_) : nullptr; }
  void setTalk(Talk value) { occasion_ = std::move(value); }
  void setBirthday(orv::Member value) { occasion_ = std::move(value); }

 private:
  friend Message;
  orv::Text room_;
  std::optional<std::uint32_t> minutes_;
  std::vector<orv::Member> guests_;
  std::optional<std::variant<Talk, orv::Member>> occasion_;

  static constexpr std::tuple fields{
      orv::field<&Booking::room_>(1, "room"),
      orv::field<&Booking::minutes_>(2, "minutes"),
      orv::field<&Booking::guests_>(3, "guests"),
      orv::field<&Booking::occasion_, Talk>(4, "talk"),
      orv::field<&Booking::occasion_, orv::Member>(5, "birthday"),
  };
};

}  // namespace example

// Once for each message, in one source of the program.
template class orv::Message<example::Talk>;
template class orv::Message<example::Booking>;

namespace {

orv::Member memberCalled(orv::Text handle) {
  orv::Member member;
  member.setHandle(std::move(handle));
  return member;
}

}  // namespace

int main() {
  example::Booking booking;
  booking.setRoom("attic");
  booking.setMinutes(90);
  booking.addGuest(memberCalled("anna@tablet"));
  booking.addGuest(memberCalled("zo\u00EB@phone"));
  example::Talk talk;
  talk.setTitle("Tables that cannot lie");
  booking.setBirthday(memberCalled("ben@phone"));
  booking.setTalk(talk);
  std::fputs(booking.debugDescription().c_str(), stdout);

  const auto bytes = booking.serialize();
  if (!bytes) return 1;
  const auto again = example::Booking::parse(*bytes);
  if (!again || again->talk() == nullptr) return 1;
  std::printf("%zu bytes, %s\n", bytes->size(), *again == booking ? "the same again" : "something else");

  // Equal messages are one key, also where a text is spelled with other code points.
  std::unordered_map<example::Booking, int> bookings{{booking, 1}};
  example::Booking respelled;
  respelled.setRoom("attic");
  respelled.setMinutes(90);
  respelled.addGuest(memberCalled("anna@tablet"));
  respelled.addGuest(memberCalled("zoe\u0308@phone"));
  respelled.setTalk(talk);
  ++bookings[respelled];
  std::printf("booked %d times\n", bookings[booking]);
  respelled.setBirthday(memberCalled("ben@phone"));
  std::printf("a birthday is %s\n", bookings.contains(respelled) ? "the same" : "something else");

  const auto cut = example::Booking::parse(std::string_view(*bytes).substr(0, bytes->size() - 1));
  if (cut) return 1;
  std::printf("%s\n", cut.error().message().c_str());
}
