// RecordFields: reads the listed fields of a record or list entry and formats them for the display.
#include "LogGenerator/MVK_GSM/RecordFields.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

std::string RecordFields::format(const ByteReader& reader, const Field& field) {
    uint32_t raw = 0;
    switch (field.width) {
        case 1: raw = reader.u8(field.offset).value_or(0); break;
        case 2: raw = reader.u16(field.offset).value_or(0); break;
        default: raw = reader.u32(field.offset).value_or(0); break;
    }
    const uint32_t value = (raw >> field.shift) & field.mask;
    switch (field.kind) {
        case Kind::Signed: return StringFormat::format("%d", static_cast<int32_t>(value)) + field.suffix;
        case Kind::Unsigned: return StringFormat::format("%u", value) + field.suffix;
        case Kind::Text: break;
    }
    if (field.specialText && value == field.special) return field.specialText;
    if (value < field.texts.size()) return field.texts[value];
    return field.other;
}

void RecordFields::show(const ByteReader& reader, std::span<const Field> fields, const SetValue& setValue) {
    for (const Field& field : fields) setValue(field.key, format(reader, field));
}

bool RecordFields::showRecord(ByteView record, int32_t code, std::span<const Record> records,
                              const SetValue& setValue) {
    for (const Record& row : records) {
        if (row.code != code) continue;
        const ByteReader reader(record);
        if (reader.size() >= row.minLength) show(reader, row.fields, setValue);
        return true;
    }
    return false;
}

std::vector<int32_t> RecordFields::codes(std::span<const Record> records) {
    std::vector<int32_t> out;
    for (const Record& row : records) out.push_back(row.code);
    return out;
}

Value RecordFields::dictionary(const ByteReader& entry, std::span<const Field> fields) {
    auto d = Dictionary::create();
    show(entry, fields, [&d](const std::string& key, const std::string& text) { d->set(key, Value(text)); });
    return Value(d);
}

}  // namespace vantorel
