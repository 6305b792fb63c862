#pragma once

#include <cstddef>
#include <cstdint>
#include <exception>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <variant>
#include <vector>

#include <protozero/basic_pbf_writer.hpp>
#include <protozero/buffer_fixed.hpp>
#include <protozero/buffer_string.hpp>
#include <protozero/pbf_reader.hpp>
#include <protozero/types.hpp>

#include "bench/peers/equal_work.hpp"
#include "bench/peers/utf8.hpp"
#include "bench/workloads/plain.hpp"

namespace bench {

// Reads the plain messages as one does by hand over protozero. Throws on malformed bytes. Read again, a message
// keeps all memory that it can: contents, lists and their elements are written over, and what did not come
// this time is cleared at the end.
template <bool again>
class PlainReader {
 public:
  template <class Message>
  static void read(Message& message, protozero::data_view bytes) {
    protozero::pbf_reader reader(bytes);
    // How many values of each row have come.
    [[maybe_unused]] std::size_t come[std::tuple_size_v<decltype(Message::fields)> + 1]{};
    if constexpr (again) message.unknown.clear();
    const char* start = bytes.data();
    while (reader.next()) {
      const bool known = std::apply(
          [&](const auto&... row) {
            std::size_t* count = come;
            return (... || (readRow(message, row, reader, *count++)));
          },
          Message::fields);
      if (!known) {
        reader.skip();
        message.unknown.append(start, reader.data().data());
      }
      start = reader.data().data();
    }
    if constexpr (again) {
      std::apply(
          [&](const auto&... row) {
            const std::size_t* count = come;
            (..., clearRow(message, row, *count++));
          },
          Message::fields);
    }
  }

 private:
  template <class Message, auto pointer, class Case>
  static bool readRow(Message& message, const plain::Field<pointer, Case>& row, protozero::pbf_reader& reader,
                      std::size_t& count) {
    auto& member = message.*pointer;
    using Member = std::remove_reference_t<decltype(member)>;
    constexpr auto type = plain::isNumber<Member> ? protozero::pbf_wire_type::varint
                                                  : protozero::pbf_wire_type::length_delimited;
    if (reader.tag_and_type() != protozero::tag_and_type(row.number, type)) return false;
    if constexpr (!std::is_void_v<Case>) {
      Case* const held = std::get_if<Case>(&member);
      readValue(held ? *held : member.template emplace<Case>(), reader, count == 0);
    } else if constexpr (plain::isA<Member, std::vector>) {
      if (count == member.size()) {
        if (count == 0) member.reserve(elementsFrom(reader));
        member.emplace_back();
      }
      readValue(member[count], reader, true);
    } else if constexpr (plain::isA<Member, std::optional>) {
      readValue(member ? *member : member.emplace(), reader, count == 0);
    } else {
      readValue(member, reader, count == 0);
    }
    ++count;
    return true;
  }

  // How many elements of the list come one after the other, with the one that the reader stands at.
  static std::size_t elementsFrom(protozero::pbf_reader reader) {
    const auto tag = reader.tag_and_type();
    std::size_t count = 0;
    do {
      ++count;
      reader.skip();
    } while (reader.next() && reader.tag_and_type() == tag);
    return count;
  }

  // A nested message that comes first replaces what an earlier decoding left; later ones are merged.
  template <class T>
  static void readValue(T& value, protozero::pbf_reader& reader, [[maybe_unused]] bool first) {
    if constexpr (std::is_same_v<T, bool>) {
      value = reader.get_bool();
    } else if constexpr (std::is_same_v<T, std::uint32_t>) {
      value = reader.get_uint32();
    } else if constexpr (std::is_same_v<T, std::int32_t>) {
      value = reader.get_enum();
    } else if constexpr (std::is_base_of_v<std::string, T>) {
      const auto view = reader.get_view();
      if (std::is_same_v<T, plain::Text> && !isWellFormedUtf8({view.data(), view.size()}))
        throw std::runtime_error("ill-formed text");
      value.assign(view.data(), view.size());
    } else if (first) {
      read(value, reader.get_view());
    } else {
      PlainReader<false>::read(value, reader.get_view());
    }
  }

  template <class Message, auto pointer, class Case>
  static void clearRow(Message& message, const plain::Field<pointer, Case>&, std::size_t count) {
    auto& member = message.*pointer;
    using Member = std::remove_reference_t<decltype(member)>;
    if constexpr (!std::is_void_v<Case>) {
      if (count == 0 && std::holds_alternative<Case>(member)) member = std::monostate();
    } else if constexpr (plain::isA<Member, std::vector>) {
      member.resize(count);
    } else if constexpr (plain::isA<Member, std::optional>) {
      if (count == 0) member.reset();
    } else if (count == 0) {
      if constexpr (std::is_arithmetic_v<Member>)
        member = 0;
      else
        member.clear();
    }
  }

