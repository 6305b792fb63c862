#include "tests/testing/accessors.hpp"

#include <google/protobuf/message.h>

#include <algorithm>
#include <type_traits>
#include <vector>

#include <orv/orv.hpp>
#include <orv/wire_reader.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"

namespace orv::test {

namespace {

std::uint64_t numberIn(std::string_view bytes) {
  return WireReader(std::as_bytes(std::span(bytes))).readVarint().value_or(0);
}

// The bodies of the records of field 1.
std::vector<std::string> itemsIn(std::string_view bytes) {
  std::vector<std::string> items;
  WireReader reader(std::as_bytes(std::span(bytes)));
  for (;;) {
    const auto tag = reader.readTag();
    if (!tag || tag->value != 10) return items;
    const auto body = reader.readLengthDelimited();
    if (!body) return items;
    items.emplace_back(reinterpret_cast<const char*>(body->data()), body->size());
  }
}

// Spells values of all types as bytes, and makes them of bytes.
template <class T>
struct Spelling {  // of messages
  static std::string of(const T& message) { return message.serialize().value(); }
  static T make(std::string_view bytes) { return T::parse(bytes).value_or(T()); }
  static void add(T& to, const T& message) { (void)to.merge(of(message)); }
};
template <>
struct Spelling<Text> {
  static std::string of(const Text& text) { return std::string(text.utf8()); }
  static Text make(std::string_view bytes) { return Text(bytes); }
  static void add(Text& to, const Text& text) { to += text; }
};
template <>
struct Spelling<ByteBuffer> {
  static std::string of(const ByteBuffer& bytes) { return std::string(bytes.characters()); }
  static ByteBuffer make(std::string_view bytes) { return ByteBuffer(bytes); }
  static void add(ByteBuffer& to, const ByteBuffer& bytes) { to = to + bytes; }
};
template <class T>
requires std::is_arithmetic_v<T>
struct Spelling<T> {
  static std::string of(T value) { return varint(value); }
  static T make(std::string_view bytes) { return static_cast<T>(numberIn(bytes)); }
  static void add(T& to, T value) { to = value; }
};
template <>
struct Spelling<VessaSessionMessageType> {
  using Type = VessaSessionMessageType;
  static std::string of(const Type& type) { return varint(static_cast<std::uint64_t>(type.rawValue())); }
  // In the range that travels.
  static Type make(std::string_view bytes) { return Type(static_cast<std::int32_t>(numberIn(bytes))); }
  static void add(Type& to, const Type& type) { to = type; }
};
template <class T>
struct Spelling<std::vector<T>> {
  static std::string of(const std::vector<T>& items) {
    std::string bytes;
    for (const T& item : items) bytes += record(1, Spelling<T>::of(item));
    return bytes;
  }
  static std::vector<T> make(std::string_view bytes) {
    std::vector<T> items;
    for (const std::string& item : itemsIn(bytes)) items.push_back(Spelling<T>::make(item));
    return items;
  }
  static void add(std::vector<T>& to, const std::vector<T>& items) {
    to.insert(to.end(), items.begin(), items.end());
  }
};

template <class M>
M& as(AnyMessage& message) {
  return *static_cast<M*>(message.address());
}

template <class M, class Get, class T = std::remove_cvref_t<std::invoke_result_t<Get, const M&>>>
Accessors row(std::string_view field, Get get, std::type_identity_t<void (M::*)(T)> set,
              std::type_identity_t<T& (M::*)()> change = nullptr, bool (M::*has)() const = nullptr,
              void (M::*clear)() = nullptr) {
  Accessors row{M::protoMessageName, field, {}, {}, {}, {}, {}};
  row.get = [=](AnyMessage& message) {
    return Spelling<T>::of(std::invoke(get, std::as_const(as<M>(message))));
  };
  row.set = [=](AnyMessage& message, std::string_view bytes) {
    T value = Spelling<T>::make(bytes);
    (as<M>(message).*set)(value);
    return Spelling<T>::of(value);
  };
  if (change != nullptr) {
    row.change = [=](AnyMessage& message, std::string_view bytes) {
      const T value = Spelling<T>::make(bytes);
      Spelling<T>::add((as<M>(message).*change)(), value);
      return Spelling<T>::of(value);
    };
  }
  if (has != nullptr) row.has = [=](AnyMessage& message) { return (as<M>(message).*has)(); };
  if (clear != nullptr) row.clear = [=](AnyMessage& message) { (as<M>(message).*clear)(); };
  return row;
}

// A oneof as a whole.
template <class M, class Group>
Accessors groupRow(std::string_view name, auto caseOf, const Group& (M::*get)() const, void (M::*set)(Group),
                   Group& (M::*change)()) {
  Accessors row{M::protoMessageName, name, {}, {}, {}, {}, {}};
  row.get = [=](AnyMessage& message) {
    return varint(static_cast<std::uint64_t>((as<M>(message).*caseOf)()));
  };
  row.set = [=](AnyMessage& message, std::string_view bytes) {
    const M other = Spelling<M>::make(bytes);
    (as<M>(message).*set)((other.*get)());
    return Spelling<M>::of(other);
  };
  row.change = [=](AnyMessage& message, std::string_view) {
    (as<M>(message).*change)().reset();
    return std::string();
  };
  row.has = [=](AnyMessage& message) { return (as<M>(message).*get)().has_value(); };
  row.clear = [=](AnyMessage& message) { (as<M>(message).*set)(std::nullopt); };
  return row;
}

template <class Event>
std::vector<Accessors> memberEventRows() {
  return {row<Event>("groupUUID", &Event::groupUuid, &Event::setGroupUuid),
          row<Event>("member", &Event::member, &Event::setMember, &Event::mutableMember, &Event::hasMember,
                     &Event::clearMember)};
}

std::vector<Accessors> makeRows() {
  using S = SessionMessage;
  using C = ConnectionRequest;
  using A = ConnectionResponse::Content;
  using J = JoinRequest;
  using B = JoinRequest::Content;
  using R = JoinResponse::Content;
  using P = R::ApprovalContent;
  using I = Group::Initialization;
  using L = Group::MemberLeft;
  using G = Group;
  std::vector<Accessors> rows{
      row<S>("version", &S::version, &S::setVersion, &S::mutableVersion, &S::hasVersion, &S::clearVersion),
      row<S>("type", &S::type, &S::setType, &S::mutableType, &S::hasType, &S::clearType),
      row<S>("data", &S::data, &S::setData, &S::mutableData, &S::hasData, &S::clearData),
      row<C>("identifier", &C::identifier, &C::setIdentifier, &C::mutableIdentifier),
      row<C>("handle", &C::handle, &C::setHandle, &C::mutableHandle),
      row<C>("displayName", &C::displayName, &C::setDisplayName, &C::mutableDisplayName, &C::hasDisplayName,
             &C::clearDisplayName),
      row<C>("userInfo", &C::userInfo, &C::setUserInfo, &C::mutableUserInfo, &C::hasUserInfo,
             &C::clearUserInfo),
      row<A>("identifier", &A::identifier, &A::setIdentifier, &A::mutableIdentifier),
      row<A>("handle", &A::handle, &A::setHandle, &A::mutableHandle),
      row<A>("denied", &A::denied, &A::setDenied, &A::mutableDenied),
      row<A>("approved", &A::approved, &A::setApproved, &A::mutableApproved),
      groupRow<A>("operation", &A::operationCase, &A::operation, &A::setOperation, &A::mutableOperation),
      row<A::ApprovalContent>("invitationData", &A::ApprovalContent::invitationData,
                              &A::ApprovalContent::setInvitationData),
      row<J>("publicKey", &J::publicKey, &J::setPublicKey, &J::mutablePublicKey, &J::hasPublicKey,
             &J::clearPublicKey),
      row<J>("encryptedData", &J::encryptedData, &J::setEncryptedData, &J::mutableEncryptedData,
             &J::hasEncryptedData, &J::clearEncryptedData),
      row<B>("identifier", &B::identifier, &B::setIdentifier, &B::mutableIdentifier),
      row<B>("displayName", &B::displayName, &B::setDisplayName, &B::mutableDisplayName, &B::hasDisplayName,
             &B::clearDisplayName),
      row<B>("userInfo", &B::userInfo, &B::setUserInfo, &B::mutableUserInfo, &B::hasUserInfo,
             &B::clearUserInfo),
      row<B>("wantsTokenURI", &B::wantsTokenUri, &B::setWantsTokenUri, &B::mutableWantsTokenUri,
             &B::hasWantsTokenUri, &B::clearWantsTokenUri),
      row<JoinResponse>("encryptedData", &JoinResponse::encryptedData, &JoinResponse::setEncryptedData,
                        &JoinResponse::mutableEncryptedData, &JoinResponse::hasEncryptedData,
                        &JoinResponse::clearEncryptedData),
      row<R>("identifier", &R::identifier, &R::setIdentifier, &R::mutableIdentifier),
      row<R>("denied", &R::denied, &R::setDenied, &R::mutableDenied),
      row<R>("approved", &R::approved, &R::setApproved, &R::mutableApproved),
      groupRow<R>("operation", &R::operationCase, &R::operation, &R::setOperation, &R::mutableOperation),
      row<P>("sessionIdentifier", &P::sessionIdentifier, &P::setSessionIdentifier,
             &P::mutableSessionIdentifier),
      row<P>("memberHandles", &P::memberHandles, &P::setMemberHandles, &P::mutableMemberHandles),
      row<P>("userInfo", &P::userInfo, &P::setUserInfo, &P::mutableUserInfo, &P::hasUserInfo,
             &P::clearUserInfo),
      row<Member>("handle", &Member::handle, &Member::setHandle, &Member::mutableHandle),
      row<Member>("tokenID", &Member::tokenID, &Member::setTokenID, &Member::mutableTokenID,
                  &Member::hasTokenID, &Member::clearTokenID),
      row<G>("initialize", &G::initialize, &G::setInitialize, &G::mutableInitialize),
      row<G>("memberAdded", &G::memberAdded, &G::setMemberAdded, &G::mutableMemberAdded),
      row<G>("memberRemoved", &G::memberRemoved, &G::setMemberRemoved, &G::mutableMemberRemoved),
      row<G>("memberLeft", &G::memberLeft, &G::setMemberLeft, &G::mutableMemberLeft),
      groupRow<G>("event", &G::eventCase, &G::event, &G::setEvent, &G::mutableEvent),
      row<I>("groupUUID", &I::groupUuid, &I::setGroupUuid),
      row<I>("members", &I::members, &I::setMembers, &I::mutableMembers),
      row<L>("groupUUID", &L::groupUuid, &L::setGroupUuid),
      row<L>("usesToken", &L::usesToken, &L::setUsesToken),
  };
  std::ranges::move(memberEventRows<Group::MemberAdded>(), std::back_inserter(rows));
  std::ranges::move(memberEventRows<Group::MemberRemoved>(), std::back_inserter(rows));
  return rows;
}

// An encoding as the independent implementation writes it: unknown fields are spelled the shortest way.
std::string normalized(const google::protobuf::Message& type, const std::string& encoding) {
  const std::unique_ptr<google::protobuf::Message> message(type.New());
  return message->ParseFromString(encoding) ? message->SerializeAsString() : "it is refused";
}

// The field of the independent implementation's message that a row is about, or its oneof.
class OfficialField {
  using Message = google::protobuf::Message;
  using Field = google::protobuf::FieldDescriptor;

