#include "runtime/binary_decoder.hpp"

namespace orv {

BinaryDecoder::Result BinaryDecoder::handleConflictingOneOf() {
  if (mode_ == Mode::confirmed) return {};
  BinaryDecoder& outermost = this->outermost();
  const auto answer = outermost.hook_();
  if (answer) return {};
  outermost.error_ = answer.error();
  return failed();
}

BinaryDecoder::Result BinaryDecoder::keepUnknown(UnknownStorage& unknownFields) {
  // A decoder without input starts where it ends: nowhere.
  if (valueStart_ == nothing) return {};
  if (const auto skipped = reader_.skipValue(tag_, recordStart_, nesting_); !skipped) return fail(skipped.error());
  unknownFields.append(std::span(recordStart_, reader_.position()));
  return {};
}

BinaryDecoder::Result BinaryDecoder::readLongTag() {
  const auto tag = reader_.readTag();
  if (!tag) return fail(tag.error());
  tag_ = *tag;
  return {};
}

const BinaryDecoder& BinaryDecoder::outermost() const {
  const BinaryDecoder* decoder = this;
  while (decoder->outer_ != nullptr) decoder = decoder->outer_;
  return *decoder;
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::fail(const WireFault& fault) {
  BinaryDecoder& outermost = this->outermost();
  DecodeError& error = outermost.error_.emplace();
  error.cause = fault.cause;
  error.length = fault.length;
  error.detail = fault.detail;
  error.offset = static_cast<std::size_t>(fault.at - outermost.begin_);
  error.path.startFrom(*outermost.message_);
  for (const BinaryDecoder* decoder = this; decoder != nullptr; decoder = decoder->outer_) {
    error.path.prepend(decoder->tag_.fieldNumber());
  }
  return failed();
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::failIllFormed(std::string_view text) {
  return fail({DecodeCause::illFormedText, reinterpret_cast<const std::byte*>(text.data()),
               static_cast<std::uint32_t>(text.size()), static_cast<std::uint32_t>(utf8::wellFormedPrefix(text))});
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::failTooDeep() {
  return fail({DecodeCause::nestingTooDeep, recordStart_});
}

}  // namespace orv
