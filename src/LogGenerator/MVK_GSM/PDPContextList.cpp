// PDPContextList: Part 5.2's "PDP Context Info" list section: the packet-data contexts of the 0xFF0002 extra record, shown as the modem sent them.
#include "LogGenerator/MVK_GSM/PDPContextList.h"

#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"

namespace vantorel {

namespace {
constexpr int32_t kPDPContexts = 0xFF0002;
}  // namespace

std::string PDPContextList::getSectionName() const { return "PDP Context Info"; }

std::vector<int32_t> PDPContextList::getLogCodeArray() const { return {kPDPContexts}; }

// Part 5.2: the code is not checked. The payload (offset 13 to the end) is a property
// list whose root should be an array of context dictionaries; anything else, or a
// payload that does not parse, leaves the list as it was.
void PDPContextList::updateWithData(ByteView data, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "PDPContextList");
    const PropertyListResult parsed = parseExtraPayload(data);
    if (!parsed) return;
    const ArrayRef contexts = parsed.value->asArray();
    if (!contexts) return;
    replaceSectionArray(*contexts);
}

}  // namespace vantorel
