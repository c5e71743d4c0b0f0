// LTEClassIndex: the LTE decoder's sections: serving cell and measurements, neighbours, reselection, SIM files and PDP contexts.
#include "LogGenerator/LTE/LTEClassIndex.h"

#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"
#include "LogGenerator/LTE/DetectedCells.h"
#include "LogGenerator/LTE/LTEServingCellInfo.h"
#include "LogGenerator/LTE/MeasuredNeighborCells.h"
#include "LogGenerator/LTE/NeighborCellsList.h"
#include "LogGenerator/LTE/NeighborMeasurementMisc.h"
#include "LogGenerator/LTE/ReselectionCandidatesList.h"
#include "LogGenerator/LTE/ReselectionCandidatesMisc.h"
#include "LogGenerator/LTE/ServingCellMeasurement.h"
#include "LogGenerator/MVK_GSM/PDPContextList.h"
#include "LogGenerator/MVK_GSM/SimInfo.h"

#include <cstdio>

namespace vantorel {

LTEClassIndex::LTEClassIndex() {
    objLTEServingCellInfo = createSection<LTEServingCellInfo>();
    objConnectedModeMeasurementMisc = createSection<ConnectedModeMeasurementMisc>();
    objMeasuredNeighborCells = createSection<MeasuredNeighborCells>();
    objDetectedCells = createSection<DetectedCells>();
    objServingCellMeasurement = createSection<ServingCellMeasurement>();
    objNeighborMeasurementMisc = createSection<NeighborMeasurementMisc>();
    objNeighborCellsList = createSection<NeighborCellsList>();
    objReselectionCandidatesMisc = createSection<ReselectionCandidatesMisc>();
    objReselectionCandidatesList = createSection<ReselectionCandidatesList>();
    objSimInfo = createSection<SimInfo>();
    objPDPContextList = createSection<PDPContextList>();
}

LTEClassIndex::~LTEClassIndex() {
    std::printf("Deallocing LTEClassIndex\n");
    // Released in field order, then the base's teardown.
    objLTEServingCellInfo.reset();
    objConnectedModeMeasurementMisc.reset();
    objMeasuredNeighborCells.reset();
    objDetectedCells.reset();
    objServingCellMeasurement.reset();
    objNeighborMeasurementMisc.reset();
    objNeighborCellsList.reset();
    objReselectionCandidatesMisc.reset();
    objReselectionCandidatesList.reset();
    objSimInfo.reset();
    objPDPContextList.reset();
}

}  // namespace vantorel
