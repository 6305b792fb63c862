#include "tools/orv/messages/text_form.hpp"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <limits>
#include <optional>
#include <utility>
#include <vector>

#include <orv/byte_view.hpp>
#include <orv/internal/varint.hpp>
#include <orv/spelling/escape.hpp>
#include <orv/spelling/nearest_name.hpp>
#include <orv/spelling/value_text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/utf8.hpp>

namespace orv::tool {

namespace {

using internal::maximumNesting;
using spelling::quotedText;

constexpr bool isDigit(char c) { return c >= '0' && c <= '9'; }
constexpr bool isWordCharacter(char c) {
  return isDigit(c) || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_';
}
constexpr bool isBlank(char c) { return spelling::isSpace(c) || c == '\v' || c == '\f'; }

// Decimal, hexadecimal behind 0x, octal behind 0.
std::optional<std::uint64_t> numberOf(std::string_view word) {
  int base = 10;
  if (word.starts_with("0x") || word.starts_with("0X")) {
    base = 16;
    word.remove_prefix(2);
  } else if (word.size() > 1 && word[0] == '0') {
    base = 8;
  }
  std::uint64_t number = 0;
  const auto [end, status] = std::from_chars(word.data(), word.data() + word.size(), number, base);
  if (status != std::errc() || end != word.data() + word.size()) return std::nullopt;
  return number;
}

// Takes a text apart. The first failure is kept; everything that can fail answers whether it went well.
class Scanner {
 public:
  explicit Scanner(std::string_view text) : text_(text) { skipBlanks(); }

  std::size_t at() const { return at_; }
  bool isAtEnd() const { return at_ == text_.size(); }
  bool sees(char c) const { return at_ < text_.size() && text_[at_] == c; }
  bool seesMessage() const { return sees('{') || sees('<'); }
  bool seesString() const { return sees('"') || sees('\''); }
  bool take(char c) {
    if (!sees(c)) return false;
    ++at_;
    skipBlanks();
    return true;
  }
  void takeAny() {
    ++at_;
    skipBlanks();
  }

  // A name or a number; empty where there is none.
  std::string_view takeWord() {
    const std::string_view word = seenWord();
    at_ += word.size();
    skipBlanks();
    return word;
  }

  // Strings that follow one another are one.
  bool takeString(std::string& bytes) {
    while (seesString()) {
      if (!takePiece(text_[at_++], bytes)) return false;
      skipBlanks();
    }
    return true;
  }

  bool fail(std::size_t at, std::string reason) {
    spelling::TextPosition place;
    for (const char c : text_.substr(0, at)) place.advance(c);
    error_ = place.error(std::move(reason));
    return false;
  }
  bool failExpecting(std::string_view expected) { return failExpecting(expected, at_); }
  bool failExpecting(std::string_view expected, std::size_t at) {
    at_ = at;
    return fail(at_, "expected " + std::string(expected) + ", found " + found());
  }
  const spelling::TextError& error() const { return error_; }

 private:
  // White space and comments.
  void skipBlanks() {
    for (; at_ < text_.size(); ++at_) {
      if (sees('#'))
        at_ = std::min(text_.find('\n', at_), text_.size() - 1);
      else if (!isBlank(text_[at_]))
        return;
    }
  }

  std::string_view seenWord() const {
    std::size_t end = at_;
    while (end < text_.size() && isWordCharacter(text_[end])) ++end;
    return text_.substr(at_, end - at_);
  }

  bool takePiece(char quote, std::string& bytes) {
    for (;;) {
      const std::size_t start = at_;
      while (at_ < text_.size() && isInside(text_[at_], quote)) ++at_;
      bytes += text_.substr(start, at_ - start);
      if (isAtEnd() || sees('\n')) return fail(at_, "a string without its closing quotation mark");
      if (sees('\0')) return fail(at_, "a NUL character");
      if (text_[at_] == quote) return ++at_, true;
      const std::size_t length = spelling::takeEscape(text_.substr(at_), bytes);
      if (length == 0) return fail(at_, "an escape that C does not have");
      at_ += length;
    }
  }
  static bool isInside(char c, char quote) { return c != quote && c != '\\' && c != '\n' && c != '\0'; }

  std::string found() const {
    if (isAtEnd()) return "the end";
    if (sees('\0')) return "a NUL character";
    const std::string_view word = seenWord();
    return quotedText(word.empty() ? text_.substr(at_, utf8::step(text_.substr(at_)).length) : word);
  }

