// A request to connect to a host.
#pragma once

#include <optional>
#include <string_view>
#include <tuple>
#include <utility>

#include <orv/message.hpp>

namespace orv::inline v0 {

// A device asks a host to connect it.
class ConnectionRequest final : public Message<ConnectionRequest> {
 public:
  static constexpr std::string_view protoMessageName = "orv.ConnectionRequest";

  ConnectionRequest() noexcept {}
  ConnectionRequest(const ConnectionRequest&) = default;
  ConnectionRequest(ConnectionRequest&&) noexcept = default;
  ConnectionRequest& operator=(const ConnectionRequest& other) { return assign(other); }
  ConnectionRequest& operator=(ConnectionRequest&& other) noexcept { return assign(std::move(other)); }

  const Text& identifier() const ORV_BOUND { return identifier_; }
  Text& mutableIdentifier() { return identifier_; }
  void setIdentifier(Text value) { identifier_ = std::move(value); }

  // How the device is addressed.
  const Text& handle() const ORV_BOUND { return handle_; }
  Text& mutableHandle() { return handle_; }
  void setHandle(Text value) { handle_ = std::move(value); }

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

 private:
  friend Message;  // the rules read the table
  Text identifier_;
  Text handle_;
  std::optional<Text> displayName_;
  std::optional<ByteBuffer> userInfo_;

  static constexpr std::tuple fields{
      field<&ConnectionRequest::identifier_>(1, "identifier"),
      field<&ConnectionRequest::handle_>(2, "handle"),
      field<&ConnectionRequest::displayName_>(3, "displayName"),
      field<&ConnectionRequest::userInfo_>(4, "userInfo"),
  };
};

}  // namespace orv
