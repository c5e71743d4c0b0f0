// TerminalNavigator: where the terminal view is in the display tree (the level, the cursor row, the scroll) and the screen it draws there.
#pragma once

#include "Model/VantorelModelNode.h"
#include "Monitor/TerminalKeys.h"

#include <string>
#include <vector>

namespace vantorel {

// One level of the tree at a time, as the window's panes show it: the header, the
// path as a breadcrumb, the level's rows with the cursor, and a line of keys. The
// level and the cursor are kept by name, so a new tree at every refresh leaves
// the user where they were.
class TerminalNavigator {
public:
    // Lines above and below the rows: the status line and the breadcrumb; the keys.
    static constexpr int kHeaderLines = 2;
    static constexpr int kFooterLines = 1;

    // Takes a new tree: the level is found again by its path (as deep as it still
    // exists) and the cursor by its row's name (else it stays at its place).
    void setRoot(NodeRef root);
    // Applies one key; `rows` is how many rows the screen shows (for the pages).
    // Returns false for Quit.
    bool handle(TerminalKeys::Key key, int rows);

    // The screen: `status`, then the breadcrumb, the rows from the scroll position
    // (moved so that the cursor row shows), the keys; at most `height` lines, each
    // cut to `width` columns. The cursor row starts with ">".
    std::vector<std::string> render(const std::string& status, int width, int height) const;

    // The names from the root to the level shown.
    const std::vector<std::string>& path() const { return path_; }
    // The name of the row under the cursor ("" on an empty level).
    std::string cursorName() const;

    // Columns `text` (UTF-8) takes on a terminal; and `text` cut to `width` columns,
    // its last column "…" when something was cut.
    static int columns(const std::string& text);
    static std::string cut(const std::string& text, int width);

private:
    const std::vector<NodeRef>* rows() const;
    void place(size_t index);

    NodeRef root_;
    NodeRef level_;
    std::vector<std::string> path_;
    size_t cursor_ = 0;
    std::string cursorName_;
    size_t top_ = 0;
};

}  // namespace vantorel
