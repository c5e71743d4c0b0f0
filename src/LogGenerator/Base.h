// Base: the section base class and protocol of Part 3.3 (initWithDict:codeDict:, getSectionName, getLogCodeArray, updateWithData:logCode:), with lookUpECNO:.
#pragma once

#include "LogGenerator/CodeDictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "PropertyList/Value.h"

#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

namespace vantorel {

class Array;
class Dictionary;

// The error a section raises out of updateWithData:logCode: (Part 5.6's "raises an
// error"); the routing loop of Part 3.2 catches it, logs it and goes on.
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

    // Linear Ec/No to whole dB by Part 3.3's threshold table.
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

    // The property list an extra record carries from offset 13 to its end.
    static PropertyListResult parseExtraPayload(ByteView record);

    // "Received an unknown log message: %d" at error priority.
    static void logUnknownCode(int32_t logCode);

private:
    std::weak_ptr<Dictionary> dictionaryRef_;
    std::weak_ptr<Array> arrayRef_;
};

}  // namespace vantorel
