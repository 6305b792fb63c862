// A conversation as a coroutine: it waits for the next message without a thread, and whoever has bytes for it
// wakes it up.
#include <coroutine>
#include <iostream>
#include <optional>
#include <string>
#include <utility>

#include <orv/delimited_parser.hpp>
#include <orv/delimited_writer.hpp>
#include <orv/member.hpp>

namespace {

// One that starts at once and whose frame lives until it is done.
struct Conversation {
  struct promise_type {
    Conversation get_return_object() { return {}; }
    std::suspend_never initial_suspend() noexcept { return {}; }
    std::suspend_never final_suspend() noexcept { return {}; }
    void return_void() {}
    void unhandled_exception() { throw; }
  };
};

// The receiving end: co_await gives the next message, or none at the end of the stream.
template <class M>
class Inbox {
 public:
  void push(orv::ByteView bytes) {
    parser_.push(bytes);
    wake();
  }
  void close() {
    isClosed_ = true;
    wake();
  }

  bool await_ready() {
    auto message = parser_.read<M>();
    if (!message) std::cout << message.error() << '\n';
    next_ = message ? std::move(*message) : std::nullopt;
    return next_.has_value() || isClosed_ || !message;
  }
  void await_suspend(std::coroutine_handle<> waiting) { waiting_ = waiting; }
  std::optional<M> await_resume() { return std::exchange(next_, std::nullopt); }

 private:
  void wake() {
    if (waiting_ && await_ready()) std::exchange(waiting_, nullptr).resume();
  }

  orv::DelimitedParser parser_;
  bool isClosed_ = false;
  std::optional<M> next_;
  std::coroutine_handle<> waiting_;
};

Conversation greet(Inbox<orv::Member>& inbox) {
  while (const auto member = co_await inbox) std::cout << "Hello, " << member->handle() << "!\n";
  std::cout << "Goodbye.\n";
}

}  // namespace

int main() {
  std::string stream;
  for (const char* const handle : {"anna", "ben"}) {
    orv::Member member;
    member.setHandle(handle);
    if (!appendDelimited(member, stream)) return 1;
  }
  Inbox<orv::Member> inbox;
  greet(inbox);
  for (const char byte : stream) {
    std::cout << '.';
    inbox.push(std::string(1, byte));
  }
  inbox.close();
}
