#include <orv/wire_reader.hpp>

#include <algorithm>
#include <array>

namespace orv::inline v0 {

namespace {

std::unexpected<WireFault> fault(DecodeCause cause, const std::byte* at) {
  return std::unexpected(WireFault{cause, at});
}

}  // namespace

WireResult<Tag> WireReader::readLongTag() {
  constexpr int longestTag = 5;
  const std::byte* at = cursor_;
  std::uint64_t value = 0;
  for (int index = 0; index < longestTag; ++index) {
    if (at == limit_) return fault(DecodeCause::truncated, cursor_);
    const auto byte = std::to_integer<std::uint64_t>(*at++);
    value |= (byte & 0x7F) << (7 * index);
    if (byte >= 0x80) continue;
    if (value > 0xFFFFFFFF) break;
    const Tag tag{static_cast<std::uint32_t>(value)};
    if (tag.fieldNumber() == 0) return fault(DecodeCause::fieldNumberZero, cursor_);
    cursor_ = at;
    return tag;
  }
  return fault(DecodeCause::malformedTag, cursor_);
}

WireResult<std::uint64_t> WireReader::readLongVarint() {
  constexpr int longestVarint = 10;
  const std::byte* at = cursor_;
  std::uint64_t value = 0;
  for (int index = 0; index < longestVarint; ++index) {
    if (at == limit_) return fault(DecodeCause::truncated, cursor_);
    const auto byte = std::to_integer<std::uint64_t>(*at++);
    value |= (byte & 0x7F) << (7 * index);
    if (byte < 0x80) {
      cursor_ = at;
      return value;
    }
  }
  return fault(DecodeCause::malformedVarint, cursor_);
}

WireResult<std::span<const std::byte>> WireReader::readLengthDelimited() {
  constexpr int longestLength = 5;
  constexpr std::uint64_t lengthLimit = std::uint64_t{1} << 31;
  const std::byte* at = cursor_;
  std::uint64_t length = 0;
  for (int index = 0; index < longestLength; ++index) {
    if (at == limit_) return fault(DecodeCause::truncated, cursor_);
    const auto byte = std::to_integer<std::uint64_t>(*at++);
    length |= (byte & 0x7F) << (7 * index);
    if (byte >= 0x80) continue;
    if (length >= lengthLimit) break;
    const auto available = static_cast<std::uint64_t>(limit_ - at);
    if (length > available) {
      return std::unexpected(WireFault{DecodeCause::lengthOverrun, cursor_,
                                       static_cast<std::uint32_t>(length),
                                       static_cast<std::uint32_t>(length - available)});
    }
    const std::span contents(at, static_cast<std::size_t>(length));
    cursor_ = at + contents.size();
    return contents;
  }
  return fault(DecodeCause::lengthTooLarge, cursor_);
}

WireResult<void> WireReader::skipBytes(std::size_t count) {
  if (remaining() < count) return fault(DecodeCause::truncated, cursor_);
  cursor_ += count;
  return {};
}

template <class Number>
WireResult<Number> WireReader::readFixed() {
  const std::byte* const at = cursor_;
  if (const auto skipped = skipBytes(sizeof(Number)); !skipped) return std::unexpected(skipped.error());
  Number value = 0;
  for (std::size_t index = 0; index < sizeof(Number); ++index) {
    value |= std::to_integer<Number>(at[index]) << (8 * index);
  }
  return value;
}

WireResult<std::uint32_t> WireReader::readFixed32() { return readFixed<std::uint32_t>(); }

WireResult<std::uint64_t> WireReader::readFixed64() { return readFixed<std::uint64_t>(); }

WireResult<void> WireReader::skipValue(Tag tag, const std::byte* tagStart, int nesting) {
  const auto discard = [](const auto& result) -> WireResult<void> {
    if (!result) return std::unexpected(result.error());
    return {};
  };
  switch (tag.wireType()) {
    case WireType::varint: return discard(readVarint());
    case WireType::fixed64: return skipBytes(sizeof(std::uint64_t));
    case WireType::lengthDelimited: return discard(readLengthDelimited());
    case WireType::startGroup: return skipGroup(tag, tagStart, nesting);
    case WireType::endGroup: return fault(DecodeCause::unexpectedEndGroup, tagStart);
    case WireType::fixed32: return skipBytes(sizeof(std::uint32_t));
  }
  return fault(DecodeCause::reservedWireType, tagStart);
}

WireResult<void> WireReader::skipGroup(Tag start, const std::byte* tagStart, int nesting) {
  // The numbers of the groups that are open, the innermost last. A loop, so that nesting costs no stack.
  std::array<std::uint32_t, internal::maximumNesting> open;
  int depth = 0;
  for (Tag tag = start;;) {
    if (tag.wireType() == WireType::startGroup) {
      if (nesting + depth >= internal::maximumNesting)
        return std::unexpected(WireFault{DecodeCause::nestingTooDeep, tagStart, internal::maximumNesting});
      open[static_cast<std::size_t>(depth++)] = tag.fieldNumber();
    } else if (tag.wireType() == WireType::endGroup) {
      if (open[static_cast<std::size_t>(--depth)] != tag.fieldNumber()) {
        return fault(DecodeCause::mismatchedEndGroup, tagStart);
      }
      if (depth == 0) return {};
    } else if (auto skipped = skipValue(tag, tagStart, nesting); !skipped) {
      return skipped;
    }
    if (isAtEnd()) return fault(DecodeCause::unterminatedGroup, cursor_);
    tagStart = cursor_;
    const auto next = readTag();
    if (!next) return std::unexpected(next.error());
    tag = *next;
  }
}

std::size_t WireReader::countFollowing(Tag tag, std::size_t most, Others others) const {
  // What lies this far ahead is fetched while the records before it are counted: each record's length has to
  // be there before the next record is found (docs/decisions/long-lists.md).
  constexpr std::size_t ahead = 2048;
  WireReader probe(*this);
  std::size_t count = 0;
  if (!probe.readLengthDelimited()) return count;
  while (count < most) {
    const std::byte* const start = probe.cursor_;
    __builtin_prefetch(start + std::min(ahead, probe.remaining()));
    const auto next = probe.readTag();
    if (!next) break;
    if (next->value == tag.value) {
      if (!probe.readLengthDelimited()) break;
      ++count;
    } else if (others == Others::endTheCount || !probe.skipValue(*next, start, 0)) {
      break;
    }
  }
  return count;
}

}  // namespace orv
