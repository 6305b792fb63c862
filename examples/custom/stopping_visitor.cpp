// A visitor that stops: it looks for a text anywhere in a message and ends the walk where it finds it. What a
// visitor calls an error need not be one; it is whatever ends the walk, and traverse's caller gets it.
#include <cstdint>
#include <cstdio>
#include <expected>
#include <string>
#include <utility>
#include <vector>

#include <orv/group.hpp>
#include <orv/name_map.hpp>
#include <orv/visitor.hpp>

namespace {

class TextFinder {
 public:
  struct Found {
    std::string path;
  };
  using Error = Found;
  using Result = std::expected<void, Found>;

  // `names` are those of the message that is to be walked.
  TextFinder(orv::Text wanted, orv::NameMap names) : wanted_(std::move(wanted)), names_(names) {}

  int visits() const { return visits_; }

  // Texts are compared by canonical equivalence, like everywhere.
  Result visitSingularStringField(const orv::Text& value, std::uint32_t number) {
    ++visits_;
    if (value == wanted_) return std::unexpected(Found{path_ + nameOf(number)});
    return {};
  }
  Result visitRepeatedStringField(const std::vector<orv::Text>& texts, std::uint32_t number) {
    for (const orv::Text& text : texts) {
      if (auto visited = visitSingularStringField(text, number); !visited) return visited;
    }
    return {};
  }

  // A visitor walks nested messages itself, or passes over them.
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    ++visits_;
    return walkInto(message, nameOf(number) + ".");
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    ++visits_;
    for (std::size_t at = 0; at < messages.size(); ++at) {
      const std::string step = nameOf(number) + "[" + std::to_string(at) + "].";
      if (auto visited = walkInto(messages[at], step); !visited) return visited;
    }
    return {};
  }

  Result visitSingularBytesField(const orv::ByteBuffer&, std::uint32_t) { return passOver(); }
  Result visitSingularBoolField(bool, std::uint32_t) { return passOver(); }
  Result visitSingularUInt32Field(std::uint32_t, std::uint32_t) { return passOver(); }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration&, std::uint32_t) {
    return passOver();
  }
  Result visitUnknownFields(const orv::UnknownStorage&) { return passOver(); }

 private:
  Result passOver() {
    ++visits_;
    return {};
  }

  std::string nameOf(std::uint32_t number) const { return std::string(*names_.name(number)); }

  template <class M>
  Result walkInto(const M& message, const std::string& step) {
    const std::string outerPath = std::exchange(path_, path_ + step);
    const orv::NameMap outerNames = std::exchange(names_, M::_protobuf_nameMap());
    auto walked = message.traverse(*this);
    path_ = outerPath;
    names_ = outerNames;
    return walked;
  }

  orv::Text wanted_;
  orv::NameMap names_;
  std::string path_;
  int visits_ = 0;
};
static_assert(orv::Visitor<TextFinder>);

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
    TextFinder finder(wanted, orv::Group::_protobuf_nameMap());
    const auto walked = group.traverse(finder);
    std::printf("%s: %s after %d visits\n", wanted, walked ? "nowhere" : walked.error().path.c_str(),
                finder.visits());
  }
}
