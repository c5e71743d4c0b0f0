// MonitoredSet: the "Monitored Set" section, fed by the searcher record 0x417A but always empty.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class MonitoredSet : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel
