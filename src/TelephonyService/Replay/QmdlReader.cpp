// QmdlReader: .qmdl / .mi2log files through HdlcDeframer and DiagPacket into a RecordedLog.
#include "TelephonyService/Replay/QmdlReader.h"

#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/HdlcDeframer.h"

namespace vantorel {

namespace {

const char* problemName(HdlcDeframer::Problem problem) {
    switch (problem) {
    case HdlcDeframer::Problem::BadCrc: return "bad CRC frame";
    case HdlcDeframer::Problem::Malformed: return "malformed frame";
    case HdlcDeframer::Problem::Truncated: return "truncated frame";
    }
    return "bad frame";
}

}  // namespace

RecordedLog QmdlReader::readFile(const std::string& path) {
    RecordedLog log;
    auto data = RecordedLog::loadFile(path, &log.error);
    if (!data) return log;
    return readBytes(*data);
}

RecordedLog QmdlReader::readBytes(ByteView data) {
    RecordedLog log;
    HdlcDeframer deframer(
        [&log](ByteView body, uint64_t offset) {
            DiagPacket packet(body);
            switch (packet.kind()) {
            case DiagPacket::Kind::LogPacket:
                log.addEntry(packet.logCode(), packet.timeStamp(), packet.morvekRecord());
                break;
            case DiagPacket::Kind::NotLogPacket:
                ++log.otherPackets;
                break;
            case DiagPacket::Kind::Malformed:
                ++log.malformed;
                log.addProblem(offset, "malformed packet", packet.error());
                break;
            }
        },
        [&log](HdlcDeframer::Problem problem, uint64_t offset, const std::string& why) {
            log.addProblem(offset, problemName(problem), why);
        });
    deframer.feed(data);
    deframer.finish();
    const auto& c = deframer.counters();
    log.frames = c.frames;
    log.badCrc = c.badCrc;
    log.malformed += c.malformed;
    log.truncated = c.truncated;
    return log;
}

}  // namespace vantorel