 public:
  OfficialField(Message& message, std::string_view name)
      : message_(message),
        reflection_(*message.GetReflection()),
        field_(message.GetDescriptor()->FindFieldByName(std::string(name))),
        oneof_(message.GetDescriptor()->FindOneofByName(std::string(name))) {}

  bool isOneof() const { return field_ == nullptr; }

  std::string get() const {
    if (isOneof()) {
      const Field* const held = reflection_.GetOneofFieldDescriptor(message_, oneof_);
      return varint(held == nullptr ? 0 : static_cast<std::uint64_t>(held->index_in_oneof() + 1));
    }
    std::string list;
    if (field_->is_repeated()) {
      for (int at = 0; at < reflection_.FieldSize(message_, field_); ++at) {
        list +=
            record(1, isMessage() ? reflection_.GetRepeatedMessage(message_, field_, at).SerializeAsString()
                                  : reflection_.GetRepeatedString(message_, field_, at));
      }
      return list;
    }
    switch (field_->cpp_type()) {
      case Field::CPPTYPE_BOOL: return varint(reflection_.GetBool(message_, field_) ? 1 : 0);
      case Field::CPPTYPE_UINT32: return varint(reflection_.GetUInt32(message_, field_));
      case Field::CPPTYPE_ENUM:
        return varint(static_cast<std::uint64_t>(std::int64_t{reflection_.GetEnumValue(message_, field_)}));
      case Field::CPPTYPE_MESSAGE: return reflection_.GetMessage(message_, field_).SerializeAsString();
      default: return reflection_.GetString(message_, field_);
    }
  }

