// TestSections: a test-only class index with two small sections that the decoder framework's tests route built records to.
#pragma once

#include "LogGenerator/Base.h"
#include "LogGenerator/ClassIndex.h"
#include "LogGenerator/MVKLogGenerator2.h"

#include <memory>
#include <string>
#include <vector>

namespace vantorel::testing {

inline constexpr uint16_t kValueCode = 0x1234;     // TestValueSection's ordinary code
inline constexpr uint16_t kSharedCode = 0x5678;    // both sections
inline constexpr int32_t kListExtraCode = 0xFF0001;  // TestListSection's extra code

// "Test Values": "Counter" = payload byte 13 for kValueCode and kSharedCode; records every call.
class TestValueSection : public Base {
public:
    std::string getSectionName() const override { return "Test Values"; }
    std::vector<int32_t> getLogCodeArray() const override { return {kValueCode, kSharedCode}; }
    void updateWithData(ByteView data, int32_t logCode) override;

    std::vector<int32_t> calls;
    std::vector<size_t> lengths;
};

// "Test List": one entry per payload byte of kSharedCode; the extra code throws when its byte 13 is 0xEE.
class TestListSection : public Base {
public:
    std::string getSectionName() const override { return "Test List"; }
    std::vector<int32_t> getLogCodeArray() const override { return {kSharedCode, kListExtraCode}; }
    void updateWithData(ByteView data, int32_t logCode) override;

    std::vector<int32_t> calls;
};

class TestClassIndex : public ClassIndex {
public:
    TestClassIndex();
    std::unique_ptr<TestValueSection> values;
    std::unique_ptr<TestListSection> list;
};

// A template-driven generator on "TestTemplate" (tests/data/templates) with a TestClassIndex.
class TestLogGenerator : public MVKLogGenerator2 {
public:
    TestLogGenerator();
    TestClassIndex& index() { return *static_cast<TestClassIndex*>(classIndex()); }
};

// Points the resource bundle at tests/data/templates while it lives.
class TestTemplates {
public:
    TestTemplates();
    ~TestTemplates();
};

}  // namespace vantorel::testing
