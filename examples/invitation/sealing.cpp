#include "examples/invitation/sealing.hpp"

#include <span>

namespace invitation {

namespace {

constexpr std::size_t nonceSize = crypto_aead_xchacha20poly1305_ietf_NPUBBYTES;
constexpr std::size_t overhead = nonceSize + crypto_aead_xchacha20poly1305_ietf_ABYTES;

const unsigned char* bytesOf(std::string_view text) {
  return reinterpret_cast<const unsigned char*>(text.data());
}
unsigned char* bytesOf(std::string& text) { return reinterpret_cast<unsigned char*>(text.data()); }

Outcome<> checkSize(const orv::ByteBuffer& key) {
  if (key.size() == crypto_kx_PUBLICKEYBYTES) return {};
  return failure("a public key of " + std::to_string(key.size()) + " bytes");
}

}  // namespace

orv::ByteBuffer KeyPair::publicKey() const { return orv::ByteBuffer(std::as_bytes(std::span(publicKey_))); }

Outcome<Sealer> Sealer::forGuest(const KeyPair& own, const orv::ByteBuffer& hostKey) {
  if (auto checked = checkSize(hostKey); !checked) return std::unexpected(checked.error());
  Sealer sealer;
  if (crypto_kx_client_session_keys(sealer.receivingKey_.data(), sealer.sendingKey_.data(),
                                    own.publicKey_.data(), own.secretKey_.data(),
                                    bytesOf(hostKey.characters())) != 0) {
    return failure("an unacceptable public key");
  }
  return sealer;
}

Outcome<Sealer> Sealer::forHost(const KeyPair& own, const orv::ByteBuffer& guestKey) {
  if (auto checked = checkSize(guestKey); !checked) return std::unexpected(checked.error());
  Sealer sealer;
  if (crypto_kx_server_session_keys(sealer.receivingKey_.data(), sealer.sendingKey_.data(),
                                    own.publicKey_.data(), own.secretKey_.data(),
                                    bytesOf(guestKey.characters())) != 0) {
    return failure("an unacceptable public key");
  }
  return sealer;
}

Sealer::~Sealer() {
  sodium_memzero(receivingKey_.data(), receivingKey_.size());
  sodium_memzero(sendingKey_.data(), sendingKey_.size());
}

orv::ByteBuffer Sealer::seal(std::string_view body) const {
  std::string sealed(overhead + body.size(), '\0');
  unsigned char* const nonce = bytesOf(sealed);
  randombytes_buf(nonce, nonceSize);
  crypto_aead_xchacha20poly1305_ietf_encrypt(nonce + nonceSize, nullptr, bytesOf(body), body.size(), nullptr,
                                             0, nullptr, nonce, sendingKey_.data());
  return orv::ByteBuffer(sealed);
}

Outcome<std::string> Sealer::open(const orv::ByteBuffer& sealed) const {
  if (sealed.size() < overhead)
    return failure("a sealed body of " + std::to_string(sealed.size()) + " bytes");
  const unsigned char* const nonce = bytesOf(sealed.characters());
  std::string body(sealed.size() - overhead, '\0');
  if (crypto_aead_xchacha20poly1305_ietf_decrypt(bytesOf(body), nullptr, nullptr, nonce + nonceSize,
                                                 sealed.size() - nonceSize, nullptr, 0, nonce,
                                                 receivingKey_.data()) != 0) {
    return failure("a sealed body that was not sealed for us, or was changed on its way");
  }
  return body;
}

}  // namespace invitation