  // The value as it is written here.
  std::string normalized(const std::string& value) const {
    if (isOneof() || !isMessage()) return value;
    const auto& type = *reflection_.GetMessageFactory()->GetPrototype(field_->message_type());
    if (!field_->is_repeated()) return test::normalized(type, value);
    std::string list;
    for (const std::string& item : itemsIn(value)) list += record(1, test::normalized(type, item));
    return list;
  }

  bool has() const {
    return isOneof() ? reflection_.HasOneof(message_, oneof_) : reflection_.HasField(message_, field_);
  }

  void clear() const {
    if (isOneof()) {
      reflection_.ClearOneof(&message_, oneof_);
    } else {
      reflection_.ClearField(&message_, field_);
    }
  }

  void add(const std::string& value) const {
    if (isOneof()) return clear();
    if (field_->is_repeated()) {
      for (const std::string& item : itemsIn(value)) {
        if (isMessage()) {
          reflection_.AddMessage(&message_, field_)->ParseFromString(item);
        } else {
          reflection_.AddString(&message_, field_, item);
        }
      }
      return;
    }
    switch (field_->cpp_type()) {
      case Field::CPPTYPE_BOOL: return reflection_.SetBool(&message_, field_, numberIn(value) != 0);
      case Field::CPPTYPE_UINT32:
        return reflection_.SetUInt32(&message_, field_, static_cast<std::uint32_t>(numberIn(value)));
      case Field::CPPTYPE_ENUM:
        return reflection_.SetEnumValue(&message_, field_, static_cast<int>(numberIn(value)));
      case Field::CPPTYPE_MESSAGE:
        (void)reflection_.MutableMessage(&message_, field_)->MergeFromString(value);
        return;
      default:
        return reflection_.SetString(&message_, field_, reflection_.GetString(message_, field_) + value);
    }
  }

