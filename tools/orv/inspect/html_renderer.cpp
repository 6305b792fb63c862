#include "tools/orv/inspect/renderers.hpp"
namespace orv::tool {
std::unique_ptr<Renderer> makeHtmlRenderer(const Options& options) { return makeTextRenderer(options); }
}  // namespace orv::tool