  std::string_view text_;
  std::size_t at_ = 0;
  spelling::TextError error_{};
};

void appendVarint(std::uint64_t value, std::string& output) {
  for (; value >= 0x80; value >>= 7) output += static_cast<char>(value | 0x80);
  output += static_cast<char>(value);
}

template <class Number>
void appendFixed(Number value, std::string& output) {
  for (std::size_t index = 0; index < sizeof value; ++index) output += static_cast<char>(value >> 8 * index);
}

constexpr const FieldDescriptor& envelopeField(std::string_view name) {
  return *std::ranges::find(SessionMessage::descriptor().fields, name, &FieldDescriptor::name);
}

// Writes the encoding of what it reads, in one pass. Fields of a message that do not ascend are put in order at
// its end.
class TextEncoder {
 public:
  TextEncoder(std::string_view text, const PayloadPairing& payloads) : text_(text), payloads_(payloads) {}

  std::expected<std::string, spelling::TextError> encode(const MessageType& type) {
    if (!takeFields(type.descriptor, '\0')) return std::unexpected(text_.error());
    return std::move(output_);
  }

 private:
  // What was read of a message.
  struct Progress {
    const MessageDescriptor* type;  // none for a message that nothing is known of
    std::uint64_t given = 0;        // a bit for each field, by its place in the type
    std::uint32_t givenOneofs = 0;
    std::uint32_t lastNumber = 0;
    bool isAscending = true;
    std::string unknown{};  // records
  };

  // Up to the closing character, or the end of the text for '\0'.
  bool takeFields(const MessageDescriptor* type, char closing) {
    Progress message{.type = type};
    const std::size_t start = output_.size();
    while (closing == '\0' ? !text_.isAtEnd() : !text_.take(closing)) {
      if (!takeField(message)) return false;
      (void)(text_.take(',') || text_.take(';'));
    }
    if (!message.isAscending) sortRecords(start);
    output_ += message.unknown;
    return true;
  }

  bool takeField(Progress& message) {
    const std::size_t at = text_.at();
    if (text_.sees('[')) return takeUnknown(message, at, {});
    const std::string_view name = text_.takeWord();
    if (name.empty()) return text_.failExpecting(depth_ == 0 ? "a field" : "a field or the message's end");
    if (isDigit(name[0])) return takeUnknown(message, at, name);
    if (message.type == nullptr) return text_.fail(at, "the fields of an unknown one go by their numbers");
    const auto field = std::ranges::find(message.type->fields, name, &FieldDescriptor::name);
    if (field == message.type->fields.end()) {
      return text_.fail(at, std::string(message.type->fullName) + " has no field " + quotedText(name) +
                                spelling::suggestion(name, message.type->fields, &FieldDescriptor::name));
    }
    const auto bit = std::uint64_t{1} << (field - message.type->fields.begin());
    const bool isAgain = (std::exchange(message.given, message.given | bit) & bit) != 0;
    if (isAgain && field->kind != FieldKind::repeated)
      return text_.fail(at, std::string(name) + " is there twice");
    const std::uint32_t group = field->kind == FieldKind::oneofMember ? 1U << field->oneof : 0;
    if ((std::exchange(message.givenOneofs, message.givenOneofs | group) & group) != 0)
      return text_.fail(at, "a second member of a oneof");
    message.isAscending = message.isAscending && field->number >= message.lastNumber;
    message.lastNumber = field->number;
    return takeValues(*field);
  }

  // One value, or a list of them in brackets.
  bool takeValues(const FieldDescriptor& field) {
    const bool hasColon = text_.take(':');
    if (field.kind != FieldKind::repeated || !text_.take('[')) return takeValue(field, hasColon);
    if (text_.take(']')) return true;
    for (;;) {
      if (!takeValue(field, hasColon)) return false;
      if (text_.take(']')) return true;
      if (!text_.take(',')) return text_.failExpecting(R"("," or "]")");
    }
  }

  bool takeValue(const FieldDescriptor& field, bool hasColon) {
    if (field.type == ValueType::message) return takeMessage(field.number, field.message);
    if (&field == &envelopeField("data") && text_.seesMessage()) return takePayload(field);
    if (!hasColon) return text_.failExpecting("\":\"");
    if (wireTypeOf(field.type) == WireType::lengthDelimited) return takeString(field);
    const auto number = takeNumber(field);
    const bool isLeftOut = field.kind == FieldKind::implicitPresence && number == 0U;
    if (number && !isLeftOut) appendNumber(field.number, *number);
    return number.has_value();
  }

