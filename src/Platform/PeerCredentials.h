// PeerCredentials: the user at the other end of a local socket (SO_PEERCRED) and whether a message port accepts them (docs/protocol.md).
#pragma once

#include <optional>
#include <string>

#include <sys/types.h>

namespace vantorel {

// A message port talks only to its own user: a peer is accepted when it runs as this
// process's user, as root (which may reach any user's sockets anyway), or, when a port
// is shared with a group (a lab service), as a member of that group.
struct PeerCredentials {
    pid_t pid = 0;
    uid_t uid = 0;
    gid_t gid = 0;  // the peer's effective group when it connected (or listened)

    // The credentials of the process at the other end of a connected local socket: the
    // connecting process on a server's socket, the listening one on a client's. Empty
    // when the descriptor is no connected Unix socket.
    static std::optional<PeerCredentials> of(long long socketDescriptor);

    // This user, root, or a member of allowedGroup (its primary group or a supplementary one).
    bool accepted(std::optional<gid_t> allowedGroup) const;

    // The group of that name (or number); empty when there is none.
    static std::optional<gid_t> groupNamed(const std::string& name);

    // "uid 65534 (nobody)", for messages.
    static std::string describeUser(uid_t uid);
};

}  // namespace vantorel
