// The forms that explanations are shown in.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>

#include "tools/orv/inspect/explanation.hpp"

namespace orv::tool {

// An annotated dump, as wide as the terminal.
std::unique_ptr<Renderer> makeTextRenderer(const Options& options, std::string& output);
// A document for each message, for scripts.
std::unique_ptr<Renderer> makeJsonRenderer(const Options& options, std::string& output);
// One page that stands alone.
std::unique_ptr<Renderer> makeHtmlRenderer(const Options& options, std::string& output);

// page.html, as it was when the command was built, with "{{…}}" for what is put into it, in this order: the title,
// twice, the messages, the version.
std::string_view page();

// "1 byte", "2 bytes"
void appendByteCount(std::size_t count, std::string& output);

}  // namespace orv::tool
