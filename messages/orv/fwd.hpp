// Declarations of what the library's headers define.
#pragma once

namespace orv::inline v0 {

class Text;
class ByteBuffer;
class ByteView;
class UnknownStorage;
class Hasher;
class NameMap;

class BinaryDecoder;
class BinaryEncoder;
class DelimitedReader;
class DelimitedParser;

class VessaSessionMessageType;
class SessionMessage;
class ConnectionRequest;
class ConnectionResponse;
class JoinRequest;
class JoinResponse;
class Member;
class Group;

}  // namespace orv
