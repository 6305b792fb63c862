// A host's answer to a request to connect.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <tuple>
#include <utility>
#include <variant>

#include <orv/empty_message.hpp>
#include <orv/message.hpp>

namespace orv::inline v0 {

// The host's answer to a ConnectionRequest. It has no fields and gives its parts their names: the answer is a
// Content, which is encoded as a message of its own.
class ConnectionResponse final : public EmptyMessage<ConnectionResponse> {
 public:
  // The answer itself: whom it is for, and the decision.
  class Content final : public Message<Content> {
   public:
    // The payload of a denial, which has no fields.
    class DeniedContent final : public EmptyMessage<DeniedContent> {
     public:
      static constexpr std::string_view protoMessageName = "orv.ConnectionResponse.Content.DeniedContent";

      DeniedContent() noexcept {}
    };

    // The payload of an approval.
    class ApprovalContent final : public Message<ApprovalContent> {
     public:
      static constexpr std::string_view protoMessageName = "orv.ConnectionResponse.Content.ApprovalContent";

      ApprovalContent() noexcept {}
      ApprovalContent(const ApprovalContent&) = default;
      ApprovalContent(ApprovalContent&&) noexcept = default;
      ApprovalContent& operator=(const ApprovalContent& other) { return assign(other); }
      ApprovalContent& operator=(ApprovalContent&& other) noexcept { return assign(std::move(other)); }

      // Bytes that the device needs to take part; what they hold is between the peers.
      const ByteBuffer& invitationData() const ORV_BOUND { return invitationData_; }
      void setInvitationData(ByteBuffer value) { invitationData_ = std::move(value); }

     private:
      friend Message;  // the rules read the table
      ByteBuffer invitationData_;

      static constexpr std::tuple fields{
          field<&ApprovalContent::invitationData_>(1, "invitationData", secret),
      };
    };

    using OneOf_Operation = std::variant<DeniedContent, ApprovalContent>;

    static constexpr std::string_view protoMessageName = "orv.ConnectionResponse.Content";

    Content() noexcept {}
    Content(const Content&) = default;
    Content(Content&&) noexcept = default;
    Content& operator=(const Content& other) { return assign(other); }
    Content& operator=(Content&& other) noexcept { return assign(std::move(other)); }

    const Text& identifier() const ORV_BOUND { return identifier_; }
    Text& mutableIdentifier() { return identifier_; }
    void setIdentifier(Text value) { identifier_ = std::move(value); }

    const Text& handle() const ORV_BOUND { return handle_; }
    Text& mutableHandle() { return handle_; }
    void setHandle(Text value) { handle_ = std::move(value); }

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
    Text handle_;
    std::optional<OneOf_Operation> operation_;

    static constexpr std::tuple fields{
        field<&Content::identifier_>(1, "identifier"),
        field<&Content::handle_>(2, "handle"),
        field<&Content::operation_, DeniedContent>(3, "denied"),
        field<&Content::operation_, ApprovalContent>(4, "approved"),
    };
  };

  static constexpr std::string_view protoMessageName = "orv.ConnectionResponse";

  ConnectionResponse() noexcept {}
};

}  // namespace orv
