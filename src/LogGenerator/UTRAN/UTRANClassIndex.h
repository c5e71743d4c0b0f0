// UTRANClassIndex: the UTRAN decoder's class index with its eight sections.
#pragma once

#include "LogGenerator/ClassIndex.h"

#include <memory>

namespace vantorel {

class RRC_State;
class UTRANServingCellInfo;
class UTRANNeighbhorMeasurements;
class GSMNeighbhorMeasurements;
class TRCHBLERMeasurement;
class CCTRCHSIRMeasurement;
class PDPContextList;
class SimInfo;

class UTRANClassIndex : public ClassIndex {
public:
    UTRANClassIndex();
    ~UTRANClassIndex() override;

    // Created in this order, so 0xD00C reaches "TRCH BLER" before "CCTRCH SIR".
    std::unique_ptr<RRC_State> rrc_state;
    std::unique_ptr<UTRANServingCellInfo> servingCellInfo;
    std::unique_ptr<UTRANNeighbhorMeasurements> tdMeasurements;
    std::unique_ptr<GSMNeighbhorMeasurements> gsmMeasurements;
    std::unique_ptr<TRCHBLERMeasurement> trchMeasurements;
    std::unique_ptr<CCTRCHSIRMeasurement> cctrchMeasurements;
    std::unique_ptr<PDPContextList> pdpList;
    std::unique_ptr<SimInfo> simInfo;
};

}  // namespace vantorel
