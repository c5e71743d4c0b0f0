// CodingScheme: the "Coding Scheme" section (no log codes; owns its template key).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class CodingScheme : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel
