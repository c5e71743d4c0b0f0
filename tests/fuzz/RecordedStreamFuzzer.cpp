// Fuzz target: any recorded file's bytes through RecordedStream: format detection, then the reader it picks.
#include "FuzzSupport.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Replay/DlfReader.h"
#include "TelephonyService/Replay/RecordedStream.h"

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const ByteView input(data, size);
    const RecordedStream stream = RecordedStream::fromBytes(input, kTSLogChannelTechnology_Morvek_UTRAN2);
    FUZZ_CHECK(stream.format() == RecordedStream::detect(input));
    (void)stream.summary();
    // Without an override, the serving-cell records name the technologies: spans in order.
    const RecordedStream detected = RecordedStream::fromBytes(input);
    (void)detected.summary();
    const auto& spans = detected.technologySpans();
    for (size_t i = 0; i < spans.size(); ++i)
        FUZZ_CHECK((i == 0 ? spans[i].from == 0 : spans[i].from > spans[i - 1].from) && !spans[i].technology.empty());
    // QMDL and DLF records reach the decoders as ordinary records with message id 0; only
    // a DLF our own writer made, led by its version report, also holds extra records.
    const ByteReader r(input);
    const bool ownDlf = stream.format() == RecordedStream::Format::Dlf &&
                        r.u16(0) == DlfReader::kOwnVersionReportLength &&
                        r.u16(2) == uint16_t{LogCode::kDlfVersionReport};
    if (stream.format() != RecordedStream::Format::Capture)
        for (const TimedMessage& m : stream.messages())
            FUZZ_CHECK(m.messageId == 0 && !m.data.empty() &&
                       (m.data[0] == LogCode::kOrdinaryType || (ownDlf && m.data[0] == LogCode::kExtraType)));
    return 0;
}