  bool takeMessage(std::uint32_t number, const MessageDescriptor* type) {
    if (!text_.seesMessage()) return text_.failExpecting("\"{\"");
    if (++depth_ > maximumNesting)
      return text_.fail(text_.at(), "nested deeper than " + std::to_string(maximumNesting));
    const char closing = text_.sees('{') ? '}' : '>';
    text_.takeAny();
    const std::size_t contents = openRecord(number);
    if (!takeFields(type, closing)) return false;
    closeRecord(contents);
    --depth_;
    return true;
  }

  // An envelope's data as a message. The type that says which may stand behind it.
  bool takePayload(const FieldDescriptor& data) {
    const std::size_t at = text_.at();
    std::optional<std::int64_t> kind = kind_;
    if (!kind) kind = kindBehind(text_);
    const MessageType* const payload = kind ? payloads_.payloadOf(VessaSessionMessageType(*kind)) : nullptr;
    if (payload == nullptr) return text_.fail(at, "a message, but no \"type\" says which");
    return takeMessage(data.number, payload->descriptor);
  }

  // The type of the envelope in which the text stands at a message.
  static std::optional<std::int64_t> kindBehind(Scanner text) {
    std::string ignored;
    for (int depth = 0; !text.isAtEnd();) {
      if (const auto word = text.takeWord(); !word.empty()) {
        if (depth == 0 && word == "type" && text.take(':')) return enumerationOf(text, envelopeField("type"));
      } else if (text.seesString()) {
        if (!text.takeString(ignored)) return std::nullopt;
        ignored.clear();
      } else {
        if (text.seesMessage()) ++depth;
        if (text.sees('}') || text.sees('>')) --depth;
        text.takeAny();
      }
    }
    return std::nullopt;
  }

  bool takeString(const FieldDescriptor& field) {
    if (!text_.seesString()) return text_.failExpecting("a string");
    const std::size_t at = text_.at();
    const std::size_t start = output_.size();
    const std::size_t contents = openRecord(field.number);
    if (!text_.takeString(output_)) return false;
    const std::string_view bytes = std::string_view(output_).substr(contents);
    if (field.type == ValueType::string && !utf8::isWellFormed(bytes))
      return text_.fail(at, "ill-formed UTF-8 in " + std::string(field.name));
    if (field.kind == FieldKind::implicitPresence && bytes.empty()) {
      output_.resize(start);
    } else {
      closeRecord(contents);
    }
    return true;
  }

  // What travels of a value that is a number or a name.
  std::optional<std::uint64_t> takeNumber(const FieldDescriptor& field) {
    const auto failExpecting = [this, at = text_.at()](std::string_view expected) {
      text_.failExpecting(expected, at);
      return std::nullopt;
    };
    if (field.type == ValueType::enumeration) {
      const auto raw = enumerationOf(text_, field);
      if (!raw) return failExpecting("a name or a number of " + std::string(field.name));
      if (&field == &envelopeField("type")) kind_ = raw;
      return internal::travellingValue(*raw);
    }
    const std::string_view word = text_.takeWord();
    const auto number = numberOf(word);
    if (field.type == ValueType::boolean) {
      if (word == "true" || word == "True" || word == "t" || number == 1U) return 1;
      if (word == "false" || word == "False" || word == "f" || number == 0U) return 0;
      return failExpecting("true or false");
    }
    if (!number || *number > std::numeric_limits<std::uint32_t>::max())
      return failExpecting("a whole number from 0 to 4294967295");
    return number;
  }

  static std::optional<std::int64_t> enumerationOf(Scanner& text, const FieldDescriptor& field) {
    const bool isNegative = text.take('-');
    const std::string_view word = text.takeWord();
    if (const std::optional<std::int64_t> named = field.cases.number(word); named && !isNegative)
      return named;
    const auto number = numberOf(word);
    if (!number || *number > std::uint64_t{0x7FFFFFFF} + (isNegative ? 1 : 0)) return std::nullopt;
    return isNegative ? -static_cast<std::int64_t>(*number) : static_cast<std::int64_t>(*number);
  }

