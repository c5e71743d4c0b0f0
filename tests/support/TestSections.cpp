// TestSections: the test-only class index, sections and template-driven generator that the decoder framework's tests route built records to.
#include "support/TestSections.h"

#include "Platform/ByteReader.h"
#include "Platform/ResourceBundle.h"
#include "Platform/StringFormat.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel::testing {

void TestValueSection::updateWithData(ByteView data, int32_t logCode) {
    calls.push_back(logCode);
    lengths.push_back(data.size());
    if (logCode != kValueCode && logCode != kSharedCode) return;
    const ByteReader r(data);
    if (r.has(13, 1)) setValue("Counter", StringFormat::format("%d", r.u8(13).value_or(0)));
}

void TestListSection::updateWithData(ByteView data, int32_t logCode) {
    calls.push_back(logCode);
    const ByteReader r(data);
    if (logCode == kListExtraCode) {
        if (r.has(13, 1) && r.u8(13).value_or(0) == 0xEE) throw SectionError("payload byte 13 is 0xEE");
        return;
    }
    auto list = Array::create();
    for (size_t i = 13; i < r.size(); ++i) list->append(StringFormat::format("%d", r.u8(i).value_or(0)));
    replaceSectionArray(*list);
}

TestClassIndex::TestClassIndex() {
    values = createSection<TestValueSection>();
    list = createSection<TestListSection>();
}

TestLogGenerator::TestLogGenerator() : MVKLogGenerator2("TestTemplate", std::make_unique<TestClassIndex>()) {}

TestTemplates::TestTemplates() { ResourceBundle::setDirectory(VANTOREL_TEST_DATA_DIR "/templates"); }
TestTemplates::~TestTemplates() { ResourceBundle::setDirectory(""); }

}  // namespace vantorel::testing
