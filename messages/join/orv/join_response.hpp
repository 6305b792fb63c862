// A host's answer to a request to join.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <tuple>
#include <utility>
#include <variant>
#include <vector>

#include <orv/empty_message.hpp>
#include <orv/message.hpp>

namespace orv::inline v0 {

// The host's answer to a JoinRequest, as opaque bytes.
class JoinResponse final : public Message<JoinResponse> {
 public:
  // The answer itself. How it becomes encryptedData is between the peers.
  class Content final : public Message<Content> {
   public:
    // The payload of a denial, which has no fields.
    class DeniedContent final : public EmptyMessage<DeniedContent> {
     public:
      static constexpr std::string_view protoMessageName = "orv.JoinResponse.Content.DeniedContent";

      DeniedContent() noexcept {}
    };

    // The payload of an approval: the session that the device now belongs to.
    class ApprovalContent final : public Message<ApprovalContent> {
     public:
      static constexpr std::string_view protoMessageName = "orv.JoinResponse.Content.ApprovalContent";

      ApprovalContent() noexcept {}
      ApprovalContent(const ApprovalContent&) = default;
      ApprovalContent(ApprovalContent&&) noexcept = default;
      ApprovalContent& operator=(const ApprovalContent& other) { return assign(other); }
      ApprovalContent& operator=(ApprovalContent&& other) noexcept { return assign(std::move(other)); }

      const Text& sessionIdentifier() const ORV_BOUND { return sessionIdentifier_; }
      Text& mutableSessionIdentifier() { return sessionIdentifier_; }
      void setSessionIdentifier(Text value) { sessionIdentifier_ = std::move(value); }

      // The handles of the session's members, in the order given.
      const std::vector<Text>& memberHandles() const ORV_BOUND { return memberHandles_; }
      std::vector<Text>& mutableMemberHandles() { return memberHandles_; }
      void setMemberHandles(std::vector<Text> value) { memberHandles_ = std::move(value); }

      // Bytes of the application's own, if any.
      const ByteBuffer& userInfo() const ORV_BOUND { return internal::valueOrDefault(userInfo_); }
      ByteBuffer& mutableUserInfo() { return internal::presentValue(userInfo_); }  // present from then on
      void setUserInfo(ByteBuffer value) { userInfo_ = std::move(value); }
      bool hasUserInfo() const { return userInfo_.has_value(); }
      void clearUserInfo() { userInfo_.reset(); }

     private:
      friend Message;  // the rules read the table
      Text sessionIdentifier_;
      std::vector<Text> memberHandles_;
      std::optional<ByteBuffer> userInfo_;

      static constexpr std::tuple fields{
          field<&ApprovalContent::sessionIdentifier_>(1, "sessionIdentifier"),
          field<&ApprovalContent::memberHandles_>(2, "memberHandles"),
          field<&ApprovalContent::userInfo_>(3, "userInfo"),
      };
    };

    using OneOf_Operation = std::variant<DeniedContent, ApprovalContent>;

    static constexpr std::string_view protoMessageName = "orv.JoinResponse.Content";

    Content() noexcept {}
    Content(const Content&) = default;
    Content(Content&&) noexcept = default;
    Content& operator=(const Content& other) { return assign(other); }
    Content& operator=(Content&& other) noexcept { return assign(std::move(other)); }

    const Text& identifier() const ORV_BOUND { return identifier_; }
    Text& mutableIdentifier() { return identifier_; }
    void setIdentifier(Text value) { identifier_ = std::move(value); }

    // Which case is held, for a switch.
    enum class OperationCase : std::uint8_t { none, denied, approved };
    OperationCase operationCase() const { return internal::caseHeld<OperationCase>(operation_); }

    // The decision as a whole: none, or one case with its payload.
    const std::optional<OneOf_Operation>& operation() const ORV_BOUND { return operation_; }
    std::optional<OneOf_Operation>& mutableOperation() { return operation_; }
    void setOperation(std::optional<OneOf_Operation> value) { operation_ = std::move(value); }

    // A case reads as a default payload unless it is the one held. Setting it, or calling its `mutable…`, makes it
    // the one, and what was held is gone.
    const DeniedContent& denied() const ORV_BOUND {
      return internal::caseOrDefault<DeniedContent>(operation_);
    }
    DeniedContent& mutableDenied() { return internal::presentCase<DeniedContent>(operation_); }
    void setDenied(DeniedContent value) { operation_ = std::move(value); }

    const ApprovalContent& approved() const ORV_BOUND {
      return internal::caseOrDefault<ApprovalContent>(operation_);
    }
    ApprovalContent& mutableApproved() { return internal::presentCase<ApprovalContent>(operation_); }
    void setApproved(ApprovalContent value) { operation_ = std::move(value); }

   private:
    friend Message;  // the rules read the table
    Text identifier_;
    std::optional<OneOf_Operation> operation_;

    static constexpr std::tuple fields{
        field<&Content::identifier_>(1, "identifier"),
        field<&Content::operation_, DeniedContent>(3, "denied"),
        field<&Content::operation_, ApprovalContent>(4, "approved"),
    };
  };

  static constexpr std::string_view protoMessageName = "orv.JoinResponse";

  JoinResponse() noexcept {}
  JoinResponse(const JoinResponse&) = default;
  JoinResponse(JoinResponse&&) noexcept = default;
  JoinResponse& operator=(const JoinResponse& other) { return assign(other); }
  JoinResponse& operator=(JoinResponse&& other) noexcept { return assign(std::move(other)); }

  const ByteBuffer& encryptedData() const ORV_BOUND { return internal::valueOrDefault(encryptedData_); }
  ByteBuffer& mutableEncryptedData() {
    return internal::presentValue(encryptedData_);
  }  // present from then on
  void setEncryptedData(ByteBuffer value) { encryptedData_ = std::move(value); }
  bool hasEncryptedData() const { return encryptedData_.has_value(); }
  void clearEncryptedData() { encryptedData_.reset(); }

 private:
  friend Message;  // the rules read the table
  std::optional<ByteBuffer> encryptedData_;

  static constexpr std::tuple fields{
      field<&JoinResponse::encryptedData_>(2, "encryptedData", secret),
  };
};

}  // namespace orv
