// MVK_GSMClassIndex: the GSM/UMTS decoder's class index with its twenty-six sections.
#pragma once

#include "LogGenerator/ClassIndex.h"

#include <memory>

namespace vantorel {

class ActiveSet;
class CodingScheme;
class GPRSInformation;
class GSMServingCell;
class MobileAllocation;
class NeighboringCells;
class PDPContextList;
class ProcessPS;
class UMTSRRMeasurement;
class CellChangeCounters;
class DetectedSet;
class GSMSet;
class NonRankedGSMSet;
class ProcessCO;
class ServingPLMN;
class UMTSSet;
class EquivalentPLMNList;
class GSMRRInfo;
class MonitoredSet;
class NonRankedUMTSSet;
class ProcessCS;
class UMTSRRInfo;
class BLER;
class VirtualActiveSet;
class SimInfo;
class HSDPAInformation;

class MVK_GSMClassIndex : public ClassIndex {
public:
    MVK_GSMClassIndex();
    ~MVK_GSMClassIndex() override;  // also writes "Deallocing MVK_GSMClassIndex" to standard output

    // Created in this order, which is the order in which sections sharing a code get a
    // record: 0x5137 reaches GPRS Information, GSM Serving Cell, Neighboring Cells, then
    // GSM RR Info; 0x7132 Process PS, Process CO, Serving PLMN, then Process CS; 0x417A
    // the active set before the three sets it empties. Five sections (Coding Scheme, UMTS
    // RR Measurement, Cell Change Counters and the two non-ranked sets) take no record: they
    // own their template keys. The Cell Change Counters member is objCellChangeCounter.
    std::unique_ptr<ActiveSet> objActiveSet;
    std::unique_ptr<CodingScheme> objCodingScheme;
    std::unique_ptr<GPRSInformation> objGPRSInformation;
    std::unique_ptr<GSMServingCell> objGSMServingCell;
    std::unique_ptr<MobileAllocation> objMobileAllocation;
    std::unique_ptr<NeighboringCells> objNeighboringCells;
    std::unique_ptr<PDPContextList> objPDPContextList;
    std::unique_ptr<ProcessPS> objProcessPS;
    std::unique_ptr<UMTSRRMeasurement> objUMTSRRMeasurement;
    std::unique_ptr<CellChangeCounters> objCellChangeCounter;
    std::unique_ptr<DetectedSet> objDetectedSet;
    std::unique_ptr<GSMSet> objGSMSet;
    std::unique_ptr<NonRankedGSMSet> objNonRankedGSMSet;
    std::unique_ptr<ProcessCO> objProcessCO;
    std::unique_ptr<ServingPLMN> objServingPLMN;
    std::unique_ptr<UMTSSet> objUMTSSet;
    std::unique_ptr<EquivalentPLMNList> objEquivalentPLMNList;
    std::unique_ptr<GSMRRInfo> objGSMRRInfo;
    std::unique_ptr<MonitoredSet> objMonitoredSet;
    std::unique_ptr<NonRankedUMTSSet> objNonRankedUMTSSet;
    std::unique_ptr<ProcessCS> objProcessCS;
    std::unique_ptr<UMTSRRInfo> objUMTSRRInfo;
    std::unique_ptr<BLER> objBLER;
    std::unique_ptr<VirtualActiveSet> objVirtualActiveSet;
    std::unique_ptr<SimInfo> objSimInfo;
    std::unique_ptr<HSDPAInformation> objHSDPAInformation;
};

}  // namespace vantorel
