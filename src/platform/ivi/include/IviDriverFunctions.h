/* The functions of an IVI-C specific function generator driver, as the class driver calls them.
 *
 * A specific driver exports each one as <prefix>_<name>; the first argument of every function
 * but InitWithOptions is the specific driver's session. InitWithOptions, close and error_message
 * are required; a driver that lacks any other answers IVI_ERROR_FUNCTION_NOT_SUPPORTED for it.
 */
#ifndef QZIVI_IVIDRIVERFUNCTIONS_H
#define QZIVI_IVIDRIVERFUNCTIONS_H

#include "IviFgen.h"

/* X(name, parameter list) */
#define QZIVI_SPECIFIC_DRIVER_FUNCTIONS(X)                                                         \
    X(InitWithOptions, (ViRsrc resource, ViBoolean idQuery, ViBoolean reset,                       \
                        ViConstString options, ViSession * vi))                                    \
    X(close, (ViSession vi))                                                                       \
    X(error_message, (ViSession vi, ViStatus status, ViChar message[]))                            \
    X(GetError, (ViSession vi, ViStatus * code, ViInt32 bufferSize, ViChar description[]))         \
    X(GetAttributeViInt32, (ViSession vi, ViConstString channel, ViAttr attr, ViInt32 * value))    \
    X(GetAttributeViReal64, (ViSession vi, ViConstString channel, ViAttr attr, ViReal64 * value))  \
    X(GetAttributeViBoolean,                                                                       \
      (ViSession vi, ViConstString channel, ViAttr attr, ViBoolean * value))                       \
    X(GetAttributeViSession,                                                                       \
      (ViSession vi, ViConstString channel, ViAttr attr, ViSession * value))                       \
    X(GetAttributeViString,                                                                        \
      (ViSession vi, ViConstString channel, ViAttr attr, ViInt32 bufferSize, ViChar value[]))      \
    X(SetAttributeViInt32, (ViSession vi, ViConstString channel, ViAttr attr, ViInt32 value))      \
    X(SetAttributeViReal64, (ViSession vi, ViConstString channel, ViAttr attr, ViReal64 value))    \
    X(SetAttributeViBoolean, (ViSession vi, ViConstString channel, ViAttr attr, ViBoolean value))  \
    X(SetAttributeViSession, (ViSession vi, ViConstString channel, ViAttr attr, ViSession value))  \
    X(SetAttributeViString,                                                                        \
      (ViSession vi, ViConstString channel, ViAttr attr, ViConstString value))                     \
    X(CheckAttributeViInt32, (ViSession vi, ViConstString channel, ViAttr attr, ViInt32 value))    \
    X(CheckAttributeViReal64, (ViSession vi, ViConstString channel, ViAttr attr, ViReal64 value))  \
    X(CheckAttributeViBoolean,                                                                     \
      (ViSession vi, ViConstString channel, ViAttr attr, ViBoolean value))                         \
    X(CheckAttributeViSession,                                                                     \
      (ViSession vi, ViConstString channel, ViAttr attr, ViSession value))                         \
    X(CheckAttributeViString,                                                                      \
      (ViSession vi, ViConstString channel, ViAttr attr, ViConstString value))                     \
    X(ConfigureOutputMode, (ViSession vi, ViInt32 outputMode))                                     \
    X(ConfigureRefClockSource, (ViSession vi, ViInt32 source))                                     \
    X(ConfigureOutputImpedance, (ViSession vi, ViConstString channel, ViReal64 impedance))         \
    X(ConfigureOperationMode, (ViSession vi, ViConstString channel, ViInt32 operationMode))        \
    X(ConfigureOutputEnabled, (ViSession vi, ViConstString channel, ViBoolean enabled))            \
    X(ConfigureStandardWaveform,                                                                   \
      (ViSession vi, ViConstString channel, ViInt32 waveform, ViReal64 amplitude,                  \
       ViReal64 dcOffset, ViReal64 frequency, ViReal64 startPhase))                                \
    X(QueryArbWfmCapabilities,                                                                     \
      (ViSession vi, ViInt32 * maxNumWaveforms, ViInt32 * waveformQuantum,                         \
       ViInt32 * minWaveformSize, ViInt32 * maxWaveformSize))                                      \
    X(CreateArbWaveform, (ViSession vi, ViInt32 size, const ViReal64 data[], ViInt32* handle))     \
    X(ClearArbWaveform, (ViSession vi, ViInt32 handle))                                            \
    X(ConfigureArbWaveform,                                                                        \
      (ViSession vi, ViConstString channel, ViInt32 handle, ViReal64 gain, ViReal64 offset))       \
    X(ConfigureSampleRate, (ViSession vi, ViReal64 sampleRate))                                    \
    X(ConfigureArbFrequency, (ViSession vi, ViConstString channel, ViReal64 frequency))            \
    X(QueryArbSeqCapabilities,                                                                     \
      (ViSession vi, ViInt32 * maxNumSequences, ViInt32 * minSequenceLength,                       \
       ViInt32 * maxSequenceLength, ViInt32 * maxLoopCount))                                       \
    X(CreateArbSequence, (ViSession vi, ViInt32 length, const ViInt32 waveformHandles[],           \
                          const ViInt32 loopCounts[], ViInt32* handle))                            \
    X(ClearArbSequence, (ViSession vi, ViInt32 handle))                                            \
    X(ConfigureArbSequence,                                                                        \
      (ViSession vi, ViConstString channel, ViInt32 handle, ViReal64 gain, ViReal64 offset))       \
    X(ConfigureTriggerSource, (ViSession vi, ViConstString channel, ViInt32 source))               \
    X(ConfigureInternalTriggerRate, (ViSession vi, ViReal64 rate))                                 \
    X(SendSoftwareTrigger, (ViSession vi))                                                         \
    X(ConfigureBurstCount, (ViSession vi, ViConstString channel, ViInt32 count))                   \
    X(ConfigureAMEnabled, (ViSession vi, ViConstString channel, ViBoolean enabled))                \
    X(ConfigureAMSource, (ViSession vi, ViConstString channel, ViInt32 source))                    \
    X(ConfigureAMInternal, (ViSession vi, ViReal64 depth, ViInt32 waveform, ViReal64 frequency))   \
    X(ConfigureFMEnabled, (ViSession vi, ViConstString channel, ViBoolean enabled))                \
    X(ConfigureFMSource, (ViSession vi, ViConstString channel, ViInt32 source))                    \
    X(ConfigureFMInternal,                                                                         \
      (ViSession vi, ViReal64 deviation, ViInt32 waveform, ViReal64 frequency))                    \
    X(InitiateGeneration, (ViSession vi))                                                          \
    X(AbortGeneration, (ViSession vi))                                                             \
    X(GetAttrMinMaxViReal64, (ViSession vi, ViConstString channel, ViAttr attr, ViReal64 * min,    \
                              ViReal64 * max, ViBoolean * hasMin, ViBoolean * hasMax))             \
    X(RenderOutput, (ViSession vi, ViConstString channel, ViReal64 startTime, ViReal64 timeStep,   \
                     ViInt32 count, ViReal64 volts[]))

#endif /* QZIVI_IVIDRIVERFUNCTIONS_H */
