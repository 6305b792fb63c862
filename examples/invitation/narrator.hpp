// The lines that a side prints of its work.
#pragma once

#include <string>
#include <string_view>
#include <utility>

#include <orv/envelope.hpp>

namespace invitation {

// Writes one short line for each thing that one side does, in one piece, so that the lines of two processes
// do not mix:
//
//   anna  sends     connectionRequest     anna@tablet, "Anna's tablet"
//   host  receives  connectionRequest     anna@tablet, "Anna's tablet"
//
// Each side has its colour, on a terminal and unless the environment says NO_COLOR.
class Narrator {
 public:
  explicit Narrator(std::string who) : who_(std::move(who)) {}

  const std::string& who() const { return who_; }
  void tell(std::string_view action, std::string_view subject, std::string_view details) const;
  // What went wrong, on standard error.
  void complain(std::string_view what) const;

 private:
  std::string who_;
};

// What matters in a message, in a few words.
std::string inWords(const orv::ConnectionRequest& request);
std::string inWords(const orv::ConnectionResponse::Content& answer);
std::string inWords(const orv::JoinRequest& request);
std::string inWords(const orv::JoinRequest::Content& body);
std::string inWords(const orv::JoinResponse& response);
std::string inWords(const orv::JoinResponse::Content& body);
std::string inWords(const orv::Group& group);

}  // namespace invitation
