// TerminalKeys: the keys of the terminal view, read from the bytes a terminal in raw mode sends.
#pragma once

#include <string>
#include <vector>

namespace vantorel {

class TerminalKeys {
public:
    enum class Key { Up, Down, Enter, Back, PageUp, PageDown, Home, End, Quit };

    // Takes the complete keys off the front of `pending` and leaves an escape
    // sequence that is still arriving for the next read. Bytes that are no key of
    // the view, and sequences it does not know, are dropped.
    static std::vector<Key> take(std::string& pending);
};

}  // namespace vantorel
