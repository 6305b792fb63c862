#include "document_builder.hpp"

#include <algorithm>
#include <utility>

#include <orv/json/document.hpp>

namespace orv::json {

namespace {

// The library's sentence without its prefix, which ends with the position, and without the token that was
// read, which may be as long as the input.
std::string reasonOf(std::string_view what) {
  if (const auto prefix = what.find(": "); prefix != std::string_view::npos) what.remove_prefix(prefix + 2);
  std::string reason(what);
  constexpr std::size_t longestToken = 40;
  const auto token = reason.find("; last read: '");
  if (token == std::string::npos) return reason;
  const auto end = reason.rfind('\'');
  if (end - token > longestToken) reason.erase(token, end + 1 - token);
  return reason;
}

bool startsCharacter(char byte) { return (static_cast<unsigned char>(byte) & 0xC0) != 0x80; }

}  // namespace

// Lists and objects grow at the end of what is open, so a pointer to an open one stays good.
Node* DocumentBuilder::add(Node value) {
  if (open_.empty()) {
    root_ = std::move(value);
    return &root_;
  }
  Open& innermost = open_.back();
  if (innermost.node->is_array()) {
    auto& items = innermost.node->get_ref<Node::array_t&>();
    return &items.emplace_back(std::move(value));
  }
  // Not the map's own emplace, which looks through all members for the name each time.
  auto& members = static_cast<Node::object_t::Container&>(innermost.node->get_ref<Node::object_t&>());
  return &members.emplace_back(innermost.memberName, std::move(value)).second;
}

bool DocumentBuilder::open(Node empty) {
  if (open_.size() == Document::maximumNesting) {
    error_ =
        Error{.reason = "nested deeper than " + std::to_string(Document::maximumNesting), .path = path()};
    return false;
  }
  open_.push_back({add(std::move(empty)), {}, {}});
  return true;
}

bool DocumentBuilder::close() {
  open_.pop_back();
  return true;
}

bool DocumentBuilder::key(std::string& name) {
  Open& innermost = open_.back();
  innermost.memberName = name;
  if (innermost.names.insert(std::move(name)).second) return true;
  error_ = Error{.reason = "the object has this member twice", .path = path()};
  return false;
}

bool DocumentBuilder::parse_error(std::size_t position, const std::string&,
                                  const nlohmann::detail::exception& cause) {
  // The position counts the bytes that were read, the offending one included.
  const std::string_view read = text_.substr(0, std::min(position, text_.size()));
  const std::string_view before = read.substr(0, read.empty() ? 0 : read.size() - 1);
  const std::size_t lineStart = before.rfind('\n') + 1;  // 0 in the first line
  error_ = Error{.reason = reasonOf(cause.what()),
                 .path = {},
                 .line = 1 + static_cast<std::size_t>(std::ranges::count(before, '\n')),
                 .column = 1 + static_cast<std::size_t>(
                                   std::ranges::count_if(before.substr(lineStart), startsCharacter))};
  return false;
}

std::string DocumentBuilder::path() const {
  std::string path = "$";
  for (const Open& step : open_) {
    if (step.node->is_array()) {
      const bool isInnermost = &step == &open_.back();
      path += '[' + std::to_string(step.node->size() - (isInnermost ? 0 : 1)) + ']';
    } else {
      path += memberStep(step.memberName);
    }
  }
  return path;
}

}  // namespace orv::json
