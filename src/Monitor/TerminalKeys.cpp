// TerminalKeys: VT100/xterm key sequences (ESC [ A, ESC O A, ESC [ 5 ~ ...) to the view's keys.
#include "Monitor/TerminalKeys.h"

#include <optional>

namespace vantorel {

namespace {

using Key = TerminalKeys::Key;

// The key of a complete CSI or SS3 sequence: its final byte, and the number before a "~".
std::optional<Key> sequenceKey(char final, const std::string& parameter) {
    switch (final) {
    case 'A': return Key::Up;
    case 'B': return Key::Down;
    case 'C': return Key::Enter;  // Right drills down like Enter
    case 'D': return Key::Back;   // Left goes back like Backspace
    case 'H': return Key::Home;
    case 'F': return Key::End;
    case '~':
        if (parameter == "1" || parameter == "7") return Key::Home;
        if (parameter == "4" || parameter == "8") return Key::End;
        if (parameter == "5") return Key::PageUp;
        if (parameter == "6") return Key::PageDown;
        if (parameter == "3") return Key::Back;  // Delete
        return std::nullopt;
    default: return std::nullopt;
    }
}

}  // namespace

std::vector<TerminalKeys::Key> TerminalKeys::take(std::string& pending) {
    std::vector<Key> keys;
    size_t i = 0;
    while (i < pending.size()) {
        const char c = pending[i];
        if (c != '\x1b') {
            if (c == '\r' || c == '\n') keys.push_back(Key::Enter);
            else if (c == '\x7f' || c == '\b') keys.push_back(Key::Back);
            else if (c == 'q' || c == 'Q') keys.push_back(Key::Quit);
            else if (c == 'k') keys.push_back(Key::Up);
            else if (c == 'j') keys.push_back(Key::Down);
            ++i;
            continue;
        }
        if (i + 1 >= pending.size()) break;  // a lone ESC: the rest may follow
        const char introducer = pending[i + 1];
        if (introducer != '[' && introducer != 'O') {  // ESC then another key: ESC alone
            ++i;
            continue;
        }
        // Parameters and intermediates (0x20-0x3F) up to the final byte (0x40-0x7E).
        size_t end = i + 2;
        while (end < pending.size() && pending[end] >= 0x20 && pending[end] <= 0x3f && end - i < 16) ++end;
        if (end >= pending.size()) {
            if (end - i < 16) break;  // still arriving
            i = end;
            continue;
        }
        std::string parameter = pending.substr(i + 2, end - i - 2);
        if (const auto semicolon = parameter.find(';'); semicolon != std::string::npos)
            parameter.resize(semicolon);  // modifiers (ESC [ 1 ; 5 A) do not change the key
        if (auto key = sequenceKey(pending[end], parameter)) keys.push_back(*key);
        i = end + 1;
    }
    pending.erase(0, i);
    return keys;
}

}  // namespace vantorel
