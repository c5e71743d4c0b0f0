// Base: the section base class, the list rewrites under ArrayLock and the Ec/No lookup.
#include "LogGenerator/Base.h"

#include "LogGenerator/ArrayLock.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/ProgrammingError.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

Base::Base() = default;
Base::~Base() = default;

Base* Base::initWithDict(ClassDictionary& classDict, CodeDictionary& codeDict) {
    classDict[getSectionName()] = this;
    updateLogCodeDict(codeDict);
    return this;
}

std::string Base::getSectionName() const {
    ProgrammingError::unrecognisedOperation("Base", "getSectionName", this);
}

std::vector<int32_t> Base::getLogCodeArray() const {
    ProgrammingError::unrecognisedOperation("Base", "getLogCodeArray", this);
}

void Base::updateWithData(ByteView, int32_t) {
    ProgrammingError::unrecognisedOperation("Base", "updateWithData:logCode:", this);
}

void Base::updateSectionRef(const Value& container) {
    dictionaryRef_ = container.asDictionary();
    arrayRef_ = container.asArray();
    SystemLog::log(SystemLog::kWarning, "%s", getSectionName().c_str());
}

void Base::updateLogCodeDict(CodeDictionary& codeDict) {
    const std::vector<int32_t> codes = getLogCodeArray();
    SystemLog::log(SystemLog::kWarning, "Array Count: %d", static_cast<int>(codes.size()));
    for (int32_t code : codes) codeDict.add(std::to_string(code)).push_back(this);
}

void Base::clearElementsInArray(Array& array) {
    ArrayLock::lockArray();
    array.clear();
    ArrayLock::unlockArray();
}

void Base::replaceArray(Array& array, const Array& With) {
    ArrayLock::lockArray();
    // Copy first: the source may be the array itself.
    std::vector<Value> items(With.begin(), With.end());
    array.clear();
    for (auto& v : items) array.append(std::move(v));
    ArrayLock::unlockArray();
}

int32_t Base::lookUpECNO(uint32_t value) {
    if (value >= 524288) return 0;  // any of bits 19 to 31 set
    if (value >= 417648) return -1;
    // Lower bounds (inclusive), scanning downward; the irregular spacing is the modem's own.
    static const uint32_t kBounds[] = {331809, 263625, 209464, 166442, 132269, 105124, 83563, 66436,
                                       52831,  42024,  33441,  26622,  21206,  16904,  13487, 10772,
                                       8616,   6903,   5543,   4462,   3604,   2922,   2241,  1950,
                                       1608,   1337,   1121,   950,    814,    706};
    int32_t db = -2;
    for (uint32_t bound : kBounds) {
        if (value >= bound) return db;
        --db;
    }
    return 0;  // 705 and below: 0, not -32
}

DictionaryRef Base::sectionDictionary() const { return dictionaryRef_.lock(); }
ArrayRef Base::sectionArray() const { return arrayRef_.lock(); }

void Base::setValue(const std::string& key, const std::string& text) const {
    if (auto d = sectionDictionary()) d->set(key, Value(text));
}

void Base::clearSectionArray() const {
    if (auto a = sectionArray()) clearElementsInArray(*a);
}

void Base::replaceSectionArray(const Array& with) const {
    if (auto a = sectionArray()) replaceArray(*a, with);
}

const char* Base::tableText(const char* const* table, size_t count, unsigned value, const char* fallback) {
    if (value >= count || table[value] == nullptr) return fallback;
    return table[value];
}

void Base::rebuildList(ByteView record, size_t minLength, bool clearFirst, const ListRows& buildRows) const {
    const ByteReader reader(record);
    if (reader.size() < minLength) return;
    if (clearFirst) clearSectionArray();
    if (const ArrayRef rows = buildRows(reader)) replaceSectionArray(*rows);
}

ArrayRef Base::readEntries(const ByteReader& record, size_t firstOffset, size_t stride, size_t entrySize,
                           unsigned count, const std::function<Value(const ByteReader& entry)>& row) {
    auto rows = Array::create();
    for (unsigned i = 0; i < count; ++i) {
        const auto entry = record.slice(firstOffset + stride * i, entrySize);
        if (!entry) break;
        rows->append(row(ByteReader(*entry)));
    }
    return rows;
}

PropertyListResult Base::parseExtraPayload(ByteView record) {
    // Offset 13 is the end of the record header; from() gives nothing for a header-only record.
    const ByteReader reader(record);
    PropertyListResult result = PropertyListSerialization::read(reader.from(13));
    // The reason (a hostile or broken payload: a NUL in a string, nesting too deep, a
    // cut list) is said once here; the section decides what its display keeps.
    if (!result)
        SystemLog::log(SystemLog::kWarning, "Extra record 0x%X skipped: %s",
                       static_cast<unsigned>(LogCode::kExtraBase | reader.u16(3).value_or(0)), result.error.c_str());
    return result;
}

void Base::logUnknownCode(int32_t logCode) {
    SystemLog::log(SystemLog::kError, "Received an unknown log message: %d", logCode);
}

}  // namespace vantorel
