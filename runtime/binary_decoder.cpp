#include "runtime/binary_decoder.hpp"

namespace orv {

BinaryDecoder::Result BinaryDecoder::keepUnknown(UnknownStorage& unknownFields) {
  if (const auto skipped = reader_.skipValue(tag_, nesting_); !skipped) return fail(skipped.error());
  unknownFields.append(std::span(recordStart_, reader_.position()));
  return {};
}

std::unexpected<DecodeError> BinaryDecoder::fail(const WireFault& fault) const {
  DecodeError error{.cause = fault.cause,
                    .offset = static_cast<std::size_t>(fault.at - input_.begin),
                    .length = fault.length,
                    .detail = fault.detail,
                    .path = {}};
  for (const BinaryDecoder* decoder = this; decoder != nullptr; decoder = decoder->outer_) {
    if (decoder->message_ != nullptr) error.path.prepend(*decoder->message_, decoder->tag_.fieldNumber());
  }
  return std::unexpected(error);
}

std::unexpected<DecodeError> BinaryDecoder::failIllFormed(std::string_view text) const {
  return fail({DecodeCause::illFormedText, reinterpret_cast<const std::byte*>(text.data()), text.size(),
               utf8::wellFormedPrefix(text)});
}

std::unexpected<DecodeError> BinaryDecoder::failTooDeep() const {
  return fail({DecodeCause::nestingTooDeep, valueStart_});
}

}  // namespace orv
