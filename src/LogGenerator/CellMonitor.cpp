// CellMonitor: the serving cell of the cell-monitor array, shown field by field.
#include "LogGenerator/CellMonitor.h"

#include "LogGenerator/Base.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

CellMonitor::Outcome CellMonitor::showServingCell(ByteView record, std::initializer_list<const char*> technologies,
                                                  Pick pick, std::span<const Field> fields, const SetValue& setValue) {
    return forEachCell(record, technologies, kTSCellMonitorCellTypeServing, [&](const Value& cell) {
        // Every field is read even when an earlier one is missing.
        for (const Field& field : fields) {
            if (const auto v = number(cell, field.cellKey)) {
                const std::string text = StringFormat::format("%d", *v);
                setValue(field.displayKey, text);
                if (field.secondDisplayKey) setValue(field.secondDisplayKey, text);
            } else {
                SystemLog::log(SystemLog::kError, "%s", field.failure);
            }
        }
        // With LastCell every later serving cell overwrites the same keys.
        return pick == Pick::LastCell;
    });
}

CellMonitor::Outcome CellMonitor::forEachCell(ByteView record, std::initializer_list<const char*> technologies,
                                              const char* cellType, const Visit& visit) {
    const PropertyListResult parsed = Base::parseExtraPayload(record);
    if (!parsed) return Outcome::NotParsed;
    const ArrayRef cells = parsed.value->asArray();
    if (!cells) return Outcome::NoArray;
    for (const Value& cell : *cells)
        if (matches(cell, technologies, cellType) && !visit(cell)) break;
    return Outcome::Read;
}

bool CellMonitor::matches(const Value& cell, std::initializer_list<const char*> technologies, const char* cellType) {
    auto dict = cell.asDictionary();
    if (!dict) return false;
    const Value* rat = dict->find(kTSCellMonitorCellRadioAccessTechnology);
    const Value* type = dict->find(kTSCellMonitorCellType);
    if (!rat || !type || !rat->asString() || !type->asString()) return false;
    if (*type->asString() != cellType) return false;
    for (const char* t : technologies)
        if (*rat->asString() == t) return true;
    return false;
}

bool CellMonitor::logMissingList(Outcome outcome) {
    if (outcome == Outcome::Read) return false;
    // Nothing parsed means no array either: both lines, in the order they happen.
    if (outcome == Outcome::NotParsed)
        SystemLog::log(SystemLog::kError, "%s", "Cell Info Array data could not be constructed");
    SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
    return true;
}

std::optional<int32_t> CellMonitor::number(const Value& cell, const char* key) {
    auto dict = cell.asDictionary();
    if (!dict) return std::nullopt;
    const Value* v = dict->find(key);
    if (!v) return std::nullopt;
    return v->asInt32();
}

}  // namespace vantorel