  // A field by its number, or whole records, `[records]: "…"`, without one.
  bool takeUnknown(Progress& message, std::size_t at, std::string_view number) {
    const std::size_t start = output_.size();
    if (number.empty() ? !takeRecords() : !takeNumbered(number, at)) return false;
    if (message.type == nullptr) return true;
    // A known field that arrives in this way would not be unknown, and nobody has looked at it.
    const auto records = UnknownStorage::checked(bytesOf(std::string_view(output_).substr(start)));
    if (!records) return text_.fail(at, "malformed records: " + records.error().reason());
    for (const UnknownField& record : *records) {
      const FieldDescriptor* const known = message.type->field(record.tag.fieldNumber());
      if (known != nullptr && wireTypeOf(known->type) == record.tag.wireType())
        return text_.fail(at, "field " + std::to_string(known->number) + " is " + std::string(known->name));
    }
    message.unknown += std::string_view(output_).substr(start);
    output_.resize(start);
    return true;
  }

  bool takeRecords() {
    text_.takeAny();
    if (text_.takeWord() != "records" || !text_.take(']') || !text_.take(':') || !text_.seesString())
      return text_.failExpecting("a field, or [records]: and a string");
    return text_.takeString(output_);
  }

  // The form says the wire type: a number in sixteen or eight hexadecimal digits is of 64 or 32 fixed bits.
  bool takeNumbered(std::string_view word, std::size_t at) {
    constexpr std::uint64_t highestNumber = (1U << 29) - 1;
    const auto wide = numberOf(word);
    if (!wide || *wide == 0 || *wide > highestNumber) return text_.fail(at, "no number of a field");
    const auto number = static_cast<std::uint32_t>(*wide);
    const bool hasColon = text_.take(':');
    if (text_.seesMessage()) return takeMessage(number, nullptr);
    if (!hasColon) return text_.failExpecting("\":\"");
    if (text_.seesString()) {
      const std::size_t contents = openRecord(number);
      if (!text_.takeString(output_)) return false;
      closeRecord(contents);
      return true;
    }
    const std::size_t valueAt = text_.at();
    const std::string_view digits = text_.takeWord();
    const auto value = numberOf(digits);
    if (!value) return text_.fail(valueAt, "expected a number, a string or a message");
    const bool isHexadecimal = digits.starts_with("0x");
    if (isHexadecimal && digits.size() == 18) {
      appendTag(number, WireType::fixed64);
      appendFixed(*value, output_);
    } else if (isHexadecimal && digits.size() == 10) {
      appendTag(number, WireType::fixed32);
      appendFixed(static_cast<std::uint32_t>(*value), output_);
    } else {
      appendNumber(number, *value);
    }
    return true;
  }

  void appendTag(std::uint32_t number, WireType type) {
    appendVarint(number << 3 | static_cast<std::uint32_t>(type), output_);
  }
  void appendNumber(std::uint32_t number, std::uint64_t value) {
    appendTag(number, WireType::varint);
    appendVarint(value, output_);
  }
  // Begins a length-delimited record; answers where its contents do.
  std::size_t openRecord(std::uint32_t number) {
    appendTag(number, WireType::lengthDelimited);
    output_ += '\0';
    return output_.size();
  }
  void closeRecord(std::size_t contents) {
    const std::size_t size = output_.size() - contents;
    if (size < 0x80) {
      output_[contents - 1] = static_cast<char>(size);
      return;
    }
    std::string length;
    appendVarint(size, length);
    output_.replace(contents - 1, 1, length);
  }

  // Those that were written from `start` on.
  void sortRecords(std::size_t start) {
    const std::string written = output_.substr(start);
    std::vector<UnknownField> records;
    for (UnknownStorage::Iterator at(bytesOf(written)); at != std::default_sentinel; ++at)
      records.push_back(*at);
    std::ranges::sort(records, {}, [](const UnknownField& field) {
      return std::pair(field.tag.fieldNumber(), field.record.data());
    });
    output_.resize(start);
    for (const UnknownField& field : records) output_ += charactersOf(field.record);
  }

  Scanner text_;
  const PayloadPairing& payloads_;
  std::string output_;
  std::optional<std::int64_t> kind_;  // of the envelope, once it was read
  int depth_ = 0;
};

}  // namespace

std::expected<std::string, spelling::TextError> encodeTextForm(const MessageType& type, std::string_view text,
                                                               const PayloadPairing& payloads) {
  return TextEncoder(text, payloads).encode(type);
}

}  // namespace orv::tool
