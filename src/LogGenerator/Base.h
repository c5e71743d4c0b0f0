// Base: the display section base class: registration by name and log codes, record decoding into the bound container, list rebuilding, Ec/No lookup.
#pragma once

#include "LogGenerator/CodeDictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "PropertyList/Value.h"

#include <cstdint>
#include <functional>
#include <stdexcept>
#include <string>
#include <vector>

namespace vantorel {

class Array;
class ByteReader;
class Dictionary;

// The error a section raises out of updateWithData when a record cannot be decoded at
// all (a SIM-file payload that is not a property list); the routing loop catches it,
// logs it and hands the record to the next section.
class SectionError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

class Base {
public:
    Base();
    virtual ~Base();
    Base(const Base&) = delete;
    Base& operator=(const Base&) = delete;

    // Registers the section: stored in classDict under getSectionName (replacing an
    // earlier one of that name), then subscribed to its codes. Returns this.
    Base* initWithDict(ClassDictionary& classDict, CodeDictionary& codeDict);

    // The section protocol; Base's own versions are abstract and end in a
    // programming error.
    virtual std::string getSectionName() const;
    virtual std::vector<int32_t> getLogCodeArray() const;
    virtual void updateWithData(ByteView data, int32_t logCode);

    // Binds the section to its container in the display dictionary (not owned) and
    // logs the section name at warning priority.
    void updateSectionRef(const Value& container);
    void updateLogCodeDict(CodeDictionary& codeDict);

    // Array rewrites under ArrayLock, so the tree builder never sees a half list.
    static void clearElementsInArray(Array& array);
    static void replaceArray(Array& array, const Array& With);

    // The property list an extra record carries from offset 13 to its end.
    static PropertyListResult parseExtraPayload(ByteView record);

    // Linear Ec/No to whole dB by the modem's threshold table.
    static int32_t lookUpECNO(uint32_t value);

    // The bound container, or null when unbound, gone, or of the other kind.
    DictionaryRef sectionDictionary() const;
    ArrayRef sectionArray() const;

protected:
    // Stores text under key in the bound dictionary; nothing when unbound.
    void setValue(const std::string& key, const std::string& text) const;
    // Clears the bound array / replaces its contents; nothing when unbound.
    void clearSectionArray() const;
    void replaceSectionArray(const Array& with) const;

    // An enumeration text from a constant table; `fallback` outside it or in a gap
    // (a nullptr row).
    static const char* tableText(const char* const* table, size_t count, unsigned value,
                                 const char* fallback = "Unknown");
    template <size_t N>
    static const char* tableText(const char* const (&table)[N], unsigned value, const char* fallback = "Unknown") {
        return tableText(table, N, value, fallback);
    }

    // The rows of one record, or null to leave the list as it stands.
    using ListRows = std::function<ArrayRef(const ByteReader& record)>;
    // The one skeleton of every list section. A record shorter than minLength leaves the
    // list as it was. Otherwise, with clearFirst, the list is emptied under ArrayLock
    // before the record is read; then buildRows reads it and the rows it returns replace
    // the list under ArrayLock, so the display's reader never sees a half-built list.
    void rebuildList(ByteView record, size_t minLength, bool clearFirst, const ListRows& buildRows) const;

    // Up to count fixed-size entries of a record, the first at firstOffset and each next
    // one stride bytes on, each read through a reader of the entry alone (offsets
    // relative to the entry). Stops at the first entry that does not lie wholly inside
    // the record, so a count larger than the record holds never reads past its end.
    static ArrayRef readEntries(const ByteReader& record, size_t firstOffset, size_t stride, size_t entrySize,
                                unsigned count, const std::function<Value(const ByteReader& entry)>& row);

    // "Received an unknown log message: %d" at error priority.
    static void logUnknownCode(int32_t logCode);

private:
    std::weak_ptr<Dictionary> dictionaryRef_;
    std::weak_ptr<Array> arrayRef_;
};

}  // namespace vantorel
