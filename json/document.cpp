#include <orv/json/document.hpp>

#include <algorithm>
#include <array>
#include <cassert>
#include <cmath>
#include <limits>
#include <nlohmann/json.hpp>
#include <span>
#include <unordered_set>
#include <utility>
#include <vector>

#include <orv/spelling/text_position.hpp>

namespace orv::inline v0::json {

namespace {

constexpr std::size_t longestName = 60;

bool isPlain(std::string_view name) {
  return !name.empty() && name.size() <= longestName && std::ranges::all_of(name, [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
  });
}

// Members in the document's order.
using Node = nlohmann::ordered_json;

// Phrases of the library's sentences, and what is said in their place.
struct Phrase {
  std::string_view library;
  std::string_view ours;
};

// What is wrong with a word, a number or a string.
constexpr Phrase mistakes[] = {
    {"number overflow", "a number too large for a double"},
    {"invalid number", "no number"},
    {"ill-formed UTF-8", "ill-formed UTF-8"},
    {"missing closing quote", "a string without its closing quotation mark"},
    {"control character", "a control character in a string, which must be escaped"},
    {"surrogate", "half a surrogate pair"},
    {"'\\u' must be", "\\u without its four hexadecimal digits"},
    {"forbidden character after backslash", "an escape that JSON does not have"},
};

// What the parser was at. What stands there is of another kind.
constexpr Phrase expectations[] = {
    {"; expected end of input", "expected the end"},
    {"parsing object key", "expected a name in quotation marks"},
    {"parsing object separator", R"(expected ":")"},
    {"parsing object", R"(expected "," or "}")"},
    {"parsing array", R"(expected "," or "]")"},
    {"parsing value", "expected a value"},
};

constexpr Phrase findings[] = {
    {"unexpected end of input", "the end"}, {"unexpected string", "a string"},
    {"unexpected number", "a number"},      {"unexpected true", "true"},
    {"unexpected false", "false"},          {"unexpected null", "null"},
    {"invalid literal", "another word"},
};

std::optional<std::string> find(std::span<const Phrase> phrases, std::string_view sentence) {
  const auto isIn = [&](const Phrase& phrase) {
    return sentence.find(phrase.library) != std::string_view::npos;
  };
  const auto found = std::ranges::find_if(phrases, isIn);
  return found == phrases.end() ? std::nullopt : std::optional(std::string(found->ours));
}

// The reason in our words: the library's sentence repeats what it read, however long that is. `at` is the
// character at which the text goes wrong.
std::string reasonOf(std::string_view sentence, char at) {
  constexpr std::size_t longest = 200;  // what is repeated comes behind
  sentence = sentence.substr(0, longest);
  if (at == '\0') return "a NUL character";
  if (const auto mistake = find(mistakes, sentence)) return *mistake;
  const std::string found = find(findings, sentence).value_or(std::string("\"") + at + '"');
  return find(expectations, sentence).value_or("expected JSON") + ", found " + found;
}

}  // namespace

struct Document::Contents {
  Contents() = default;
  Contents(const Contents&) = delete;
  Contents& operator=(const Contents&) = delete;
  ~Contents() { empty(root); }

  // The library's own destructor allocates, for what a list or an object holds, and memory may have run out.
  // Values are nested no deeper than maximumNesting.
  static void empty(Node& node) noexcept {
    if (node.is_array()) {
      auto& items = node.get_ref<Node::array_t&>();
      for (Node& item : items) empty(item);
      items.clear();
    } else if (node.is_object()) {
      auto& members = node.get_ref<Node::object_t&>();
      for (auto& [name, value] : members) empty(value);
      members.clear();
    }
  }

  Node root;
};

namespace {

// Builds a document from the parser's events. The library's own builder would keep one of two members of the
// same name; this refuses them, and nesting that is too deep, while the text is read.
class DocumentBuilder final : public nlohmann::json_sax<Node> {
 public:
  // The document becomes `root`, which is null before.
  DocumentBuilder(std::string_view text, Node& root, const DecodeLimits& limits)
      : text_(text), root_(root), limits_(limits) {}

