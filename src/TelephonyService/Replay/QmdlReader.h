// QmdlReader: reads a .qmdl / .mi2log file (HDLC-framed DIAG) into the Morvek records of its log packets.
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <string>

namespace vantorel {

// .qmdl and .mi2log files are the same: a raw concatenation of HDLC frames, no header.
// Every good frame is a DIAG body (DiagPacket): log packets become entries, other
// bodies are counted as other packets, log packets whose lengths do not hold as
// malformed. Bad frames are counted by the deframer and reading goes on.
class QmdlReader {
public:
    // A file that cannot be read gives a log with `error` set ("<path>: <reason>").
    static RecordedLog readFile(const std::string& path);
    static RecordedLog readBytes(ByteView data);
};

}  // namespace vantorel
