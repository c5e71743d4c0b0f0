// C2KLookup: value delivery through the lookup's binding records, and pilot-list values.
#include "LogGenerator/C2K/C2KLookup.h"

#include "Platform/StringFormat.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

void C2KLookup::setLookupValue(const std::string& lookupKey, const Value& value, const DictionaryRef& lookup) {
    if (!lookup) return;
    const ArrayRef places = lookup->get(lookupKey).asArray();
    if (!places) return;
    for (const Value& place : *places) {
        const DictionaryRef binding = place.asDictionary();
        const DictionaryRef dict = binding ? binding->get("dict").asDictionary() : nullptr;
        const std::string* key = binding ? binding->get("key").asString() : nullptr;
        if (!dict || !key) return;
        dict->set(*key, value);
    }
}

C2KLookup::PilotList::PilotList() : pilots_(Dictionary::create()) {
    pilots_->set("_sorted", Value("_sorted"));
}

void C2KLookup::PilotList::add(int index, unsigned pnOffset, std::string text) {
    pilots_->set(StringFormat::format("%d;%u", index, pnOffset), Value(std::move(text)));
    ++count_;
}

Value C2KLookup::PilotList::value(bool noneWhenEmpty) const {
    if (noneWhenEmpty && count_ == 0) return Value("(none)");
    return Value(pilots_);
}

}  // namespace vantorel
