// PeerCredentials: SO_PEERCRED of a local socket and the port's rule for whom it talks to (docs/protocol.md).
#include "Platform/PeerCredentials.h"

#include "Platform/StringFormat.h"

#include <grp.h>
#include <pwd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <vector>

namespace vantorel {

namespace {

// The user's name and primary group from the password database; empty when unknown.
std::optional<std::pair<std::string, gid_t>> userEntry(uid_t uid) {
    std::vector<char> buffer(16384);
    passwd entry {};
    passwd* found = nullptr;
    if (::getpwuid_r(uid, &entry, buffer.data(), buffer.size(), &found) != 0 || !found) return std::nullopt;
    return std::make_pair(std::string(found->pw_name), found->pw_gid);
}

bool memberOf(uid_t uid, gid_t group) {
    const auto user = userEntry(uid);
    if (!user) return false;
    if (user->second == group) return true;
    std::vector<gid_t> groups(64);
    int count = static_cast<int>(groups.size());
    if (::getgrouplist(user->first.c_str(), user->second, groups.data(), &count) < 0) {
        groups.resize(static_cast<size_t>(count));  // count now says how many there are
        if (::getgrouplist(user->first.c_str(), user->second, groups.data(), &count) < 0) return false;
    }
    groups.resize(static_cast<size_t>(count));
    return std::find(groups.begin(), groups.end(), group) != groups.end();
}

}  // namespace

std::optional<PeerCredentials> PeerCredentials::of(long long socketDescriptor) {
    ucred credentials {};
    socklen_t length = sizeof credentials;
    if (socketDescriptor < 0 ||
        ::getsockopt(static_cast<int>(socketDescriptor), SOL_SOCKET, SO_PEERCRED, &credentials, &length) != 0 ||
        length != sizeof credentials)
        return std::nullopt;
    return PeerCredentials{credentials.pid, credentials.uid, credentials.gid};
}

bool PeerCredentials::accepted(std::optional<gid_t> allowedGroup) const {
    if (uid == ::geteuid() || uid == 0) return true;
    return allowedGroup && (gid == *allowedGroup || memberOf(uid, *allowedGroup));
}

std::optional<gid_t> PeerCredentials::groupNamed(const std::string& name) {
    std::vector<char> buffer(16384);
    group entry {};
    group* found = nullptr;
    if (!name.empty() && ::getgrnam_r(name.c_str(), &entry, buffer.data(), buffer.size(), &found) == 0 && found)
        return found->gr_gid;
    if (name.empty() || name.find_first_not_of("0123456789") != std::string::npos || name.size() > 9) return std::nullopt;
    return static_cast<gid_t>(std::stoul(name));
}

std::string PeerCredentials::describeUser(uid_t uid) {
    const auto user = userEntry(uid);
    return user ? StringFormat::format("uid %u (%s)", static_cast<unsigned>(uid), user->first.c_str())
                : StringFormat::format("uid %u", static_cast<unsigned>(uid));
}

}  // namespace vantorel
