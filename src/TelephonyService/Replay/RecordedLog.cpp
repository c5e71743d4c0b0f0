// RecordedLog: entries and counters shared by the recorded-stream readers, with the file loader and the per-code summary.
#include "TelephonyService/Replay/RecordedLog.h"

#include "Platform/LogCodeNames.h"
#include "Platform/RecordVersions.h"
#include "Platform/StringFormat.h"

#include <QFile>

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <utility>

namespace vantorel {

size_t RecordedLog::count(uint16_t logCode) const {
    auto it = codeCounts.find(logCode);
    return it == codeCounts.end() ? 0 : it->second;
}

void RecordedLog::addEntry(uint16_t logCode, uint64_t timeStamp, Bytes record) {
    entries.push_back(RecordedEntry{logCode, timeStamp, std::move(record)});
    ++logPackets;
    ++codeCounts[logCode];
    const auto& stored = entries.back().record;
    if (const auto version = RecordVersions::versionOf(stored, logCode)) ++versionCounts[logCode][*version];
}

void RecordedLog::addProblem(uint64_t offset, const std::string& what, const std::string& why) {
    if (problems.size() >= kMaxProblems) return;
    problems.push_back(StringFormat::format("%s at byte %llu: %s", what.c_str(),
                                            static_cast<unsigned long long>(offset), why.c_str()));
}

std::string RecordedLog::summary() const {
    std::string out;
    if (!ok()) out += "error: " + error + "\n";
    out += StringFormat::format(
        "frames %zu, log packets %zu, other packets %zu, bad CRC %zu, malformed %zu, truncated %zu\n", frames,
        logPackets, otherPackets, badCrc, malformed, truncated);
    for (const auto& [code, n] : codeCounts) {
        const std::string name = LogCodeNames::nameOf(code);
        out += StringFormat::format("0x%04X  %s%zu", code, name.empty() ? "" : (name + "  ").c_str(), n);
        const auto versions = versionCounts.find(code);
        if (versions != versionCounts.end()) {
            std::string list;
            for (const auto& [version, count] : versions->second)
                list += StringFormat::format("%sversion %u: %zu", list.empty() ? "" : ", ", unsigned{version}, count);
            out += "  (" + list + ")";
        }
        out += "\n";
    }
    for (const auto& p : problems) out += p + "\n";
    const size_t allProblems = badCrc + malformed + truncated;
    if (allProblems > problems.size())
        out += StringFormat::format("(%zu more problems not listed)\n", allProblems - problems.size());
    return out;
}

std::optional<Bytes> RecordedLog::loadFile(const std::string& path, std::string* error) {
    auto fail = [&](const QString& reason) -> std::optional<Bytes> {
        if (error) *error = path + ": " + reason.toStdString();
        return std::nullopt;
    };
    // What the path is decides how it is read: a regular file to its size; a pipe or a
    // socket (`<(zcat x.qmdl.gz)`) to its end, at most kMaxStreamBytes; a device
    // (/dev/zero, a modem's port) never ends and is no recording: refused.
    struct stat info {};
    if (::stat(path.c_str(), &info) != 0) return fail(QString::fromLocal8Bit(std::strerror(errno)));
    if (S_ISDIR(info.st_mode)) return fail(QStringLiteral("is a directory"));
    if (S_ISCHR(info.st_mode) || S_ISBLK(info.st_mode))
        return fail(QStringLiteral("is a device, not a recorded file (a live modem is watched with --device)"));
    QFile file(QString::fromStdString(path));
    if (!file.open(QIODevice::ReadOnly)) return fail(file.errorString());
    Bytes data;
    if (S_ISREG(info.st_mode)) {
        const qint64 size = file.size();
        if (static_cast<uint64_t>(size) > kMaxFileBytes)
            return fail(QStringLiteral("%1 MiB: larger than the %2 MiB a recording is read whole up to")
                            .arg(static_cast<qulonglong>(size >> 20))
                            .arg(static_cast<qulonglong>(kMaxFileBytes >> 20)));
        data.resize(static_cast<size_t>(std::max<qint64>(size, 0)));
        qint64 done = 0;
        while (done < size) {
            const qint64 n = file.read(reinterpret_cast<char*>(data.data()) + done, size - done);
            if (n < 0) return fail(file.errorString());
            if (n == 0) break;  // the file shrank while being read: keep what is there
            done += n;
        }
        data.resize(static_cast<size_t>(done));
        return data;
    }
    constexpr qint64 kChunk = 1 << 16;
    for (;;) {
        const size_t done = data.size();
        if (done > kMaxStreamBytes)
            return fail(QStringLiteral("more than %1 MiB without an end: not a recorded file")
                            .arg(static_cast<qulonglong>(kMaxStreamBytes >> 20)));
        data.resize(done + kChunk);
        const qint64 n = file.read(reinterpret_cast<char*>(data.data()) + done, kChunk);
        if (n < 0) return fail(file.errorString());
        data.resize(done + static_cast<size_t>(n));
        if (n == 0) return data;  // QFile reads a pipe blocking: 0 is its end
    }
}

}  // namespace vantorel
