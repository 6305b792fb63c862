// Builds a document from the events of nlohmann-json's parser. Only document.cpp and document_builder.cpp
// include this.
#pragma once

#include <cstddef>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include <orv/json/error.hpp>

namespace orv::json {

// Members in the document's order.
using Node = nlohmann::ordered_json;

// Receives the parser's events. The library's own builder would keep one of two members of the same name;
// this refuses them, and nesting that is too deep, while the text is read.
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
  bool key(std::string& name) override;
  bool end_object() override { return close(); }
  bool start_array(std::size_t) override { return open(Node::array()); }
  bool end_array() override { return close(); }
  bool parse_error(std::size_t position, const std::string& token,
                   const nlohmann::detail::exception& cause) override;

 private:
  // An object or a list that is not at its end yet.
  struct Open {
    Node* node;
    std::string memberName;
    std::unordered_set<std::string> names;
  };

  Node* add(Node value);
  bool open(Node empty);
  bool close();
  std::string path() const;

  std::string_view text_;
  Node root_;
  std::vector<Open> open_;
  std::optional<Error> error_;
};

}  // namespace orv::json
