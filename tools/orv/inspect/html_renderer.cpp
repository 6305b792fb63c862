#include <algorithm>

#include <orv/byte_view.hpp>
#include <orv/spelling/hex.hpp>
#include <orv/spelling/value_text.hpp>
#include "tools/orv/input/frame_reader.hpp"
#include "tools/orv/inspect/renderers.hpp"

namespace orv::tool {

namespace {

// What comes from outside goes into the page through this alone.
std::string inHtml(std::string_view text) {
  std::string output;
  for (const char c : text) {
    switch (c) {
      case '&': output += "&amp;"; break;
      case '<': output += "&lt;"; break;
      case '>': output += "&gt;"; break;
      case '"': output += "&quot;"; break;
      case '\'': output += "&#39;"; break;
      default: output += c;
    }
  }
  return output;
}

std::string named(std::string_view path) { return inHtml(spelling::printable(path)); }

// Sets the rows of a hexadecimal dump, with the characters beside them. Each piece of a row says which field it
// belongs to.
class DumpRows {
 public:
  void add(std::span<const std::byte> bytes, std::uint64_t offset, std::size_t field,
           std::string_view style) {
    constexpr std::size_t most = 1024;
    const auto shown = bytes.size() <= 2 * most ? bytes : bytes.first(most);
    for (std::size_t at = 0; at < shown.size();) {
      if (column_ == 0) rowOffset_ = offset + at;
      const std::size_t count = std::min(shown.size() - at, halfRow - column_ % halfRow);
      addPiece(shown.subspan(at, count),
               " data-f=\"" + std::to_string(field) + "\" class=\"" + std::string(style) + "\">");
      at += count;
    }
    if (shown.size() == bytes.size()) return;
    endRow();
    rows_ += "<em>… ";
    appendByteCount(bytes.size() - shown.size(), rows_);
    rows_ += " more</em>\n";
  }

  std::string take() {
    endRow();
    return std::exchange(rows_, {});
  }

 private:
  static constexpr std::size_t halfRow = 8;

  void addPiece(std::span<const std::byte> bytes, const std::string& attributes) {
    if (column_ != 0) digits_ += column_ == halfRow ? "  " : " ";
    digits_ += "<i" + attributes;
    spelling::appendHex(charactersOf(bytes), digits_, " ");
    digits_ += "</i>";
    std::string characters(charactersOf(bytes));
    std::ranges::replace_if(
        characters, [](char c) { return c < 0x20 || c > 0x7E; }, '.');
    characters_ += "<b" + attributes + inHtml(characters) + "</b>";
    column_ += bytes.size();
    if (column_ == 2 * halfRow) endRow();
  }

  void endRow() {
    if (column_ == 0) return;
    const std::size_t missing = 2 * halfRow - column_;
    rows_ += "<span>" + spelling::hexNumber(rowOffset_, 4) + "</span>  " + digits_;
    rows_.append(3 * missing + (column_ <= halfRow ? 1 : 0) + 3, ' ');
    rows_ += characters_ + '\n';
    digits_.clear();
    characters_.clear();
    column_ = 0;
  }

  std::string rows_;
  std::string digits_;  // of the row that is being set
  std::string characters_;
  std::size_t column_ = 0;
  std::uint64_t rowOffset_ = 0;
};

class HtmlRenderer final : public Renderer {
 public:
  HtmlRenderer(const Options& options, std::string& output) : Renderer(output), options_(options) {
    std::string title;
    for (const std::string& path : options.files) title += (title.empty() ? "" : ", ") + named(path);
    copyPageUpTo("{{title}}");
    output_ += title;
    copyPageUpTo("{{title}}");
    output_ += title;
    copyPageUpTo("{{messages}}");
  }

  void beginMessage(const ExplainedMessage& message) override {
    message_ = &message;
    output_ += "<section>\n<header><h2>";
    if (options_.files.size() > 1) output_ += named(message.path) + ": ";
    if (message.number != 0) output_ += "message " + std::to_string(message.number) + ": ";
    output_.append(message.type.fullName()).append("</h2> <span>");
    appendByteCount(message.bytes.size(), output_);
    if (message.number != 0) output_ += " at byte " + std::to_string(message.offset);
    output_ += "</span></header>\n<div class=\"panes\">\n";
  }

  void record(const ExplainedRecord& explained) override {
    const TracedRecord& record = explained.record;
    const std::string_view kind = explained.kind();
    const std::string_view style = !record.type ? "unknown" : explained.message != nullptr ? "message" : kind;
    dump_.add(record.header, explained.offset, fields_, "h");
    dump_.add(explained.shownValue(), explained.offset + record.header.size(), fields_, style);
    std::string path(record.path);
    std::string state = explained.message != nullptr ? " opened" : "";
    if (record.isAbsent()) {
      state = " absent";
    } else {
      path += " · byte " + std::to_string(explained.offset) + " · ";
      appendByteCount(record.header.size() + record.value.size(), path);
    }
    value_.clear();
    explained.appendValue(value_);
    constexpr std::size_t deepest = 6;
    startField(explained.level, "l" + std::to_string(std::min(explained.level, deepest)) + state, path);
    tree_.append("<span>").append(record.path.substr(record.path.rfind('.') + 1)).append("</span><span>");
    tree_.append(kind).append("</span><span class=\"").append(style).append("\">");
    tree_ += inHtml(value_) + "</span></div>\n";
    level_ = explained.level;
  }

  void error(const ExplainedError& error) override {
    dump_.add(error.rest.first(error.good), error.offset, fields_, "h");
    dump_.add(error.rest.subspan(error.good), error.offset + error.good, fields_, "bad");
    startField(level_, "bad", "error");
    tree_ += inHtml(error.text) + "</div>\n";
  }

  void endMessage() override {
    output_ += "<pre class=\"dump\">" + dump_.take() + "</pre>\n<div class=\"tree\" role=\"tree\">\n";
    output_ += std::exchange(tree_, {}) + "</div>\n</div>\n</section>\n";
  }

  void endFile(std::string_view failure) override {
    output_ += "<p class=\"ends bad\">" + named(failure) + "</p>\n";
  }

  void finish() override {
    copyPageUpTo("{{version}}");
    output_ += ORV_VERSION;
    copyPageUpTo({});
  }

 private:
  // Without the place itself; to the end without one.
  void copyPageUpTo(std::string_view place) {
    const std::size_t end = place.empty() ? page_.size() : page_.find(place);
    output_ += page_.substr(0, end);
    page_.remove_prefix(end + place.size());
  }

  void startField(std::size_t level, const std::string& style, const std::string& status) {
    tree_ += R"(<div role="treeitem" tabindex="-1" aria-level=")" + std::to_string(level + 1) +
             R"(" data-f=")" + std::to_string(fields_++) + R"(" class=")" + style + R"(" data-s=")" +
             inHtml(status) + "\">";
  }

  const Options& options_;
  std::string_view page_ = page();  // what is not yet copied
  const ExplainedMessage* message_ = nullptr;
  DumpRows dump_;
  std::string tree_;
  std::string value_;
  std::size_t fields_ = 0;  // on the page so far
  std::size_t level_ = 0;   // of the last field
};

}  // namespace

std::unique_ptr<Renderer> makeHtmlRenderer(const Options& options, std::string& output) {
  return std::make_unique<HtmlRenderer>(options, output);
}

}  // namespace orv::tool
