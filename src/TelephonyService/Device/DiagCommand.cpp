// DiagCommand: DIAG request bodies, HDLC framing and reply matching.
#include "TelephonyService/Device/DiagCommand.h"

#include "Platform/ByteReader.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/Replay/HdlcDeframer.h"

namespace vantorel {

namespace {

void putU32(Bytes& out, uint32_t value) { RecordBuilder::put(out, out.size(), value, 4); }

void putEscaped(Bytes& out, uint8_t byte) {
    if (byte == HdlcDeframer::kFlag || byte == HdlcDeframer::kEscape) {
        out.push_back(HdlcDeframer::kEscape);
        out.push_back(byte ^ HdlcDeframer::kEscapeXor);
    } else {
        out.push_back(byte);
    }
}

bool isErrorOpcode(uint8_t opcode) {
    return opcode == DiagOpcode::kBadCommand || opcode == DiagOpcode::kBadParameter ||
           opcode == DiagOpcode::kBadLength || opcode == DiagOpcode::kBadMode;
}

// 73 00 00 00 <op u32> <status u32>: the op of a log-configuration body.
constexpr size_t kLogConfigOpOffset = 4;
constexpr size_t kLogConfigStatusOffset = 8;
constexpr size_t kLogConfigCountsOffset = 12;
constexpr size_t kBuildIdOffset = 12;

}  // namespace

Bytes DiagCommand::frame(ByteView body, uint16_t crcXor) {
    Bytes out;
    out.reserve(body.size() + body.size() / 8 + 4);
    for (uint8_t byte : body) putEscaped(out, byte);
    const uint16_t crc = static_cast<uint16_t>(HdlcDeframer::crc16(body) ^ crcXor);
    putEscaped(out, static_cast<uint8_t>(crc & 0xFF));
    putEscaped(out, static_cast<uint8_t>(crc >> 8));
    out.push_back(HdlcDeframer::kFlag);
    return out;
}

Bytes DiagCommand::eventReportsOff() { return {DiagOpcode::kEventReport, 0x00}; }

Bytes DiagCommand::logConfig(uint32_t op) {
    Bytes out{DiagOpcode::kLogConfig, 0, 0, 0};
    putU32(out, op);
    return out;
}

Bytes DiagCommand::messageLevelsOff() { return {DiagOpcode::kExtMessageConfig, 0x05, 0, 0, 0, 0, 0, 0}; }

Bytes DiagCommand::version() { return {DiagOpcode::kVersion}; }

Bytes DiagCommand::buildId() { return {DiagOpcode::kBuildId}; }

Bytes DiagCommand::setMask(uint32_t equipment, uint32_t itemCount, const std::set<uint32_t>& items) {
    Bytes out = logConfig(DiagLogConfigOp::kSetMask);
    putU32(out, equipment);
    putU32(out, itemCount);
    const size_t maskStart = out.size();
    out.resize(maskStart + (static_cast<size_t>(itemCount) + 7) / 8, 0);
    for (uint32_t item : items)
        if (item < itemCount) out[maskStart + item / 8] |= static_cast<uint8_t>(1u << (item % 8));
    return out;
}

DiagCommand::MaskPlan DiagCommand::planMasks(const std::set<uint16_t>& codes, const ItemCounts& counts) {
    std::map<uint32_t, std::set<uint32_t>> items;
    MaskPlan plan;
    for (uint16_t code : codes) {
        const DiagLogItem item = DiagLogItem::of(code);
        if (item.item >= counts[item.equipment])
            plan.skipped.push_back(code);
        else
            items[item.equipment].insert(item.item);
    }
    for (const auto& [equipment, set] : items) plan.requests[equipment] = setMask(equipment, counts[equipment], set);
    return plan;
}

std::vector<Bytes> DiagCommand::clearingSequence() {
    return {eventReportsOff(), logConfig(DiagLogConfigOp::kDisable), messageLevelsOff()};
}

bool DiagCommand::answers(ByteView reply, ByteView request) {
    const ByteReader r(reply), q(request);
    const std::optional<uint8_t> opcode = r.u8(0), asked = q.u8(0);
    if (!opcode || !asked) return false;
    if (isErrorOpcode(*opcode)) return r.u8(1) == asked;
    if (*opcode != *asked) return false;
    if (*asked == DiagOpcode::kLogConfig) {
        const std::optional<uint32_t> op = q.u32(kLogConfigOpOffset);
        return op && r.u32(kLogConfigOpOffset) == op;
    }
    if (*asked == DiagOpcode::kExtMessageConfig) return r.u8(1) == q.u8(1);
    return true;
}

std::string DiagCommand::errorName(ByteView reply) {
    switch (ByteReader(reply).u8(0).value_or(0xFF)) {
    case DiagOpcode::kBadCommand: return "bad command";
    case DiagOpcode::kBadParameter: return "bad parameter";
    case DiagOpcode::kBadLength: return "bad length";
    case DiagOpcode::kBadMode: return "bad mode";
    default: return {};
    }
}

std::optional<uint32_t> DiagCommand::logConfigStatus(ByteView reply) {
    return ByteReader(reply).u32(kLogConfigStatusOffset);
}

std::optional<DiagCommand::ItemCounts> DiagCommand::itemCounts(ByteView reply) {
    const ByteReader r(reply);
    if (r.u32(kLogConfigStatusOffset) != 0u) return std::nullopt;
    ItemCounts counts{};
    for (size_t i = 0; i < kEquipmentCount; ++i) {
        const std::optional<uint32_t> count = r.u32(kLogConfigCountsOffset + 4 * i);
        if (!count) return std::nullopt;
        counts[i] = *count;
    }
    return counts;
}

std::string DiagCommand::buildIdOf(ByteView reply) {
    const ByteReader r(reply);
    std::string id;
    if (r.u8(0) != DiagOpcode::kBuildId) return id;
    for (uint8_t c : r.from(kBuildIdOffset)) {
        if (c == 0 || id.size() == kMaxBuildIdLength) break;
        if (c >= 0x20 && c < 0x7F) id.push_back(static_cast<char>(c));
    }
    return id;
}

std::string DiagCommand::describe(ByteView request) {
    const ByteReader q(request);
    const uint8_t opcode = q.u8(0).value_or(0xFF);
    if (opcode == DiagOpcode::kLogConfig)
        return StringFormat::format("log configuration op %u", q.u32(kLogConfigOpOffset).value_or(0));
    switch (opcode) {
    case DiagOpcode::kVersion: return "version (00)";
    case DiagOpcode::kBuildId: return "build ID (7C)";
    case DiagOpcode::kEventReport: return "event reports off (60)";
    case DiagOpcode::kExtMessageConfig: return "debug messages off (7D)";
    default: return StringFormat::format("request %02X", opcode);
    }
}

}  // namespace vantorel
