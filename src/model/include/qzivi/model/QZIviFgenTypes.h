// The public enumerations of the object model: the values its properties take, with the names
// the system gives them.
#pragma once

#include <cstdint>

namespace qzivi {

enum QZIviFgenUIStyleTypes : std::int32_t {
    qzivifgenInvisibleAtRuntime = 0,
    qzivifgenAllowControl = 1,
    qzivifgenDisplayOnly = 2,
};

enum QZIviFgenOutputModes : std::int32_t {
    qzivifgenOutputFunc = 0,
    qzivifgenOutputArb = 1,
    qzivifgenOutputSeq = 2,
};

enum QZIviFgenRefClockSources : std::int32_t {
    qzivifgenRefClockInternal = 0,
    qzivifgenRefClockExternal = 1,
    qzivifgenRefClockRTSIClock = 101,
};

enum QZIviFgenExtensions : std::int32_t {
    qzivifgenNoExt = 0,
    qzivifgenStdFuncExt = 1,
    qzivifgenArbWfmExt = 2,
    qzivifgenArbFrequencyExt = 4,
    qzivifgenArbSeqExt = 8,
    qzivifgenTriggerExt = 16,
    qzivifgenInternalTriggerExt = 32,
    qzivifgenSoftwareTriggerExt = 64,
    qzivifgenBurstExt = 128,
    qzivifgenModulateAMExt = 256,
    qzivifgenModulateFMExt = 512,
};

enum QZIviFgenAMSources : std::int32_t { qzivifgenAMInternal = 0, qzivifgenAMExternal = 1 };

enum QZIviFgenFuncWaveforms : std::int32_t {
    qzivifgenWaveformSine = 1,
    qzivifgenWaveformSquare = 2,
    qzivifgenWaveformTriangle = 3,
    qzivifgenWaveformRampUp = 4,
    qzivifgenWaveformRampDown = 5,
    qzivifgenWaveformDC = 6,
};

enum QZIviFgenTriggerSources : std::int32_t {
    qzivifgenExternalTrigger = 1,
    qzivifgenSoftwareTrigger = 2,
    qzivifgenInternalTrigger = 3,
    qzivifgenTTL0 = 111,
    qzivifgenTTL1 = 112,
    qzivifgenTTL2 = 113,
    qzivifgenTTL3 = 114,
    qzivifgenTTL4 = 115,
    qzivifgenTTL5 = 116,
    qzivifgenTTL6 = 117,
    qzivifgenTTL7 = 118,
    qzivifgenECL0 = 119,
    qzivifgenECL1 = 120,
    qzivifgenPXIStar = 131,
    qzivifgenRTSI0 = 141,
    qzivifgenRTSI1 = 142,
    qzivifgenRTSI2 = 143,
    qzivifgenRTSI3 = 144,
    qzivifgenRTSI4 = 145,
    qzivifgenRTSI5 = 146,
    qzivifgenRTSI6 = 147,
};

enum QZIviFgenAMInternalWaveforms : std::int32_t {
    qzivifgenAMInternalSine = 1,
    qzivifgenAMInternalSquare = 2,
    qzivifgenAMInternalTriangle = 3,
    qzivifgenAMInternalRampUp = 4,
    qzivifgenAMInternalRampDown = 5,
    qzivifgenAMInternalDC = 6,
};

enum QZIviFgenFMInternalWaveforms : std::int32_t {
    qzivifgenFMInternalSine = 1,
    qzivifgenFMInternalSquare = 2,
    qzivifgenFMInternalTriangle = 3,
    qzivifgenFMInternalRampUp = 4,
    qzivifgenFMInternalRampDown = 5,
    qzivifgenFMInternalDC = 6,
};

enum QZIviFgenWaveformSources : std::int32_t {
    qzivifgenpersisted = 0,
    qzivifgenASCIIFile = 1,
    qzivifgen2ByteInteger = 2,
    qzivifgen4ByteInteger = 3,
};

enum QZIviFgenAutoNormalizeModes : std::int32_t {
    qzivifgenNoAutoNormalize = 0,
    qzivifgenNormalize = 1,
    qzivifgenNormalizeAndRemoveOffset = 2,
};

} // namespace qzivi
