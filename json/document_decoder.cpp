#include <orv/json/document_decoder.hpp>

#include <charconv>
#include <utility>

#include <orv/spelling/base64.hpp>
#include <orv/spelling/nearest_name.hpp>

namespace orv::inline v0::json {

namespace {

// A string in a message, cut short where it is long.
std::string quoted(std::string_view text) {
  constexpr std::size_t longest = 40;
  if (text.size() <= longest) return "\"" + std::string(text) + "\"";
  return "a string of " + std::to_string(text.size()) + " bytes";
}

}  // namespace

std::expected<std::optional<std::uint32_t>, Error> DocumentDecoder::nextNumber(NameMap names) {
  if (object_.kind() != Value::Kind::object) {
    name_ = {};
    const std::string where = outer_ == nullptr ? "$" : outer_->path();
    return std::unexpected(
        Error{.reason = "expected an object, found " + std::string(object_.kindName()), .path = where});
  }
  const std::size_t size = object_.size();
  while (nextMember_ < size) {
    const Value::Member member = object_.member(nextMember_++);
    name_ = member.name;
    value_ = member.value;
    const auto number = names.number(member.name);
    if (!number)
      return fail("unknown field" +
                  spelling::suggestion(member.name, names.entries(), &NameMap::Entry::name));
    if (member.value.kind() != Value::Kind::null) return static_cast<std::uint32_t>(*number);
  }
  return std::nullopt;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(Text& value) const {
  if (value_->kind() != Value::Kind::text) return failExpecting("a string");
  // The parser lets well-formed text through only.
  value = Text(value_->text());
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(ByteBuffer& value) const {
  if (value_->kind() != Value::Kind::text) return failExpecting("a base64 string");
  const auto bytes = spelling::decodeBase64(value_->text());
  if (!bytes) return fail("expected base64, found " + quoted(value_->text()));
  value = ByteBuffer(*bytes);
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(bool& value) const {
  if (value_->kind() != Value::Kind::boolean) return failExpecting("true or false");
  value = value_->boolean();
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(std::uint32_t& value) const {
  constexpr std::string_view expected = "a whole number from 0 to 4294967295";
  if (value_->kind() == Value::Kind::text) {
    const std::string_view digits = value_->text();
    const auto [end, status] = std::from_chars(digits.data(), digits.data() + digits.size(), value);
    if (status == std::errc() && end == digits.data() + digits.size()) return true;
    return fail("expected " + std::string(expected) + ", found " + quoted(digits));
  }
  if (value_->kind() != Value::Kind::number) return failExpecting(expected);
  const auto number = value_->integer();
  if (!number || !std::in_range<std::uint32_t>(*number))
    return fail("expected " + std::string(expected) + ", found another number");
  value = static_cast<std::uint32_t>(*number);
  return true;
}

std::expected<std::int64_t, Error> DocumentDecoder::readEnum(NameMap names) const {
  if (value_->kind() == Value::Kind::text) {
    if (const auto number = names.number(value_->text())) return *number;
    return fail("unknown name " + quoted(value_->text()) +
                spelling::suggestion(value_->text(), names.entries(), &NameMap::Entry::name));
  }
  if (value_->kind() != Value::Kind::number) return failExpecting("a name or a number");
  const auto number = value_->integer();
  // What is above would be cut on the wire.
  if (!number || !std::in_range<std::int32_t>(*number))
    return fail("expected a name or a whole number of 32 bits, found another number");
  return *number;
}

std::string DocumentDecoder::path() const {
  std::string path = (outer_ == nullptr ? "$" : outer_->path()) + memberStep(name_);
  if (itemIndex_.has_value()) path += '[' + std::to_string(*itemIndex_) + ']';
  return path;
}

std::unexpected<Error> DocumentDecoder::fail(std::string reason) const {
  return std::unexpected(Error{.reason = std::move(reason), .path = path()});
}

std::unexpected<Error> DocumentDecoder::failExpecting(std::string_view expected) const {
  return fail("expected " + std::string(expected) + ", found " + std::string(value_->kindName()));
}

}  // namespace orv::json
