// Messages, texts, bytes, enumerations, errors and their causes in std::format, where the standard library has it:
// std::format("{:>20}", member.handle()). A header of its own: most sources format nothing.
#pragma once

#if __has_include(<format>)
#include <format>
#endif

#ifdef __cpp_lib_format

#include <concepts>
#include <expected>
#include <sstream>
#include <string>

#include <orv/enumeration.hpp>
#include <orv/field.hpp>
#include <orv/internal/standard.hpp>
#include <orv/stream_error.hpp>

namespace orv::inline v0::internal {

template <class T>
concept IsError = std::copy_constructible<T> && std::derived_from<std::bad_expected_access<T>, BadAccess<T>>;
template <class T, class... Others>
concept IsOneOf = (std::same_as<T, Others> || ...);

// What << prints.
template <class T>
concept Printed = IsMessage<T> || IsEnumeration<T> || IsError<T> ||
    IsOneOf<T, Text, ByteBuffer, DecodeCause, FieldPath, StreamError::Cause>;

}  // namespace orv::internal

// As << prints it, with the fill, width and precision of strings.
template <orv::internal::Printed T>
struct std::formatter<T, char> : std::formatter<std::string, char> {
  template <class Context>
  auto format(const T& value, Context& context) const {
    return std::formatter<std::string, char>::format((std::ostringstream() << value).str(), context);
  }
};

#endif
