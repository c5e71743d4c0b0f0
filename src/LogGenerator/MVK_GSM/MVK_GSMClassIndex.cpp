// MVK_GSMClassIndex: the GSM/UMTS decoder's sections: cell sets, serving cells, radio resources, link quality, mobility management, packet data and SIM files.
#include "LogGenerator/MVK_GSM/MVK_GSMClassIndex.h"

#include "LogGenerator/MVK_GSM/ActiveSet.h"
#include "LogGenerator/MVK_GSM/BLER.h"
#include "LogGenerator/MVK_GSM/CellChangeCounters.h"
#include "LogGenerator/MVK_GSM/CodingScheme.h"
#include "LogGenerator/MVK_GSM/DetectedSet.h"
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"
#include "LogGenerator/MVK_GSM/GPRSInformation.h"
#include "LogGenerator/MVK_GSM/GSMRRInfo.h"
#include "LogGenerator/MVK_GSM/GSMServingCell.h"
#include "LogGenerator/MVK_GSM/GSMSet.h"
#include "LogGenerator/MVK_GSM/HSDPAInformation.h"
#include "LogGenerator/MVK_GSM/MobileAllocation.h"
#include "LogGenerator/MVK_GSM/MonitoredSet.h"
#include "LogGenerator/MVK_GSM/NeighboringCells.h"
#include "LogGenerator/MVK_GSM/NonRankedGSMSet.h"
#include "LogGenerator/MVK_GSM/NonRankedUMTSSet.h"
#include "LogGenerator/MVK_GSM/PDPContextList.h"
#include "LogGenerator/MVK_GSM/ProcessCO.h"
#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "LogGenerator/MVK_GSM/ProcessPS.h"
#include "LogGenerator/MVK_GSM/ServingPLMN.h"
#include "LogGenerator/MVK_GSM/SimInfo.h"
#include "LogGenerator/MVK_GSM/UMTSRRInfo.h"
#include "LogGenerator/MVK_GSM/UMTSRRMeasurement.h"
#include "LogGenerator/MVK_GSM/UMTSSet.h"
#include "LogGenerator/MVK_GSM/VirtualActiveSet.h"

#include <cstdio>

namespace vantorel {

MVK_GSMClassIndex::MVK_GSMClassIndex() {
    objActiveSet = createSection<ActiveSet>();
    objCodingScheme = createSection<CodingScheme>();
    objGPRSInformation = createSection<GPRSInformation>();
    objGSMServingCell = createSection<GSMServingCell>();
    objMobileAllocation = createSection<MobileAllocation>();
    objNeighboringCells = createSection<NeighboringCells>();
    objPDPContextList = createSection<PDPContextList>();
    objProcessPS = createSection<ProcessPS>();
    objUMTSRRMeasurement = createSection<UMTSRRMeasurement>();
    objCellChangeCounter = createSection<CellChangeCounters>();
    objDetectedSet = createSection<DetectedSet>();
    objGSMSet = createSection<GSMSet>();
    objNonRankedGSMSet = createSection<NonRankedGSMSet>();
    objProcessCO = createSection<ProcessCO>();
    objServingPLMN = createSection<ServingPLMN>();
    objUMTSSet = createSection<UMTSSet>();
    objEquivalentPLMNList = createSection<EquivalentPLMNList>();
    objGSMRRInfo = createSection<GSMRRInfo>();
    objMonitoredSet = createSection<MonitoredSet>();
    objNonRankedUMTSSet = createSection<NonRankedUMTSSet>();
    objProcessCS = createSection<ProcessCS>();
    objUMTSRRInfo = createSection<UMTSRRInfo>();
    objBLER = createSection<BLER>();
    objVirtualActiveSet = createSection<VirtualActiveSet>();
    objSimInfo = createSection<SimInfo>();
    objHSDPAInformation = createSection<HSDPAInformation>();
}

MVK_GSMClassIndex::~MVK_GSMClassIndex() {
    std::printf("Deallocing MVK_GSMClassIndex\n");
    // Released in the order of creation, then the base's teardown.
    objActiveSet.reset();
    objCodingScheme.reset();
    objGPRSInformation.reset();
    objGSMServingCell.reset();
    objMobileAllocation.reset();
    objNeighboringCells.reset();
    objPDPContextList.reset();
    objProcessPS.reset();
    objUMTSRRMeasurement.reset();
    objCellChangeCounter.reset();
    objDetectedSet.reset();
    objGSMSet.reset();
    objNonRankedGSMSet.reset();
    objProcessCO.reset();
    objServingPLMN.reset();
    objUMTSSet.reset();
    objEquivalentPLMNList.reset();
    objGSMRRInfo.reset();
    objMonitoredSet.reset();
    objNonRankedUMTSSet.reset();
    objProcessCS.reset();
    objUMTSRRInfo.reset();
    objBLER.reset();
    objVirtualActiveSet.reset();
    objSimInfo.reset();
    objHSDPAInformation.reset();
}

}  // namespace vantorel
