// ClassIndex: the section registry and log-code router of a decoder.
#include "LogGenerator/ClassIndex.h"

#include "Platform/SystemLog.h"

#include <cstdio>

namespace vantorel {

ClassIndex::ClassIndex() = default;

ClassIndex::~ClassIndex() {
    std::printf("Deallocing ClassIndex\n");
    std::fflush(stdout);
}

Base* ClassIndex::getClass(const std::string& sectionName) const {
    auto it = classDict.find(sectionName);
    return it == classDict.end() ? nullptr : it->second;
}

const SectionList* ClassIndex::getSubscribers(int32_t logCode) const {
    return codeDictionary.find(std::to_string(logCode));
}

std::vector<std::string> ClassIndex::getAllLogCodes() const { return codeDictionary.keys(); }

void ClassIndex::status() const {
    // classDict is always a dictionary here; the second line keeps the original's check.
    SystemLog::log(SystemLog::kWarning, "Dictionary = %d", 1);
    SystemLog::log(SystemLog::kWarning, "String = %d", 0);
}

}  // namespace vantorel