  friend PlainReader<!again>;
};

// A writer that knows its buffer: protozero leaves out a nested message without fields, which must be made up
// for.
template <class Buffer>
class PlainWriter : public protozero::basic_pbf_writer<Buffer> {
 public:
  explicit PlainWriter(Buffer& target) : protozero::basic_pbf_writer<Buffer>(target), buffer_(target) {}

  template <class Message>
  void write(const Message& message) {
    std::apply([&](const auto&... row) { (..., writeRow(message, row)); }, Message::fields);
    buffer_.append(message.unknown.data(), message.unknown.size());
  }

 private:
  PlainWriter(PlainWriter& parent, std::uint32_t number)
      : protozero::basic_pbf_writer<Buffer>(parent, number), buffer_(parent.buffer_) {}

  template <class Message, auto pointer, class Case>
  void writeRow(const Message& message, const plain::Field<pointer, Case>& row) {
    const auto& member = message.*pointer;
    using Member = std::remove_cvref_t<decltype(member)>;
    if constexpr (!std::is_void_v<Case>) {
      if (const Case* held = std::get_if<Case>(&member)) writeValue(row.number, *held);
    } else if constexpr (plain::isA<Member, std::vector>) {
      for (const auto& element : member) writeValue(row.number, element);
    } else if constexpr (plain::isA<Member, std::optional>) {
      if (member) writeValue(row.number, *member);
    } else {
      if (member != Member()) writeValue(row.number, member);
    }
  }

  template <class T>
  void writeValue(std::uint32_t number, const T& value) {
    if constexpr (std::is_same_v<T, bool>) {
      this->add_bool(number, value);
    } else if constexpr (std::is_same_v<T, std::uint32_t>) {
      this->add_uint32(number, value);
    } else if constexpr (std::is_same_v<T, std::int32_t>) {
      this->add_enum(number, value);
    } else if constexpr (std::is_base_of_v<std::string, T>) {
      this->add_bytes(number, value);
    } else {
      const std::size_t start = buffer_.size();
      PlainWriter(*this, number).write(value);
      if (buffer_.size() == start) this->add_bytes(number, nullptr, 0);
    }
  }

  Buffer& buffer_;
};

// Equal work over a reader and writer for wire data: text checked, unknown fields kept, real presence, owning
// values.
struct Protozero : EqualWork {
  static constexpr std::string_view name = "protozero";

  template <Kind kind>
  using Value = plain::Message<kind>;

  template <bool again = false>
  static bool decode(auto& value, std::string_view bytes) {
    try {
      PlainReader<again>::read(value, {bytes.data(), bytes.size()});
      return true;
    } catch (const std::exception&) {
      return false;
    }
  }
  static bool decodeAgain(auto& value, std::string_view bytes) { return decode<true>(value, bytes); }
  static std::string encode(const auto& value) {
    std::string bytes;
    bytes.reserve(roomFor(value));
    PlainWriter<std::string>(bytes).write(value);
    return bytes;
  }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    protozero::fixed_size_buffer_adaptor target(buffer.data(), buffer.size());
    PlainWriter<protozero::fixed_size_buffer_adaptor>(target).write(value);
    return target.size();
  }
  static bool equal(const auto& left, const auto& right) { return left == right; }

  static std::size_t weigh(const auto& value) { return weighPlain(value); }
  // Field by field: this is what setting each of a plain struct's fields comes to.
  template <class Message>
  static void build(Message& value, const Message& source) {
    std::apply([&](const auto&... row) { (..., (value.*(row.pointer) = source.*(row.pointer))); },
               Message::fields);
  }

 private:
  // At least as many bytes as the value takes, found without walking its lists.
  template <class T>
  static std::size_t roomFor(const T& value) {
    constexpr std::size_t tagAndSize = 11;
    if constexpr (std::is_arithmetic_v<T>) {
      return tagAndSize;
    } else if constexpr (std::is_base_of_v<std::string, T>) {
      return tagAndSize + value.size();
    } else if constexpr (plain::isA<T, std::optional>) {
      return value ? roomFor(*value) : 0;
    } else if constexpr (plain::isA<T, std::vector>) {
      return value.empty() ? 0 : value.size() * (roomFor(value.front()) + tagAndSize);
    } else if constexpr (plain::isA<T, std::variant>) {
      return std::visit(
          []<class Case>(const Case& held) {
            if constexpr (std::is_same_v<Case, std::monostate>)
              return std::size_t{0};
            else
              return roomFor(held);
          },
          value);
    } else {
      return std::apply(
                 [&](const auto&... row) { return (tagAndSize + ... + roomFor(value.*(row.pointer))); },
                 T::fields) +
             value.unknown.size();
    }
  }
};

}  // namespace bench
