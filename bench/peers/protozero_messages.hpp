#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "bench/peers/protozero_fields.hpp"

// The messages as one writes them by hand over protozero. Each has `read`, which takes the field that the
// reader stands at or answers false for a field that it does not know, and `write`.
namespace bench::by_hand {

struct SessionMessage : Unknown {
  std::optional<std::uint32_t> version;
  std::optional<std::int32_t> type;
  std::optional<std::string> data;
  bool operator==(const SessionMessage&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case varint(1): return readValue(version, reader.get_uint32());
      case varint(2): return readValue(type, reader.get_enum());
      case delimited(3): return readBytes(present(data), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    if (version) writer.add_uint32(1, *version);
    if (type) writer.add_enum(2, *type);
    writePresent(writer, 3, data);
  }
};

struct ConnectionRequest : Unknown {
  std::string identifier;
  std::string handle;
  std::optional<std::string> displayName;
  std::optional<std::string> userInfo;
  bool operator==(const ConnectionRequest&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(identifier, reader);
      case delimited(2): return readText(handle, reader);
      case delimited(3): return readText(present(displayName), reader);
      case delimited(4): return readBytes(present(userInfo), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, identifier);
    writeUnlessEmpty(writer, 2, handle);
    writePresent(writer, 3, displayName);
    writePresent(writer, 4, userInfo);
  }
};

struct Denied : Unknown {
  bool operator==(const Denied&) const = default;
  bool read(pbf_reader&) { return false; }
  void write(auto&) const {}
};

struct ConnectionApproval : Unknown {
  std::string invitationData;
  bool operator==(const ConnectionApproval&) const = default;

  bool read(pbf_reader& reader) {
    return reader.tag_and_type() == delimited(1) && readBytes(invitationData, reader);
  }
  void write(auto& writer) const { writeUnlessEmpty(writer, 1, invitationData); }
};

struct ConnectionResponseContent : Unknown {
  std::string identifier;
  std::string handle;
  std::variant<std::monostate, Denied, ConnectionApproval> operation;
  bool operator==(const ConnectionResponseContent&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(identifier, reader);
      case delimited(2): return readText(handle, reader);
      case delimited(3): return readCase<Denied>(operation, reader);
      case delimited(4): return readCase<ConnectionApproval>(operation, reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, identifier);
    writeUnlessEmpty(writer, 2, handle);
    writeCase<Denied>(writer, 3, operation);
    writeCase<ConnectionApproval>(writer, 4, operation);
  }
};

struct JoinRequest : Unknown {
  std::optional<std::string> publicKey;
  std::optional<std::string> encryptedData;
  bool operator==(const JoinRequest&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readBytes(present(publicKey), reader);
      case delimited(2): return readBytes(present(encryptedData), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writePresent(writer, 1, publicKey);
    writePresent(writer, 2, encryptedData);
  }
};

struct JoinRequestContent : Unknown {
  std::string identifier;
  std::optional<std::string> displayName;
  std::optional<std::string> userInfo;
  std::optional<bool> wantsTokenURI;
  bool operator==(const JoinRequestContent&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(identifier, reader);
      case delimited(3): return readText(present(displayName), reader);
      case delimited(4): return readBytes(present(userInfo), reader);
      case varint(5): return readValue(wantsTokenURI, reader.get_bool());
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, identifier);
    writePresent(writer, 3, displayName);
    writePresent(writer, 4, userInfo);
    if (wantsTokenURI) writer.add_bool(5, *wantsTokenURI);
  }
};

struct JoinApproval : Unknown {
  std::string sessionIdentifier;
  std::vector<std::string> memberHandles;
  std::optional<std::string> userInfo;
  bool operator==(const JoinApproval&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(sessionIdentifier, reader);
      case delimited(2): return readText(memberHandles.emplace_back(), reader);
      case delimited(3): return readBytes(present(userInfo), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, sessionIdentifier);
    for (const std::string& handle : memberHandles) writer.add_bytes(2, handle);
    writePresent(writer, 3, userInfo);
  }
};

struct JoinResponseContent : Unknown {
  std::string identifier;
  std::variant<std::monostate, Denied, JoinApproval> operation;
  bool operator==(const JoinResponseContent&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(identifier, reader);
      case delimited(3): return readCase<Denied>(operation, reader);
      case delimited(4): return readCase<JoinApproval>(operation, reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, identifier);
    writeCase<Denied>(writer, 3, operation);
    writeCase<JoinApproval>(writer, 4, operation);
  }
};

struct Member : Unknown {
  std::string handle;
  std::optional<std::string> tokenID;
  bool operator==(const Member&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readText(handle, reader);
      case delimited(2): return readText(present(tokenID), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, handle);
    writePresent(writer, 2, tokenID);
  }
};

struct Initialization : Unknown {
  std::string groupUUID;
  std::vector<Member> members;
  bool operator==(const Initialization&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readBytes(groupUUID, reader);
      case delimited(2): return readMessage(members.emplace_back(), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, groupUUID);
    for (const Member& member : members) writeMessage(writer, 2, member);
  }
};

// Added and removed look alike and differ as cases of the oneof.
template <int number>
struct MemberChange : Unknown {
  std::string groupUUID;
  std::optional<Member> member;
  bool operator==(const MemberChange&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readBytes(groupUUID, reader);
      case delimited(2): return readMessage(present(member), reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, groupUUID);
    if (member) writeMessage(writer, 2, *member);
  }
};

struct MemberLeft : Unknown {
  std::string groupUUID;
  bool usesToken = false;
  bool operator==(const MemberLeft&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readBytes(groupUUID, reader);
      case varint(2): return readValue(usesToken, reader.get_bool());
    }
    return false;
  }
  void write(auto& writer) const {
    writeUnlessEmpty(writer, 1, groupUUID);
    if (usesToken) writer.add_bool(2, usesToken);
  }
};

struct Group : Unknown {
  std::variant<std::monostate, Initialization, MemberChange<2>, MemberChange<3>, MemberLeft> event;
  bool operator==(const Group&) const = default;

  bool read(pbf_reader& reader) {
    switch (reader.tag_and_type()) {
      case delimited(1): return readCase<Initialization>(event, reader);
      case delimited(2): return readCase<MemberChange<2>>(event, reader);
      case delimited(3): return readCase<MemberChange<3>>(event, reader);
      case delimited(4): return readCase<MemberLeft>(event, reader);
    }
    return false;
  }
  void write(auto& writer) const {
    writeCase<Initialization>(writer, 1, event);
    writeCase<MemberChange<2>>(writer, 2, event);
    writeCase<MemberChange<3>>(writer, 3, event);
    writeCase<MemberLeft>(writer, 4, event);
  }
};

}  // namespace bench::by_hand
