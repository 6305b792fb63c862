// Messages with what none of the protocol's has: oneofs in nested messages, in lists and in oneofs, lists behind
// them, and numbers of two bytes. The schema is nested_messages.proto.
#pragma once

#include <optional>
#include <utility>
#include <variant>
#include <vector>

#include <orv/all_messages.hpp>
#include <orv/message.hpp>

namespace orv::test {

class Wrapper final : public Message<Wrapper> {
 public:
  static constexpr std::string_view protoMessageName = "test.Wrapper";

  Wrapper() noexcept {}
  Wrapper(const Wrapper&) = default;
  Wrapper(Wrapper&&) noexcept = default;
  Wrapper& operator=(const Wrapper& other) { return assign(other); }
  Wrapper& operator=(Wrapper&& other) noexcept { return assign(std::move(other)); }

 private:
  friend Message;
  std::optional<Group> group_;
  std::vector<Group> groups_;
  Text name_;

  static constexpr std::tuple fields{
      field<&Wrapper::group_>(1, "group"),
      field<&Wrapper::groups_>(2, "groups"),
      field<&Wrapper::name_>(2047, "name"),
  };
};

class Folder final : public Message<Folder> {
 public:
  static constexpr std::string_view protoMessageName = "test.Folder";

  Folder() noexcept {}
  Folder(const Folder&) = default;
  Folder(Folder&&) noexcept = default;
  Folder& operator=(const Folder& other) { return assign(other); }
  Folder& operator=(Folder&& other) noexcept { return assign(std::move(other)); }

 private:
  friend Message;
  using Content = std::variant<Wrapper, JoinResponse::Content>;
  bool isOpen_ = false;
  std::optional<Content> content_;
  std::vector<Wrapper> wrappers_;
  std::optional<JoinResponse::Content> answer_;
  std::vector<Text> names_;
  std::optional<std::uint32_t> count_;
  std::optional<VessaSessionMessageType> type_;

  static constexpr std::tuple fields{
      field<&Folder::isOpen_>(1, "isOpen"),
      field<&Folder::content_, Wrapper>(2, "wrapper"),
      field<&Folder::content_, JoinResponse::Content>(3, "response"),
      field<&Folder::wrappers_>(5, "wrappers"),
      field<&Folder::answer_>(14, "answer"),
      field<&Folder::names_>(16, "names"),
      field<&Folder::count_>(100, "count"),
      field<&Folder::type_>(536870911, "type"),
  };
};

namespace internal {
template <class... Types>
TypeList<Types..., Wrapper, Folder> withNested(TypeList<Types...>);
}  // namespace internal

// All messages, and these.
using TestedMessages = decltype(internal::withNested(AllMessages()));

}  // namespace orv::test
