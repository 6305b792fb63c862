#include <orv/json/document.hpp>

#include <array>
#include <cassert>
#include <cmath>
#include <limits>
#include <utility>

#include "document_builder.hpp"

namespace orv::json {

namespace {

// In the order of Value::Kind.
constexpr std::array<std::string_view, 6> kindNames{"null",     "a boolean", "a number",
                                                    "a string", "a list",    "an object"};

const Node& nodeAt(const void* node) { return *static_cast<const Node*>(node); }

}  // namespace

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
