// A visitor that stops: it looks for a text anywhere in a message and ends the walk where it finds it. What a
// visitor calls an error need not be one; it is whatever ends the walk, and traverse's caller gets it.
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <expected>
#include <string>
#include <utility>
#include <vector>

#include <orv/any_value_visitor.hpp>
#include <orv/group.hpp>

namespace {

struct Found {
  std::string path;
};

class TextFinder : public orv::AnyValueVisitor<TextFinder, Found> {
 public:
  explicit TextFinder(orv::Text wanted) : wanted_(std::move(wanted)) {}

  int texts() const { return texts_; }

  // Texts are compared by canonical equivalence, like everywhere.
  template <class T>
  Result visitAnyValue(const T& value, std::uint32_t number) {
    if constexpr (std::same_as<T, orv::Text>) {
      ++texts_;
      if (value == wanted_) return std::unexpected(Found{path_ + fieldName(number)});
    }
    return {};
  }

  // The base walks nested messages by itself; this one keeps the path while it does.
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    return walkInto(message, fieldName(number) + ".");
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (std::size_t at = 0; at < messages.size(); ++at) {
      const std::string step = fieldName(number) + "[" + std::to_string(at) + "].";
      if (auto visited = walkInto(messages[at], step); !visited) return visited;
    }
    return {};
  }

 private:
  template <class M>
  Result walkInto(const M& message, const std::string& step) {
    const std::string outerPath = std::exchange(path_, path_ + step);
    auto walked = walkNested(message);
    path_ = outerPath;
    return walked;
  }

  orv::Text wanted_;
  std::string path_;
  int texts_ = 0;
};

orv::Group groupOf(const std::vector<std::string>& handles) {
  orv::Group group;
  for (const std::string& handle : handles) {
    group.mutableInitialize().mutableMembers().emplace_back().setHandle(handle);
  }
  return group;
}

}  // namespace

int main() {
  // The name is spelled with one code point in the message and looked for with two.
  const orv::Group group = groupOf({"living-room@home", "zo\u00EB@phone", "anna@tablet"});
  for (const char* const wanted : {"zoe\u0308@phone", "mallory@tablet"}) {
    TextFinder finder(wanted);
    const auto walked = group.traverse(finder);
    std::printf("%s: %s after %d texts\n", wanted, walked ? "nowhere" : walked.error().path.c_str(),
                finder.texts());
  }
}
