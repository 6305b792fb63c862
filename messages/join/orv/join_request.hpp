// A request to join a session.
#pragma once

#include <optional>
#include <string_view>
#include <tuple>
#include <utility>

#include <orv/message.hpp>

namespace orv::inline v0 {

// A device asks the host of a session to let it join. Both fields are opaque bytes of any length.
class JoinRequest final : public Message<JoinRequest> {
 public:
  // What the device says of itself. How it becomes encryptedData is between the peers.
  class Content final : public Message<Content> {
   public:
    static constexpr std::string_view protoMessageName = "orv.JoinRequest.Content";

    Content() noexcept {}
    Content(const Content&) = default;
    Content(Content&&) noexcept = default;
    Content& operator=(const Content& other) { return assign(other); }
    Content& operator=(Content&& other) noexcept { return assign(std::move(other)); }

    const Text& identifier() const ORV_BOUND { return identifier_; }
    Text& mutableIdentifier() { return identifier_; }
    void setIdentifier(Text value) { identifier_ = std::move(value); }

    // The name to show to people, if any.
    const Text& displayName() const ORV_BOUND { return internal::valueOrDefault(displayName_); }
    Text& mutableDisplayName() { return internal::presentValue(displayName_); }  // present from then on
    void setDisplayName(Text value) { displayName_ = std::move(value); }
    bool hasDisplayName() const { return displayName_.has_value(); }
    void clearDisplayName() { displayName_.reset(); }

    // Bytes of the application's own, if any.
    const ByteBuffer& userInfo() const ORV_BOUND { return internal::valueOrDefault(userInfo_); }
    ByteBuffer& mutableUserInfo() { return internal::presentValue(userInfo_); }  // present from then on
    void setUserInfo(ByteBuffer value) { userInfo_ = std::move(value); }
    bool hasUserInfo() const { return userInfo_.has_value(); }
    void clearUserInfo() { userInfo_.reset(); }

    // Whether the device asks for a token URI; absent, false and true are three different things.
    bool wantsTokenUri() const { return wantsTokenUri_.value_or(false); }
    bool& mutableWantsTokenUri() { return internal::presentValue(wantsTokenUri_); }  // present from then on
    void setWantsTokenUri(bool value) { wantsTokenUri_ = value; }
    bool hasWantsTokenUri() const { return wantsTokenUri_.has_value(); }
    void clearWantsTokenUri() { wantsTokenUri_.reset(); }

   private:
    friend Message;  // the rules read the table
    Text identifier_;
    std::optional<Text> displayName_;
    std::optional<ByteBuffer> userInfo_;
    std::optional<bool> wantsTokenUri_;

    static constexpr std::tuple fields{
        field<&Content::identifier_>(1, "identifier"),
        field<&Content::displayName_>(3, "displayName"),
        field<&Content::userInfo_>(4, "userInfo"),
        field<&Content::wantsTokenUri_>(5, "wantsTokenURI"),
    };
  };

  static constexpr std::string_view protoMessageName = "orv.JoinRequest";

  JoinRequest() noexcept {}
  JoinRequest(const JoinRequest&) = default;
  JoinRequest(JoinRequest&&) noexcept = default;
  JoinRequest& operator=(const JoinRequest& other) { return assign(other); }
  JoinRequest& operator=(JoinRequest&& other) noexcept { return assign(std::move(other)); }

  const ByteBuffer& publicKey() const ORV_BOUND { return internal::valueOrDefault(publicKey_); }
  ByteBuffer& mutablePublicKey() { return internal::presentValue(publicKey_); }  // present from then on
  void setPublicKey(ByteBuffer value) { publicKey_ = std::move(value); }
  bool hasPublicKey() const { return publicKey_.has_value(); }
  void clearPublicKey() { publicKey_.reset(); }

  const ByteBuffer& encryptedData() const ORV_BOUND { return internal::valueOrDefault(encryptedData_); }
  ByteBuffer& mutableEncryptedData() {
    return internal::presentValue(encryptedData_);
  }  // present from then on
  void setEncryptedData(ByteBuffer value) { encryptedData_ = std::move(value); }
  bool hasEncryptedData() const { return encryptedData_.has_value(); }
  void clearEncryptedData() { encryptedData_.reset(); }

 private:
  friend Message;  // the rules read the table
  std::optional<ByteBuffer> publicKey_;
  std::optional<ByteBuffer> encryptedData_;

  static constexpr std::tuple fields{
      field<&JoinRequest::publicKey_>(1, "publicKey", secret),
      field<&JoinRequest::encryptedData_>(2, "encryptedData", secret),
  };
};

}  // namespace orv
