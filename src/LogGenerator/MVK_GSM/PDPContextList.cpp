// PDPContextList: the "PDP Context Info" list section: the packet-data contexts of the 0xFF0002 extra record, shown as the modem sent them.
#include "LogGenerator/MVK_GSM/PDPContextList.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"

namespace vantorel {

std::string PDPContextList::getSectionName() const { return "PDP Context Info"; }

std::vector<int32_t> PDPContextList::getLogCodeArray() const { return {LogCode::kPDPContexts}; }

// The code is not checked: 0xFF0002 is the only one routed here. The payload (offset 13
// to the end) is a property list whose root should be an array of context
// dictionaries; anything else, or a payload that does not parse, leaves the list as it
// was (no clearing first).
void PDPContextList::updateWithData(ByteView data, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "PDPContextList");
    rebuildList(data, 0, false, [](const ByteReader& r) -> ArrayRef {
        const PropertyListResult parsed = parseExtraPayload(r.bytes());
        return parsed ? parsed.value->asArray() : nullptr;
    });
}

}  // namespace vantorel
