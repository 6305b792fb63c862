// The rule by which a message is replaced by one that is read, in the memory of what it holds.
#pragma once

#include <array>
#include <cstddef>
#include <type_traits>
#include <variant>

#include <orv/field.hpp>
#include <orv/internal/field_reader.hpp>
#include <orv/internal/rules.hpp>

namespace orv::inline v0::internal {

// Reads a message of any type in place of one: what a reader is given to read a nested message by.
struct Replace {
  template <class M>
  [[gnu::always_inline]] Step operator()(M& message, FieldReader& reader) const {
    return M::replaceMessage(message, reader);
  }
};

// What decodeMessage does to a default message, in the memory of what this one holds. The first occurrence of
// a field takes its old value's place, and those of a list the places of its old elements; old values that
// nothing took the place of are removed in the end.
template <class Table, class M>
class Replacing {
 public:
  explicit Replacing(M& message) : message_(message) {}

  [[gnu::always_inline]] Step read(FieldReader& reader) {
    const Step result = readFields<Table>(
        message_, reader, [&]<std::size_t index>(FieldReader & at) __attribute__((always_inline)) {
          return readRow<index>(at);
        });
    Table::forEachIndex([&]<std::size_t index>() { removeUnread<index>(); });
    return result;
  }

 private:
  template <std::size_t index>
  [[gnu::always_inline]] Step readRow(FieldReader& reader) {
    auto& storage = Table::template storage<index>(message_);
    constexpr FieldKind kind = StorageTraits<typename Table::template Storage<index>>::kind;
    std::size_t& countRead = countsRead_[Table::template firstRow<index>];
    Step result;
    if constexpr (kind == FieldKind::repeated) {
      result = readElement(reader, storage, countRead);
    } else if constexpr (kind == FieldKind::oneofMember) {
      result =
          countRead == 0 ? replaceCase<index>(reader, storage) : decodeRow<Table, index>(message_, reader);
    } else if constexpr (kind == FieldKind::singularMessage) {
      const bool isReplacing = countRead == 0 && storage.has_value() && reader.isAtLengthDelimited();
      result = isReplacing ? reader.readMessageBy(*storage, reader.mode(), Replace())
                           : decodeRow<Table, index>(message_, reader);
    } else {
      result = decodeRow<Table, index>(message_, reader);
    }
    if (result && reader.hasTakenField()) ++countRead;
    return result;
  }

  template <class Element>
  [[gnu::always_inline]] Step readElement(FieldReader& reader, std::vector<Element>& list,
                                          std::size_t countRead) {
    if (countRead >= list.size()) return decodeField(reader, list);
    if constexpr (std::is_same_v<Element, Text>) {
      return reader.decodeSingularStringField(list[countRead]);
    } else {
      if (!reader.isAtLengthDelimited()) return {};
      return reader.readMessageBy(list[countRead], reader.mode(), Replace());
    }
  }

  template <std::size_t index, class Group>
  [[gnu::always_inline]] Step replaceCase(FieldReader& reader, Group& group) {
    using Case = typename Table::template Case<index>;
    if (!reader.isAtLengthDelimited()) return {};
    if (group.has_value()) {
      if (Case* const held = std::get_if<Case>(&*group))
        return reader.readMessageBy(*held, reader.mode(), Replace());
      group.reset();
    }
    return reader.template decodeCase<Case>(group);
  }

  template <std::size_t index>
  [[gnu::always_inline]] void removeUnread() {
    if constexpr (Table::template isFirstRow<index>) {
      auto& storage = Table::template storage<index>(message_);
      using Storage = typename Table::template Storage<index>;
      const std::size_t countRead = countsRead_[index];
      if constexpr (StorageTraits<Storage>::kind == FieldKind::repeated) {
        if (countRead < storage.size())
          storage.erase(storage.begin() + static_cast<std::ptrdiff_t>(countRead), storage.end());
      } else if (countRead == 0) {
        if constexpr (requires { storage.reset(); })
          storage.reset();
        else
          storage = Storage();
      }
    }
  }

  M& message_;
  // Of each storage, at the index of its first row: how many occurrences were taken.
  std::array<std::size_t, Table::size> countsRead_{};
};

}  // namespace orv::internal
