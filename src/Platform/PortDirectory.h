// PortDirectory: where message-port socket files live (the user's own runtime directory), whose they may be, and clearing the ones killed processes left (docs/protocol.md).
#pragma once

#include <string>

namespace vantorel {

// A bare port name is a socket file in the user's runtime directory: $XDG_RUNTIME_DIR/vantorel
// when XDG_RUNTIME_DIR is set, else <tmp>/vantorel-<uid> (<tmp> is $TMPDIR or /tmp). It is
// made with mode 0700 when missing and must belong to this user: in a directory nobody else
// can write, no other user can take a name first or answer in our place. An absolute name is
// a socket path as it is; its directory must belong to this user or to root.
class PortDirectory {
public:
    // The runtime directory (made when missing). Empty, with *error saying why, when it, or
    // XDG_RUNTIME_DIR, is no directory of this user's own. The first time a process uses a
    // runtime directory, the stale sockets in it are removed (removeStaleSockets).
    static std::string path(std::string* error);

    // The socket file of a port name: an absolute name as it is, a bare name in path().
    // Empty with *error when the runtime directory is refused.
    static std::string socketPathFor(const std::string& name, std::string* error);

    // Why a socket cannot be trusted in `directory`: it belongs to another user than this
    // one or root ("the directory D belongs to uid N (name), not to this user"). Empty
    // when it can, or when it does not exist (listening there fails on its own).
    static std::string foreignDirectory(const std::string& directory);

    // Removes the socket files in `directory` whose names start with `prefix`, that belong to
    // this user and that no process listens on any more: those a killed process left behind.
    // A file that is not a socket, another user's socket and a live port are left alone.
    // Returns how many were removed.
    static int removeStaleSockets(const std::string& directory, const std::string& prefix = "");
};

}  // namespace vantorel
