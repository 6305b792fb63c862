#include <orv/binary_decoder.hpp>

namespace orv {

BinaryDecoder::Result BinaryDecoder::handleConflictingOneOf() {
  if (mode_ == Mode::confirmed) return {};
  BinaryDecoder& outermost = this->outermost();
  const auto answer = outermost.hook_();
  if (answer) return {};
  outermost.refusal_ = answer.error();
  return failed();
}

BinaryDecoder::Result BinaryDecoder::keepUnknown(UnknownStorage& unknownFields) {
  // A decoder without input starts where it ends: nowhere.
  if (valueStart_ == nothing) return {};
  if (const auto skipped = reader_.skipValue(tag_, recordStart_, nesting_); !skipped)
    return fail(skipped.error());
  unknownFields.append(std::span(recordStart_, reader_.position()));
  return {};
}

BinaryDecoder::Result BinaryDecoder::readLongTag() {
  const auto tag = reader_.readTag();
  if (!tag) return fail(tag.error());
  tag_ = *tag;
  return {};
}

BinaryDecoder& BinaryDecoder::outermost() {
  BinaryDecoder* decoder = this;
  while (decoder->outer_ != nullptr) decoder = decoder->outer_;
  return *decoder;
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::fail(DecodeCause cause, const std::byte* at,
                                                            std::uint32_t length, std::uint32_t detail) {
  BinaryDecoder& outermost = this->outermost();
  outermost.refusal_.reset();
  outermost.fault_.cause = cause;
  outermost.fault_.at = at;
  outermost.fault_.length = length;
  outermost.fault_.detail = detail;
  outermost.depth_ = nesting_;
  for (const BinaryDecoder* decoder = this; decoder != nullptr; decoder = decoder->outer_) {
    if (decoder->nesting_ < FieldPath::capacity)
      outermost.numbers_[decoder->nesting_] = decoder->tag_.fieldNumber();
  }
  return failed();
}

std::expected<void, DecodeError> BinaryDecoder::failure() {
  BinaryDecoder& outermost = this->outermost();
  std::expected<void, DecodeError> result(std::unexpect);
  DecodeError& error = result.error();
  if (outermost.refusal_.has_value()) {
    error = *outermost.refusal_;
    return result;
  }
  error.cause = outermost.fault_.cause;
  error.length = outermost.fault_.length;
  error.detail = outermost.fault_.detail;
  error.offset = static_cast<std::size_t>(outermost.fault_.at - outermost.begin_);
  const std::size_t size = std::size_t{outermost.depth_} + 1;
  const std::size_t kept = std::min(size, FieldPath::capacity);
  error.path.assign(*outermost.message_, std::span(outermost.numbers_).first(kept), size - kept);
  return result;
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::failIllFormed(std::string_view text,
                                                                     std::size_t wellFormed) {
  return fail(DecodeCause::illFormedText, reinterpret_cast<const std::byte*>(text.data()),
              static_cast<std::uint32_t>(text.size()), static_cast<std::uint32_t>(wellFormed));
}

std::unexpected<BinaryDecoder::Failure> BinaryDecoder::failTooDeep() {
  return fail(DecodeCause::nestingTooDeep, recordStart_, 0, 0);
}

}  // namespace orv
