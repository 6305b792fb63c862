#include "examples/invitation/narrator.hpp"

#include <unistd.h>

#include <cstdlib>

namespace invitation {

namespace {

constexpr std::size_t whoWidth = 4;
constexpr std::size_t actionWidth = 8;
constexpr std::size_t subjectWidth = 22;

bool wantsColour() {
  const char* const refused = std::getenv("NO_COLOR");
  return ::isatty(STDOUT_FILENO) == 1 && (refused == nullptr || *refused == '\0');
}

std::string_view colourOf(std::string_view who) { return who == "host" ? "\033[36m" : "\033[33m"; }

std::string padded(std::string_view text, std::size_t width) {
  std::string column(text);
  if (column.size() < width) column.resize(width, ' ');
  return column;
}

void writeAll(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t count = ::write(descriptor, text.data(), text.size());
    // Where nobody reads the narration, the invitation goes on.
    if (count <= 0) return;
    text.remove_prefix(static_cast<std::size_t>(count));
  }
}

std::string plain(const orv::Text& text) { return std::string(text.utf8()); }

std::string quoted(const orv::Text& text) { return "\"" + plain(text) + "\""; }

std::string joined(std::string list, const orv::Text& item) {
  if (!list.empty()) list += ", ";
  return list + plain(item);
}

struct EventInWords {
  std::string operator()(const orv::Group::Initialization& event) const {
    std::string handles;
    for (const orv::Member& member : event.members()) handles = joined(std::move(handles), member.handle());
    return "initialize: " + handles;
  }
  std::string operator()(const orv::Group::MemberAdded& event) const {
    return "memberAdded: " + plain(event.member().handle());
  }
  std::string operator()(const orv::Group::MemberRemoved& event) const {
    return "memberRemoved: " + plain(event.member().handle());
  }
  std::string operator()(const orv::Group::MemberLeft& event) const {
    return std::string("memberLeft, ") + (event.usesToken() ? "with a token" : "without a token");
  }
};

}  // namespace

void Narrator::tell(std::string_view action, std::string_view subject, std::string_view details) const {
  std::string line = padded(who_, whoWidth);
  if (wantsColour()) line = std::string(colourOf(who_)) + line + "\033[0m";
  line += "  " + padded(action, actionWidth) + "  " + padded(subject, subjectWidth);
  line += details;
  line += '\n';
  writeAll(STDOUT_FILENO, line);
}

void Narrator::complain(std::string_view what) const {
  writeAll(STDERR_FILENO, "invitation: " + who_ + ": " + std::string(what) + "\n");
}

std::string inWords(const orv::ConnectionRequest& request) {
  return plain(request.handle()) + ", " + quoted(request.displayName());
}

std::string inWords(const orv::ConnectionResponse::Content& answer) {
  if (!answer.operation()) return "undecided";
  if (std::holds_alternative<orv::ConnectionResponse::Content::DeniedContent>(*answer.operation())) {
    return "denied";
  }
  return "approved, " + std::to_string(answer.approved().invitationData().size()) +
         " bytes of invitation data";
}

std::string inWords(const orv::JoinRequest& request) {
  return "key of " + std::to_string(request.publicKey().size()) + " bytes, " +
         std::to_string(request.encryptedData().size()) + " sealed bytes";
}

std::string inWords(const orv::JoinRequest::Content& body) {
  return quoted(body.displayName()) + (body.wantsTokenUri() ? ", wants a token URI" : "");
}

std::string inWords(const orv::JoinResponse& response) {
  return std::to_string(response.encryptedData().size()) + " sealed bytes";
}

std::string inWords(const orv::JoinResponse::Content& body) {
  if (!body.operation()) return "undecided";
  if (std::holds_alternative<orv::JoinResponse::Content::DeniedContent>(*body.operation())) return "denied";
  std::string handles;
  for (const orv::Text& handle : body.approved().memberHandles())
    handles = joined(std::move(handles), handle);
  return "approved: " + handles;
}

std::string inWords(const orv::Group& group) {
  return group.event() ? std::visit(EventInWords{}, *group.event()) : "no event";
}

}  // namespace invitation
