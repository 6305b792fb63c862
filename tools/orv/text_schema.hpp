// The schema as libprotobuf's text parser needs it. Only the sources that read the text format include this.
#pragma once

#include <google/protobuf/descriptor.h>
#include <google/protobuf/descriptor.pb.h>
#include <google/protobuf/dynamic_message.h>
#include <google/protobuf/message.h>

#include <memory>
#include <string_view>

#include "tools/orv/message_type.hpp"

namespace orv::tool {

// The message types of the shipped schema, or of one that differs from it in one thing: an envelope's data is
// a message of the payload's type. Made on first use, never freed.
class TextSchema {
 public:
  static TextSchema& shipped();
  static TextSchema& withOpenData(const MessageType& payload);

  // `file` is well-formed.
  explicit TextSchema(const google::protobuf::FileDescriptorProto& file);
  TextSchema(const TextSchema&) = delete;
  TextSchema& operator=(const TextSchema&) = delete;

  std::unique_ptr<google::protobuf::Message> newMessage(std::string_view fullName);

 private:
  google::protobuf::DescriptorPool pool_;
  google::protobuf::DynamicMessageFactory factory_{&pool_};
};

}  // namespace orv::tool
