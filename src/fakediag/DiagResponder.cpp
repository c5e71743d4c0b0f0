// DiagResponder: replies to DIAG requests and the log mask they leave behind.
#include "fakediag/DiagResponder.h"

#include "Platform/ByteReader.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/Device/DiagCommand.h"

#include <algorithm>
#include <bit>

namespace vantorel {

namespace {

// 73 00 00 00 <op u32>: the log-configuration header; a set-mask adds equipment and count.
constexpr size_t kLogConfigHeader = 8;
constexpr size_t kSetMaskHeader = 16;
// Log-configuration statuses.
constexpr uint32_t kStatusOk = 0;
constexpr uint32_t kStatusBadEquipment = 1;
constexpr uint32_t kStatusNoItems = 2;

void putU32(Bytes& out, uint32_t value) { RecordBuilder::put(out, out.size(), value, 4); }

void putText(Bytes& out, const std::string& text, size_t width) {
    for (size_t i = 0; i < width; ++i) out.push_back(i < text.size() ? static_cast<uint8_t>(text[i]) : ' ');
}

Bytes error(uint8_t opcode, ByteView request) {
    Bytes out(request.size() + 1);
    out[0] = opcode;
    std::copy(request.begin(), request.end(), out.begin() + 1);
    return out;
}

size_t maskBytes(uint32_t count) { return (static_cast<size_t>(count) + 7) / 8; }

}  // namespace

DiagResponder::ItemCounts DiagResponder::defaultItemCounts() {
    ItemCounts counts{};
    counts[0x1] = 0x1000;  // CDMA 1x and EV-DO
    counts[0x4] = 0x0500;  // WCDMA
    counts[0x5] = 0x0300;  // GSM
    counts[0x7] = 0x0200;  // UMTS NAS (mobility and registration)
    counts[0xB] = 0x0300;  // LTE
    counts[0xD] = 0x0180;  // TD-SCDMA
    return counts;
}

DiagResponder::DiagResponder(ItemCounts counts, std::string buildId) : counts_(counts), buildId_(std::move(buildId)) {
    for (size_t e = 0; e < DiagCommand::kEquipmentCount; ++e) masks_[e].assign(maskBytes(counts_[e]), 0);
}

Bytes DiagResponder::answer(ByteView request) {
    const ByteReader r(request);
    const std::optional<uint8_t> opcode = r.u8(0);
    if (!opcode) return {DiagOpcode::kBadLength};
    switch (*opcode) {
    case DiagOpcode::kVersion: {
        Bytes out{DiagOpcode::kVersion};
        putText(out, "Nov 25 2026", 11);
        putText(out, "02:33:00", 8);
        putText(out, "Nov 25 2026", 11);
        putText(out, "02:33:00", 8);
        putText(out, "FAKEDIAG", 8);
        out.insert(out.end(), {0x02, 0x06, 0xFF, 0x01, 0x00, 0x02, 0x00, 0x00});
        return out;
    }
    case DiagOpcode::kBuildId: {
        Bytes out{DiagOpcode::kBuildId, 0x00, 0x00, 0x00};
        putU32(out, 0x0000E1B0);
        putU32(out, 0x00000FFF);
        out.insert(out.end(), buildId_.begin(), buildId_.end());
        out.push_back(0);
        putText(out, "fakediag", 8);
        out.push_back(0);
        return out;
    }
    case DiagOpcode::kEventReport:
        if (request.size() != 2) return error(DiagOpcode::kBadLength, request);
        return {DiagOpcode::kEventReport, 0x00};
    case DiagOpcode::kExtMessageConfig:
        return Bytes(request.begin(), request.end());
    case DiagOpcode::kLogConfig:
        return logConfig(request);
    default:
        return error(DiagOpcode::kBadCommand, request);
    }
}

Bytes DiagResponder::logConfig(ByteView request) {
    const ByteReader r(request);
    const std::optional<uint32_t> op = r.u32(4);
    if (!op) return error(DiagOpcode::kBadLength, request);
    Bytes out(request.begin(), request.begin() + kLogConfigHeader);
    switch (*op) {
    case DiagLogConfigOp::kDisable:
        for (Bytes& mask : masks_) std::fill(mask.begin(), mask.end(), 0);
        putU32(out, kStatusOk);
        return out;
    case DiagLogConfigOp::kRetrieveRanges:
        putU32(out, kStatusOk);
        for (uint32_t count : counts_) putU32(out, count);
        return out;
    case DiagLogConfigOp::kSetMask: {
        const std::optional<uint32_t> equipment = r.u32(8), count = r.u32(12);
        if (!equipment || !count || request.size() != kSetMaskHeader + maskBytes(*count))
            return error(DiagOpcode::kBadLength, request);
        if (*equipment >= DiagCommand::kEquipmentCount || counts_[*equipment] == 0) {
            putU32(out, *equipment >= DiagCommand::kEquipmentCount ? kStatusBadEquipment : kStatusNoItems);
            return out;
        }
        // The mask is replaced; the modem keeps the items it has and no more.
        const uint32_t kept = std::min(*count, counts_[*equipment]);
        Bytes& mask = masks_[*equipment];
        std::fill(mask.begin(), mask.end(), 0);
        for (uint32_t item = 0; item < kept; ++item)
            if ((r.u8(kSetMaskHeader + item / 8).value_or(0) >> (item % 8)) & 1)
                mask[item / 8] |= static_cast<uint8_t>(1u << (item % 8));
        putU32(out, kStatusOk);
        putU32(out, *equipment);
        putU32(out, counts_[*equipment]);
        out.insert(out.end(), mask.begin(), mask.end());
        return out;
    }
    default:
        return error(DiagOpcode::kBadParameter, request);
    }
}

bool DiagResponder::enabled(uint16_t code) const {
    const DiagLogItem item = DiagLogItem::of(code);
    if (item.item >= counts_[item.equipment]) return false;
    return (masks_[item.equipment][item.item / 8] >> (item.item % 8)) & 1;
}

bool DiagResponder::logging() const {
    return std::any_of(masks_.begin(), masks_.end(),
                       [](const Bytes& mask) { return std::any_of(mask.begin(), mask.end(), [](uint8_t b) { return b; }); });
}

std::string DiagResponder::maskSummary() const {
    std::string text;
    for (size_t e = 0; e < masks_.size(); ++e) {
        int items = 0;
        for (uint8_t byte : masks_[e]) items += std::popcount(byte);
        if (items) text += StringFormat::format("%s0x%zX: %d item%s", text.empty() ? "" : ", ", e, items, items == 1 ? "" : "s");
    }
    return text.empty() ? "none" : text;
}

}  // namespace vantorel
