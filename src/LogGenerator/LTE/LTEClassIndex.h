// LTEClassIndex: the LTE decoder's class index with its eleven sections.
#pragma once

#include "LogGenerator/ClassIndex.h"

#include <memory>

namespace vantorel {

class LTEServingCellInfo;
class ConnectedModeMeasurementMisc;
class MeasuredNeighborCells;
class DetectedCells;
class ServingCellMeasurement;
class NeighborMeasurementMisc;
class NeighborCellsList;
class ReselectionCandidatesMisc;
class ReselectionCandidatesList;
class SimInfo;
class PDPContextList;

class LTEClassIndex : public ClassIndex {
public:
    LTEClassIndex();
    ~LTEClassIndex() override;  // also writes "Deallocing LTEClassIndex" to standard output

    // Created in this order, which is the order in which sections sharing a code get a
    // record: 0xB179 reaches the intra-frequency summary, the measured neighbours, then
    // the detected cells; 0xB180 and 0xB186 their summary before their list.
    std::unique_ptr<LTEServingCellInfo> objLTEServingCellInfo;
    std::unique_ptr<ConnectedModeMeasurementMisc> objConnectedModeMeasurementMisc;
    std::unique_ptr<MeasuredNeighborCells> objMeasuredNeighborCells;
    std::unique_ptr<DetectedCells> objDetectedCells;
    std::unique_ptr<ServingCellMeasurement> objServingCellMeasurement;
    std::unique_ptr<NeighborMeasurementMisc> objNeighborMeasurementMisc;
    std::unique_ptr<NeighborCellsList> objNeighborCellsList;
    std::unique_ptr<ReselectionCandidatesMisc> objReselectionCandidatesMisc;
    std::unique_ptr<ReselectionCandidatesList> objReselectionCandidatesList;
    std::unique_ptr<SimInfo> objSimInfo;
    std::unique_ptr<PDPContextList> objPDPContextList;
};

}  // namespace vantorel
