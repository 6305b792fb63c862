// Everything prints, errors too; and what is for logs leaves out what nobody should read there.
#include <exception>
#include <iostream>

#include <orv/member.hpp>
#include <orv/session_message.hpp>

int main() {
  orv::Member member;
  member.setHandle("anna@tablet");
  member.setTokenID("token-1");
  std::cout << member << '\n' << member.handle() << '\n';

  // Tokens, keys and sealed bytes are marked in the tables of their messages, and whatever is in a field that
  // the program does not know may be one.
  std::cout << member.redactedDescription() << '\n';

  orv::SessionMessage envelope;
  envelope.setType(orv::VessaSessionMessageType::groupMessage);
  envelope.setData("\x0a\x00");
  std::cout << envelope.type() << " carries " << envelope.data() << '\n';

  const auto cut = orv::Member::parse("\x0a\x05");
  std::cout << cut.error() << '\n' << cut.error().cause << '\n';
  try {
    std::cout << cut.value() << '\n';
  } catch (const std::exception& exception) {
    std::cout << "caught: " << exception.what() << '\n';
  }
}
