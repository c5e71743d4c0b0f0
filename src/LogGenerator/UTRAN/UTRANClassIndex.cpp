// UTRANClassIndex: the UTRAN decoder's sections: six UTRAN ones, the PDP contexts and the SIM files.
#include "LogGenerator/UTRAN/UTRANClassIndex.h"

#include "LogGenerator/MVK_GSM/PDPContextList.h"
#include "LogGenerator/MVK_GSM/SimInfo.h"
#include "LogGenerator/UTRAN/CCTRCHSIRMeasurement.h"
#include "LogGenerator/UTRAN/GSMNeighbhorMeasurements.h"
#include "LogGenerator/UTRAN/RRC_State.h"
#include "LogGenerator/UTRAN/TRCHBLERMeasurement.h"
#include "LogGenerator/UTRAN/UTRANNeighbhorMeasurements.h"
#include "LogGenerator/UTRAN/UTRANServingCellInfo.h"

namespace vantorel {

UTRANClassIndex::UTRANClassIndex() {
    rrc_state = createSection<RRC_State>();
    servingCellInfo = createSection<UTRANServingCellInfo>();
    tdMeasurements = createSection<UTRANNeighbhorMeasurements>();
    gsmMeasurements = createSection<GSMNeighbhorMeasurements>();
    trchMeasurements = createSection<TRCHBLERMeasurement>();
    cctrchMeasurements = createSection<CCTRCHSIRMeasurement>();
    pdpList = createSection<PDPContextList>();
    simInfo = createSection<SimInfo>();
}

UTRANClassIndex::~UTRANClassIndex() {
    // Released in field order, then the base's teardown.
    rrc_state.reset();
    servingCellInfo.reset();
    tdMeasurements.reset();
    gsmMeasurements.reset();
    trchMeasurements.reset();
    cctrchMeasurements.reset();
    pdpList.reset();
    simInfo.reset();
}

}  // namespace vantorel