  // What ended the parsing early.
  const std::optional<Error>& error() const { return error_; }

  bool null() override { return add(nullptr) != nullptr; }
  bool boolean(bool value) override { return add(value) != nullptr; }
  bool number_integer(std::int64_t value) override { return add(value) != nullptr; }
  bool number_unsigned(std::uint64_t value) override { return add(value) != nullptr; }
  bool number_float(double value, const std::string&) override { return add(value) != nullptr; }
  bool string(std::string& value) override { return add(std::move(value)) != nullptr; }
  bool binary(Node::binary_t&) override { return false; }  // not covered: JSON has no such values
  bool start_object(std::size_t) override { return open(Node::object()); }
  bool end_object() override { return close(); }
  bool start_array(std::size_t) override { return open(Node::array()); }
  bool end_array() override { return close(); }
  bool key(std::string& name) override {
    Open& innermost = open_.back();
    innermost.memberName = name;
    if (innermost.names.insert(std::move(name)).second) return true;
    return fail("the object has this member twice");
  }
  // The position counts the bytes that were read, the offending one included.
  bool parse_error(std::size_t position, const std::string& token,
                   const nlohmann::detail::exception& cause) override {
    constexpr int numberOverflow = 406;
    const std::size_t length = cause.id == numberOverflow ? token.size() : 1;
    const std::size_t at = position - length;
    return failAt(at, reasonOf(cause.what(), at < text_.size() ? text_[at] : ' '));
  }

  // About the text; answers false.
  bool failAt(std::size_t offset, std::string reason) {
    spelling::TextPosition place;
    for (const char character : text_.substr(0, offset)) place.advance(character);
    const spelling::TextError error = place.error(std::move(reason));
    error_ = Error{.reason = error.reason, .path = {}, .line = error.line, .column = error.column};
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
    if (valueCount_++ == limits_.listElements) {
      fail("more values than the limit of " + std::to_string(limits_.listElements) + " allows");
      return nullptr;
    }
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
    const auto mostNesting = std::min<std::size_t>(limits_.nesting, Document::maximumNesting);
    if (open_.size() == mostNesting) return fail("nested deeper than " + std::to_string(mostNesting));
    Node* const added = add(std::move(empty));
    if (added != nullptr) open_.push_back({added, {}, {}});
    return added != nullptr;
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
    constexpr std::size_t longestPath = 4 * longestName;
    if (path.size() > longestPath)
      path.replace(1, spelling::characterStart(path, path.size() - longestPath) - 1, "…");
    error_ = Error{.reason = std::move(reason), .path = std::move(path)};
    return false;
  }

  std::string_view text_;
  Node& root_;
  const DecodeLimits& limits_;
  std::size_t valueCount_ = 0;
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

Document::Document(std::unique_ptr<Contents> contents) : contents_(std::move(contents)) {}
Document::Document(Document&&) noexcept = default;
Document& Document::operator=(Document&&) noexcept = default;
Document::~Document() = default;

Value Document::root() const { return Value(&contents_->root); }

std::expected<Document, Error> Document::parse(std::string_view text, const DecodeLimits& limits) {
  if (text.size() > limits.inputBytes) {
    return std::unexpected(Error{
        .reason = "more bytes of input than the limit of " + std::to_string(limits.inputBytes) + " allows",
        .path = "$"});
  }
  auto contents = std::make_unique<Contents>();
  DocumentBuilder builder(text, contents->root, limits);
  Node::sax_parse(text.begin(), text.end(), &builder);
  // The library takes a NUL for the end.
  if (const auto nul = text.find('\0'); nul != std::string_view::npos && !builder.error().has_value())
    builder.failAt(nul, reasonOf({}, '\0'));
  if (builder.error().has_value()) return std::unexpected(*builder.error());
  return Document(std::move(contents));
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
