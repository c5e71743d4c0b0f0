// SnapshotCommand: `vantorel-cli snapshot FILE [--dlf OUT]`: lists a saved snapshot (display history entries, DLF entry) and extracts its DLF.
#pragma once

#include <QStringList>

namespace vantorel {

class SnapshotCommand {
public:
    // args: the words after "snapshot". Prints the snapshot's "Timestamp" and
    // "Description", then one line per "Data" entry (index and "Description", with
    // its "Date", its "Display" as a tree (--format json, plist, display) and the size
    // of a "DLF" below it); with --dlf OUT also writes the
    // bytes of the first entry holding a "DLF" to OUT. Returns the exit code: 0 done,
    // 1 a file that cannot be read or is not a snapshot, no DLF to extract or OUT not
    // written, 2 a usage error (an unknown --format too).
    static int run(const QStringList& args);
};

}  // namespace vantorel
