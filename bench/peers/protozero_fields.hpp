#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <variant>

#include <protozero/basic_pbf_writer.hpp>
#include <protozero/pbf_reader.hpp>
#include <protozero/types.hpp>

#include "bench/peers/utf8.hpp"

// What the messages that are written by hand over protozero share.
namespace bench::by_hand {

using protozero::pbf_reader;

// A field number together with its wire type, as the cases of `read` have it.
constexpr std::uint32_t delimited(protozero::pbf_tag_type number) {
  return protozero::tag_and_type(number, protozero::pbf_wire_type::length_delimited);
}
constexpr std::uint32_t varint(protozero::pbf_tag_type number) {
  return protozero::tag_and_type(number, protozero::pbf_wire_type::varint);
}

// Unknown fields as they stood in the input, one after the other.
struct Unknown {
  std::string unknown;
  bool operator==(const Unknown&) const = default;
};

// Merges the bytes into the message. Throws on malformed bytes.
template <class Message>
void merge(Message& message, protozero::data_view bytes) {
  pbf_reader reader(bytes);
  const char* start = bytes.data();
  while (reader.next()) {
    if (!message.read(reader)) {
      reader.skip();
      message.unknown.append(start, reader.data().data());
    }
    start = reader.data().data();
  }
}

// The functions that read a field all answer true: the field was known.
inline bool readBytes(std::string& field, pbf_reader& reader) {
  const auto view = reader.get_view();
  field.assign(view.data(), view.size());
  return true;
}

inline bool readText(std::string& field, pbf_reader& reader) {
  const auto view = reader.get_view();
  if (!isWellFormedUtf8({view.data(), view.size()})) throw std::runtime_error("ill-formed text");
  field.assign(view.data(), view.size());
  return true;
}

bool readValue(auto& field, auto value) {
  field = value;
  return true;
}

bool readMessage(auto& field, pbf_reader& reader) {
  merge(field, reader.get_view());
  return true;
}

template <class T>
T& present(std::optional<T>& field) {
  return field ? *field : field.emplace();
}

// Merges into the case that the oneof holds already, or replaces it by a fresh one.
template <class Case>
bool readCase(auto& oneof, pbf_reader& reader) {
  Case* const held = std::get_if<Case>(&oneof);
  return readMessage(held ? *held : oneof.template emplace<Case>(), reader);
}

void writeUnlessEmpty(auto& writer, protozero::pbf_tag_type number, const std::string& field) {
  if (!field.empty()) writer.add_bytes(number, field);
}

void writePresent(auto& writer, protozero::pbf_tag_type number, const std::optional<std::string>& field) {
  if (field) writer.add_bytes(number, *field);
}

// A writer that knows its buffer: protozero leaves out a nested message without fields, which must be made up
// for.
template <class Buffer>
struct Writer : protozero::basic_pbf_writer<Buffer> {
  explicit Writer(Buffer& target) : protozero::basic_pbf_writer<Buffer>(target), buffer(target) {}
  Writer(Writer& parent, protozero::pbf_tag_type number)
      : protozero::basic_pbf_writer<Buffer>(parent, number), buffer(parent.buffer) {}

  Buffer& buffer;
};

void writeAll(auto& writer, const auto& message) {
  message.write(writer);
  writer.buffer.append(message.unknown.data(), message.unknown.size());
}

template <class Buffer>
void writeMessage(Writer<Buffer>& writer, protozero::pbf_tag_type number, const auto& message) {
  const std::size_t start = writer.buffer.size();
  {
    Writer<Buffer> nested(writer, number);
    writeAll(nested, message);
  }
  if (writer.buffer.size() == start) writer.add_bytes(number, nullptr, 0);
}

template <class Case>
void writeCase(auto& writer, protozero::pbf_tag_type number, const auto& oneof) {
  if (const Case* held = std::get_if<Case>(&oneof)) writeMessage(writer, number, *held);
}

}  // namespace bench::by_hand
