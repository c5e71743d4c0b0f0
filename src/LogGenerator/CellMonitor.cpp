// CellMonitor: cell-monitor dictionary matching shared by the serving-cell sections (Parts 5.2, 6.2, 7.2).
#include "LogGenerator/CellMonitor.h"

#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

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

std::optional<int32_t> CellMonitor::int32(const Value& cell, const char* key) {
    auto dict = cell.asDictionary();
    if (!dict) return std::nullopt;
    const Value* v = dict->find(key);
    if (!v) return std::nullopt;
    return v->asInt32();
}

}  // namespace vantorel
