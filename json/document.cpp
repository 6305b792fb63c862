#include <orv/json/document.hpp>

#include <algorithm>
#include <array>
#include <cassert>
#include <cmath>
#include <limits>
#include <nlohmann/json.hpp>
#include <unordered_set>
#include <utility>
#include <vector>

#include <orv/spelling/text_position.hpp>

namespace orv::inline v0::json {

namespace {

constexpr std::size_t longestName = 64;

bool isPlain(std::string_view name) {
  return !name.empty() && name.size() <= longestName && std::ranges::all_of(name, [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
  });
}

// Members in the document's order.
using Node = nlohmann::ordered_json;

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

// Builds a document from the parser's events. The library's own builder would keep one of two members of the
// same name; this refuses them, and nesting that is too deep, while the text is read.
class DocumentBuilder final : public nlohmann::json_sax<Node> {
 public:
  explicit DocumentBuilder(std::string_view text) : text_(text) {}

  Node takeRoot() { return std::move(root_); }
  // What ended the parsing early.
  const std::optional<Error>& error() const { return error_; }

  bool null() override { return add(nullptr) != nullptr; }
  bool boolean(bool value) override { return add(value) != nullptr; }
  bool number_integer(std::int64_t value) override { return add(value) != nullptr; }
  bool number_unsigned(std::uint64_t value) override { return add(value) != nullptr; }
  bool number_float(double value, const std::string&) override { return add(value) != nullptr; }
  bool string(std::string& value) override { return add(std::move(value)) != nullptr; }
  bool binary(Node::binary_t&) override { return false; }
  bool start_object(std::size_t) override { return open(Node::object()); }
  bool end_object() override { return close(); }
  bool start_array(std::size_t) override { return open(Node::array()); }
  bool end_array() override { return close(); }
  bool key(std::string& name) override {
    Open& innermost = open_.back();
    innermost.memberName = name;
    return innermost.names.insert(std::move(name)).second || fail("the object has this member twice");
  }
  // The position counts the bytes that were read, the offending one included.
  bool parse_error(std::size_t position, const std::string&,
                   const nlohmann::detail::exception& cause) override {
    spelling::TextPosition place;
    for (std::size_t at = 0; at + 1 < std::min(position, text_.size()); ++at) place.advance(text_[at]);
    const auto [reason, line, column] = place.error(reasonOf(cause.what()));
    error_ = Error{.reason = reason, .path = {}, .line = line, .column = column};
    return false;
  }

 private:
  // An object or a list that is not at its end yet.
  struct Open {
    Node* node;
    std::string memberName;
    std::unordered_set<std::string> names;
  };

  // Lists and objects grow at the end of what is open, so a pointer to an open one stays good.
  Node* add(Node value) {
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

  bool open(Node empty) {
    if (open_.size() == Document::maximumNesting)
      return fail("nested deeper than " + std::to_string(Document::maximumNesting));
    open_.push_back({add(std::move(empty)), {}, {}});
    return true;
  }

  bool close() {
    open_.pop_back();
    return true;
  }

  // About the member or item that is being read.
  bool fail(std::string reason) {
    std::string path = "$";
    for (const Open& step : open_) {
      const std::size_t finished = step.node->size() - (&step == &open_.back() ? 0 : 1);
      path += step.node->is_array() ? '[' + std::to_string(finished) + ']' : memberStep(step.memberName);
    }
    error_ = Error{.reason = std::move(reason), .path = std::move(path)};
    return false;
  }

  std::string_view text_;
  Node root_;
  std::vector<Open> open_;
  std::optional<Error> error_;
};

// In the order of Value::Kind.
constexpr std::array<std::string_view, 6> kindNames{"null",     "a boolean", "a number",
                                                    "a string", "a list",    "an object"};

const Node& nodeAt(const void* node) { return *static_cast<const Node*>(node); }

}  // namespace

std::string memberStep(std::string_view name) {
  if (isPlain(name)) return "." + std::string(name);
  if (name.size() <= longestName) return "[\"" + std::string(name) + "\"]";
  return "[\"" + std::string(name.substr(0, spelling::characterStart(name, longestName))) + "…\"]";
}

std::string Error::message() const {
  if (!path.empty()) return path + ": " + reason;
  return spelling::TextError{reason, line, column}.message();
}

struct Document::Contents {
  Node root;
};

Document::Document(std::unique_ptr<Contents> contents) : contents_(std::move(contents)) {}
Document::Document(Document&&) noexcept = default;
Document& Document::operator=(Document&&) noexcept = default;
Document::~Document() = default;

Value Document::root() const { return Value(&contents_->root); }

std::expected<Document, Error> Document::parse(std::string_view text) {
  DocumentBuilder builder(text);
  Node::sax_parse(text.begin(), text.end(), &builder);
  if (builder.error().has_value()) return std::unexpected(*builder.error());
  return Document(std::make_unique<Contents>(builder.takeRoot()));
}

Value::Kind Value::kind() const {
  const Node& node = nodeAt(node_);
  if (node.is_null()) return Kind::null;
  if (node.is_boolean()) return Kind::boolean;
  if (node.is_number()) return Kind::number;
  if (node.is_string()) return Kind::text;
  return node.is_array() ? Kind::list : Kind::object;
}

std::string_view Value::kindName() const { return kindNames[static_cast<std::size_t>(kind())]; }

bool Value::boolean() const { return nodeAt(node_).get_ref<const Node::boolean_t&>(); }

std::string_view Value::text() const { return nodeAt(node_).get_ref<const Node::string_t&>(); }

std::optional<std::int64_t> Value::integer() const {
  constexpr double limit = 0x1p63;
  const Node& node = nodeAt(node_);
  assert(node.is_number());
  if (node.is_number_float()) {
    const auto number = node.get<double>();
    if (std::trunc(number) != number || number < -limit || number >= limit) return std::nullopt;
    return static_cast<std::int64_t>(number);
  }
  if (node.is_number_unsigned() && node.get<std::uint64_t>() > std::numeric_limits<std::int64_t>::max())
    return std::nullopt;
  return node.get<std::int64_t>();
}

std::size_t Value::size() const { return nodeAt(node_).size(); }

Value Value::item(std::size_t index) const { return Value(&nodeAt(node_)[index]); }

Value::Member Value::member(std::size_t index) const {
  const auto& members = nodeAt(node_).get_ref<const Node::object_t&>();
  const auto& [name, value] = *(members.begin() + static_cast<std::ptrdiff_t>(index));
  return {name, Value(&value)};
}

std::optional<Value> Value::find(std::string_view name) const {
  for (std::size_t index = 0; index < size(); ++index) {
    if (const Member found = member(index); found.name == name) return found.value;
  }
  return std::nullopt;
}

}  // namespace orv::json
