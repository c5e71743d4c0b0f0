// TerminalNavigator: moving through the display tree one level at a time, and the text of that level cut to the terminal.
#include "Monitor/TerminalNavigator.h"

#include "Platform/TerminalText.h"

#include <algorithm>

namespace vantorel {

namespace {

// Code points that take two columns (CJK, Hangul, full-width forms, emoji) and
// combining marks that take none; every other character takes one.
int codePointColumns(char32_t c) {
    if ((c >= 0x300 && c <= 0x36f) || (c >= 0x200b && c <= 0x200f) || (c >= 0xfe00 && c <= 0xfe0f)) return 0;
    if ((c >= 0x1100 && c <= 0x115f) || (c >= 0x2e80 && c <= 0xa4cf) || (c >= 0xac00 && c <= 0xd7a3) ||
        (c >= 0xf900 && c <= 0xfaff) || (c >= 0xfe30 && c <= 0xfe4f) || (c >= 0xff00 && c <= 0xff60) ||
        (c >= 0xffe0 && c <= 0xffe6) || (c >= 0x1f300 && c <= 0x1f64f) || (c >= 0x1f900 && c <= 0x1f9ff) ||
        (c >= 0x20000 && c <= 0x3fffd))
        return 2;
    return 1;
}

// The character at `i`: its length in bytes and its columns (a stray byte is one of each).
std::pair<size_t, int> character(const std::string& text, size_t i) {
    const auto lead = static_cast<unsigned char>(text[i]);
    const size_t length = lead < 0x80 ? 1 : (lead >> 5) == 0x6 ? 2 : (lead >> 4) == 0xe ? 3 : (lead >> 3) == 0x1e ? 4 : 1;
    if (length == 1 || i + length > text.size()) return {1, 1};
    char32_t c = lead & (0x7f >> length);
    for (size_t k = 1; k < length; ++k) {
        const auto b = static_cast<unsigned char>(text[i + k]);
        if ((b & 0xc0) != 0x80) return {1, 1};
        c = (c << 6) | (b & 0x3f);
    }
    return {length, codePointColumns(c)};
}

// A row that drills down, in one line: the values of a level that holds only values
// ("UARFCN 10096 | Cell ID 120", "13 16 13" for a list), else how many rows it has.
std::string summary(const VantorelModelNode& node) {
    const auto& children = *node.childNodes();
    if (children.empty()) return "(empty)";
    const bool list = children[0]->displayName() == "0";
    std::string line;
    for (const NodeRef& c : children) {
        if (!c->value()) return "(" + std::to_string(children.size()) + (children.size() == 1 ? " row)" : " rows)");
        if (!line.empty()) line += list ? " " : " | ";
        if (!list) line += TerminalText::visible(c->displayName()) + " ";
        line += TerminalText::visible(*c->value());
        if (line.size() > 1024) break;  // far wider than any terminal
    }
    return line;
}

std::string rowText(const VantorelModelNode& row) {
    std::string text = TerminalText::visible(row.displayName());
    if (const std::string* value = row.value()) return text + ": " + TerminalText::visible(*value);
    if (row.childNodes()->empty()) return text + " (empty)";
    return text + " > " + summary(row);
}

}  // namespace

int TerminalNavigator::columns(const std::string& text) {
    int total = 0;
    for (size_t i = 0; i < text.size();) {
        const auto [length, width] = character(text, i);
        total += width;
        i += length;
    }
    return total;
}

std::string TerminalNavigator::cut(const std::string& text, int width) {
    if (width <= 0) return "";
    if (columns(text) <= width) return text;
    int used = 0;
    size_t i = 0;
    while (i < text.size()) {
        const auto [length, w] = character(text, i);
        if (used + w > width - 1) break;
        used += w;
        i += length;
    }
    return text.substr(0, i) + "…";
}

const std::vector<NodeRef>* TerminalNavigator::rows() const {
    return level_ ? level_->childNodes() : nullptr;
}

std::string TerminalNavigator::cursorName() const {
    const auto* r = rows();
    return r && cursor_ < r->size() ? (*r)[cursor_]->displayName() : "";
}

void TerminalNavigator::place(size_t index) {
    const auto* r = rows();
    cursor_ = r && !r->empty() ? std::min(index, r->size() - 1) : 0;
    cursorName_ = cursorName();
}

void TerminalNavigator::setRoot(NodeRef root) {
    root_ = std::move(root);
    level_ = root_;
    for (size_t depth = 0; depth < path_.size() && level_; ++depth) {
        const auto* children = level_->childNodes();
        auto it = children ? std::find_if(children->begin(), children->end(),
                                          [&](const NodeRef& c) { return c->displayName() == path_[depth]; })
                           : std::vector<NodeRef>::const_iterator{};
        if (!children || it == children->end() || !(*it)->childNodes()) {
            // The level is gone: show the deepest one left, the cursor on the way down.
            cursorName_ = path_[depth];
            path_.resize(depth);
            break;
        }
        level_ = *it;
    }
    const auto* r = rows();
    if (!r) return place(0);
    auto it = std::find_if(r->begin(), r->end(), [&](const NodeRef& c) { return c->displayName() == cursorName_; });
    if (it != r->end()) cursor_ = static_cast<size_t>(it - r->begin());
    place(cursor_);
}

bool TerminalNavigator::handle(TerminalKeys::Key key, int rowsShown) {
    using Key = TerminalKeys::Key;
    const auto* r = rows();
    const size_t count = r ? r->size() : 0;
    const size_t page = static_cast<size_t>(std::max(1, rowsShown));
    switch (key) {
    case Key::Quit: return false;
    case Key::Up: place(cursor_ > 0 ? cursor_ - 1 : 0); break;
    case Key::Down: place(cursor_ + 1); break;
    case Key::PageUp:
        place(cursor_ > page ? cursor_ - page : 0);
        top_ = top_ > page ? top_ - page : 0;
        break;
    case Key::PageDown:
        place(cursor_ + page);
        top_ += page;
        break;
    case Key::Home: place(0); break;
    case Key::End: place(count ? count - 1 : 0); break;
    case Key::Enter:
        if (cursor_ < count && (*r)[cursor_]->childNodes() && !(*r)[cursor_]->childNodes()->empty()) {
            path_.push_back((*r)[cursor_]->displayName());
            level_ = (*r)[cursor_];
            top_ = 0;
            place(0);
        }
        return true;
    case Key::Back:
        if (!path_.empty()) {
            const std::string from = path_.back();
            path_.pop_back();
            cursorName_ = from;
            top_ = 0;
            setRoot(root_);
        }
        return true;
    }
    // Keep the cursor row on the page.
    if (cursor_ < top_) top_ = cursor_;
    if (cursor_ >= top_ + page) top_ = cursor_ + 1 - page;
    if (count > page && top_ > count - page) top_ = count - page;
    return true;
}

std::vector<std::string> TerminalNavigator::render(const std::string& status, int width, int height) const {
    std::vector<std::string> lines;
    if (height <= 0) return lines;
    lines.push_back(cut(status, width));
    const auto* r = rows();
    const size_t count = r ? r->size() : 0;
    std::string crumb = "Vantorel";
    for (const std::string& name : path_) crumb += " / " + TerminalText::visible(name);
    if (count) crumb += "  (" + std::to_string(cursor_ + 1) + " of " + std::to_string(count) + ")";
    if (height >= 2) lines.push_back(cut(crumb, width));
    const int body = height - kHeaderLines - kFooterLines;
    if (body <= 0) return lines;
    const size_t page = static_cast<size_t>(body);
    // The scroll position as the keys left it, moved so that the cursor row shows.
    size_t top = std::min(top_, count > page ? count - page : 0);
    if (cursor_ < top) top = cursor_;
    if (cursor_ >= top + page) top = cursor_ + 1 - page;
    if (!count) lines.push_back(root_ ? "  (nothing yet)" : "  (waiting for data)");
    for (size_t i = top; i < count && i < top + page; ++i)
        lines.push_back(cut((i == cursor_ ? "> " : "  ") + rowText(*(*r)[i]), width));
    lines.resize(static_cast<size_t>(height - kFooterLines));
    std::string keys = "↑↓ move  Enter open  Backspace back  PgUp/PgDn  q quit";
    if (top > 0 || top + page < count)
        keys = "rows " + std::to_string(top + 1) + "-" + std::to_string(std::min(count, top + page)) + " of " +
               std::to_string(count) + "  " + keys;
    lines.push_back(cut(keys, width));
    return lines;
}

}  // namespace vantorel