  void set(const std::string& value) const {
    clear();
    if (!isOneof()) return add(value);
    const std::unique_ptr<Message> other(message_.New());
    other->ParseFromString(value);
    const Field* const held = reflection_.GetOneofFieldDescriptor(*other, oneof_);
    if (held != nullptr)
      reflection_.MutableMessage(&message_, held)->CopyFrom(reflection_.GetMessage(*other, held));
  }

 private:
  bool isMessage() const { return field_->cpp_type() == Field::CPPTYPE_MESSAGE; }

  Message& message_;
  const google::protobuf::Reflection& reflection_;
  const Field* field_;
  const google::protobuf::OneofDescriptor* oneof_;
};

}  // namespace

std::span<const Accessors> allAccessors() {
  static const auto* const rows = new std::vector<Accessors>(makeRows());
  return *rows;
}

std::string faultOfScript(const AnyMessage& type, std::string_view script) {
  std::vector<const Accessors*> rows;
  for (const Accessors& row : allAccessors()) {
    if (row.message == type.fullName()) rows.push_back(&row);
  }
  if (rows.empty()) return "";
  const MessagePointer message = type.copied();
  const auto official = newOfficial(type.fullName());
  while (script.size() >= 2) {
    // Each step is a row, an operation and its bytes.
    const auto choice = static_cast<unsigned char>(script[0]);
    const Accessors& row = *rows[choice % rows.size()];
    const auto operation = static_cast<unsigned char>(script[1]);
    const std::string_view value = script.substr(2, operation >> 2);
    script.remove_prefix(2 + value.size());
    const OfficialField field(*official, row.field);
    switch (operation & 3) {
      case 0:
        if (row.clear) row.clear(*message), field.clear();
        break;
      case 1:
        if (row.change) field.add(row.change(*message, value));
        break;
      default: field.set(row.set(*message, value));
    }

    const std::string step = " after a step with " + std::string(row.field);
    for (const Accessors* const each : rows) {
      const OfficialField same(*official, each->field);
      if (same.normalized(each->get(*message)) != same.get())
        return std::string(each->field) + " reads otherwise" + step;
      if (each->has && each->has(*message) != same.has())
        return std::string(each->field) + " is present otherwise" + step;
    }
    const std::string encoding = message->serialize().value_or("");
    if (normalized(*official, encoding) != official->SerializeAsString())
      return "the encoding is another" + step;
    const MessagePointer copy = message->copied();
    if (!(*copy == *message) || copy->hashValue() != message->hashValue())
      return "the copy is another" + step;
    if (message->encodedSize() != encoding.size()) return "the size is another" + step;
  }
  return "";
}

}  // namespace orv::test
