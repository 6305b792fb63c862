// The forms that explanations are shown in.
#pragma once

#include <cstddef>
#include <memory>
#include <string>

#include "tools/orv/inspect/explanation.hpp"

namespace orv::tool {

// An annotated dump, as wide as the terminal.
std::unique_ptr<Renderer> makeTextRenderer(const Options& options);
// A document for each message, for scripts.
std::unique_ptr<Renderer> makeJsonRenderer(const Options& options);
// One page that stands alone.
std::unique_ptr<Renderer> makeHtmlRenderer(const Options& options);

// "1 byte", "2 bytes"
void appendByteCount(std::size_t count, std::string& output);

}  // namespace orv::tool
