// TerminalText: text from a modem, a file or a user made safe to print on a terminal.
#pragma once

#include <string>
#include <string_view>

namespace vantorel {

// A display value or a snapshot description can hold anything the modem or the file
// put there, escape sequences included (ESC ] 0 ; ... BEL retitles the window,
// ESC [ 2 J clears it). Printed as is, they would drive the user's terminal. Every
// byte that a terminal could act on (C0 controls, DEL, C1 controls, and bytes that are
// not valid UTF-8) becomes visible as \xNN; printable ASCII and other valid UTF-8
// characters pass unchanged. JSON and property-list output keep the exact text and
// do not go through here.
class TerminalText {
public:
    static std::string visible(std::string_view text);
};

}  // namespace vantorel
