// How the bodies of the join handshake are sealed. The messages carry keys and sealed bytes without looking
// into them; all cryptography is here, and libsodium's.
#pragma once

#include <sodium.h>

#include <array>
#include <string>
#include <string_view>

#include <orv/byte_buffer.hpp>
#include "examples/invitation/outcome.hpp"

namespace invitation {

// A key pair for one invitation. The secret half is wiped when the pair is destroyed.
class KeyPair {
 public:
  KeyPair() { crypto_kx_keypair(publicKey_.data(), secretKey_.data()); }
  ~KeyPair() { sodium_memzero(secretKey_.data(), secretKey_.size()); }
  KeyPair(const KeyPair&) = delete;
  KeyPair& operator=(const KeyPair&) = delete;

  orv::ByteBuffer publicKey() const;

 private:
  friend class Sealer;
  std::array<unsigned char, crypto_kx_PUBLICKEYBYTES> publicKey_{};
  std::array<unsigned char, crypto_kx_SECRETKEYBYTES> secretKey_{};
};

// Seals what one side sends and opens what the other sent. Both derive the same two keys, one for each
// direction, from their own key pair and the other's public key (crypto_kx). A sealed body is a random nonce
// and behind it the encrypted and authenticated bytes (XChaCha20-Poly1305).
class Sealer {
 public:
  // Fail when the other's key is no acceptable public key.
  static Outcome<Sealer> forGuest(const KeyPair& own, const orv::ByteBuffer& hostKey);
  static Outcome<Sealer> forHost(const KeyPair& own, const orv::ByteBuffer& guestKey);

  Sealer(const Sealer&) = default;
  Sealer& operator=(const Sealer&) = default;
  ~Sealer();

  orv::ByteBuffer seal(std::string_view body) const;
  // Fails unless the other side sealed exactly these bytes.
  Outcome<std::string> open(const orv::ByteBuffer& sealed) const;

 private:
  Sealer() = default;

  std::array<unsigned char, crypto_kx_SESSIONKEYBYTES> receivingKey_{};
  std::array<unsigned char, crypto_kx_SESSIONKEYBYTES> sendingKey_{};
};

}  // namespace invitation
