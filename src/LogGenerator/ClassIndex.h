// ClassIndex: a decoder's sections by name and its router from log codes to the sections that subscribe to them.
#pragma once

#include "LogGenerator/Base.h"
#include "LogGenerator/CodeDictionary.h"

#include <memory>
#include <string>
#include <vector>

namespace vantorel {

class ClassIndex {
public:
    ClassIndex();
    virtual ~ClassIndex();  // writes "Deallocing ClassIndex" to standard output
    ClassIndex(const ClassIndex&) = delete;
    ClassIndex& operator=(const ClassIndex&) = delete;

    Base* getClass(const std::string& sectionName) const;
    // The sections registered for the code (looked up as its decimal string), or null.
    const SectionList* getSubscribers(int32_t logCode) const;
    // Every key of codeDictionary, in the order the codes were first registered.
    std::vector<std::string> getAllLogCodes() const;
    // Diagnostic: "Dictionary = %d", "String = %d" at warning priority.
    void status() const;

protected:
    // Creates a section and registers it (initWithDict:codeDict:); subclasses keep
    // the result in their own field, in their fixed order.
    template <class Section>
    std::unique_ptr<Section> createSection() {
        auto section = std::make_unique<Section>();
        section->initWithDict(classDict, codeDictionary);
        return section;
    }

    ClassDictionary classDict;
    CodeDictionary codeDictionary;
};

}  // namespace vantorel
