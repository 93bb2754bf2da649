/* The IviFgen class driver and Ivi engine C interface, as this project provides it on Linux.
 *
 * Written from the published IVI class values: types, attribute ids, attribute values and
 * status codes. Every function returns a ViStatus: 0 success, negative an error, positive a
 * warning. Channel names are the names an application uses; the class driver translates
 * virtual names of the configuration store to the specific driver's physical names.
 */
#ifndef QZIVI_IVIFGEN_H
#define QZIVI_IVIFGEN_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#if defined(__GNUC__)
#define QZIVI_EXPORT __attribute__((visibility("default")))
#else
#define QZIVI_EXPORT
#endif

/* ---- Types ---------------------------------------------------------------------------------- */

typedef int32_t ViInt32;
typedef uint32_t ViUInt32;
typedef int16_t ViInt16;
typedef uint16_t ViBoolean;
typedef double ViReal64;
typedef char ViChar;
typedef ViInt32 ViStatus;
typedef ViUInt32 ViSession;
typedef ViUInt32 ViAttr;
typedef const ViChar* ViConstString;
typedef const ViChar* ViRsrc;
typedef ViChar* ViString;

#define VI_TRUE ((ViBoolean)1)
#define VI_FALSE ((ViBoolean)0)
#define VI_NULL 0
#define VI_SUCCESS ((ViStatus)0)

/* ---- Status codes --------------------------------------------------------------------------- */

#define IVI_STATUS_CODE(c) ((ViStatus)(ViUInt32)(c))

#define IVI_ERROR_CANNOT_RECOVER IVI_STATUS_CODE(0xBFFA0000u)
#define IVI_ERROR_INSTRUMENT_STATUS IVI_STATUS_CODE(0xBFFA0001u)
#define IVI_ERROR_CANNOT_OPEN_FILE IVI_STATUS_CODE(0xBFFA0002u)
#define IVI_ERROR_READING_FILE IVI_STATUS_CODE(0xBFFA0003u)
#define IVI_ERROR_INVALID_ATTRIBUTE IVI_STATUS_CODE(0xBFFA000Cu)
#define IVI_ERROR_ATTR_NOT_WRITABLE IVI_STATUS_CODE(0xBFFA000Du)
#define IVI_ERROR_ATTR_NOT_READABLE IVI_STATUS_CODE(0xBFFA000Eu)
#define IVI_ERROR_INVALID_VALUE IVI_STATUS_CODE(0xBFFA0010u)
#define IVI_ERROR_FUNCTION_NOT_SUPPORTED IVI_STATUS_CODE(0xBFFA0011u)
#define IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED IVI_STATUS_CODE(0xBFFA0012u)
#define IVI_ERROR_VALUE_NOT_SUPPORTED IVI_STATUS_CODE(0xBFFA0013u)
#define IVI_ERROR_TYPES_DO_NOT_MATCH IVI_STATUS_CODE(0xBFFA0015u)
#define IVI_ERROR_NOT_INITIALIZED IVI_STATUS_CODE(0xBFFA001Du)
#define IVI_ERROR_UNKNOWN_CHANNEL_NAME IVI_STATUS_CODE(0xBFFA0020u)
#define IVI_ERROR_CHANNEL_NAME_REQUIRED IVI_STATUS_CODE(0xBFFA0044u)
#define IVI_ERROR_BAD_OPTION_NAME IVI_STATUS_CODE(0xBFFA0049u)
#define IVI_ERROR_BAD_OPTION_VALUE IVI_STATUS_CODE(0xBFFA004Au)
#define IVI_ERROR_OUT_OF_MEMORY IVI_STATUS_CODE(0xBFFA0056u)
#define IVI_ERROR_NULL_POINTER IVI_STATUS_CODE(0xBFFA0058u)
#define IVI_ERROR_BUFFER_TOO_SMALL IVI_STATUS_CODE(0xBFFA0059u)
/* Configuration store and driver loading (class driver). */
#define IVI_ERROR_LOGICAL_NAME_NOT_FOUND IVI_STATUS_CODE(0xBFFA1101u)
#define IVI_ERROR_CONFIG_STORE_INVALID IVI_STATUS_CODE(0xBFFA1102u)
#define IVI_ERROR_CANNOT_LOAD_MODULE IVI_STATUS_CODE(0xBFFA1103u)
#define IVI_ERROR_MODULE_FUNCTION_MISSING IVI_STATUS_CODE(0xBFFA1104u)
#define IVI_ERROR_FILE_NOT_SECURE IVI_STATUS_CODE(0xBFFA1105u)
#define IVI_ERROR_TOO_MANY_SESSIONS IVI_STATUS_CODE(0xBFFA1106u)
#define IVI_ERROR_INVALID_SESSION_HANDLE IVI_STATUS_CODE(0xBFFA1190u)
/* Function generator class errors. */
#define IVIFGEN_ERROR_TRIGGER_NOT_SOFTWARE IVI_STATUS_CODE(0xBFFA1001u)
#define IVIFGEN_ERROR_NO_WFMS_AVAILABLE IVI_STATUS_CODE(0xBFFA2004u)
#define IVIFGEN_ERROR_WFM_IN_USE IVI_STATUS_CODE(0xBFFA2008u)
#define IVIFGEN_ERROR_NO_SEQS_AVAILABLE IVI_STATUS_CODE(0xBFFA2009u)
#define IVIFGEN_ERROR_SEQ_IN_USE IVI_STATUS_CODE(0xBFFA200Au)
#define IVIFGEN_ERROR_NOT_GENERATING IVI_STATUS_CODE(0xBFFA200Bu)
/* I/O failures of drivers that talk to instruments, with VISA's numbers. */
#define VI_ERROR_RSRC_NFOUND IVI_STATUS_CODE(0xBFFF0011u)
#define VI_ERROR_TMO IVI_STATUS_CODE(0xBFFF0015u)
#define VI_ERROR_IO IVI_STATUS_CODE(0xBFFF003Eu)
#define VI_ERROR_CONN_LOST IVI_STATUS_CODE(0xBFFF00A6u)
/* Warnings. */
#define IVI_WARN_NSUP_ID_QUERY IVI_STATUS_CODE(0x3FFA0065u)
#define IVI_WARN_NSUP_RESET IVI_STATUS_CODE(0x3FFA0066u)
#define IVI_WARN_VALUE_COERCED IVI_STATUS_CODE(0x3FFA4001u)

/* ---- Attribute ids --------------------------------------------------------------------------- */

/* Engine attributes. */
#define IVI_ATTR_SIMULATE 1050005
#define IVI_ATTR_DRIVER_SETUP 1050007
#define IVI_ATTR_PRIMARY_ERROR 1050101
#define IVI_ATTR_ERROR_ELABORATION 1050103
#define IVI_ATTR_CHANNEL_COUNT 1050203
#define IVI_ATTR_SPECIFIC_DRIVER_PREFIX 1050302
#define IVI_ATTR_IO_RESOURCE_DESCRIPTOR 1050304
#define IVI_ATTR_LOGICAL_NAME 1050305
#define IVI_ATTR_GROUP_CAPABILITIES 1050401
#define IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION 1050503
#define IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION 1050504
#define IVI_ATTR_INSTRUMENT_MANUFACTURER 1050511
#define IVI_ATTR_INSTRUMENT_MODEL 1050512
#define IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION 1050514
#define IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION 1050515
#define IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION 1050516
/* This class driver's own: where the session's driver module was loaded from. */
#define QZIVI_ATTR_DRIVER_MODULE 1059001

/* Base. */
#define IVIFGEN_ATTR_OUTPUT_MODE 1250001
#define IVIFGEN_ATTR_REF_CLOCK_SOURCE 1250002
#define IVIFGEN_ATTR_OUTPUT_ENABLED 1250003
#define IVIFGEN_ATTR_OUTPUT_IMPEDANCE 1250004
#define IVIFGEN_ATTR_OPERATION_MODE 1250005
/* Standard function. */
#define IVIFGEN_ATTR_FUNC_WAVEFORM 1250101
#define IVIFGEN_ATTR_FUNC_AMPLITUDE 1250102
#define IVIFGEN_ATTR_FUNC_DC_OFFSET 1250103
#define IVIFGEN_ATTR_FUNC_FREQUENCY 1250104
#define IVIFGEN_ATTR_FUNC_START_PHASE 1250105
#define IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH 1250106
/* Arbitrary waveform, frequency and sequence. */
#define IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE 1250201
#define IVIFGEN_ATTR_ARB_GAIN 1250202
#define IVIFGEN_ATTR_ARB_OFFSET 1250203
#define IVIFGEN_ATTR_ARB_SAMPLE_RATE 1250204
#define IVIFGEN_ATTR_MAX_NUM_WAVEFORMS 1250205
#define IVIFGEN_ATTR_WAVEFORM_QUANTUM 1250206
#define IVIFGEN_ATTR_MIN_WAVEFORM_SIZE 1250207
#define IVIFGEN_ATTR_MAX_WAVEFORM_SIZE 1250208
#define IVIFGEN_ATTR_ARB_FREQUENCY 1250209
#define IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE 1250211
#define IVIFGEN_ATTR_MAX_NUM_SEQUENCES 1250212
#define IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH 1250213
#define IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH 1250214
#define IVIFGEN_ATTR_MAX_LOOP_COUNT 1250215
/* Trigger and burst. */
#define IVIFGEN_ATTR_TRIGGER_SOURCE 1250302
#define IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE 1250310
#define IVIFGEN_ATTR_BURST_COUNT 1250350
/* Amplitude modulation. */
#define IVIFGEN_ATTR_AM_ENABLED 1250401
#define IVIFGEN_ATTR_AM_SOURCE 1250402
#define IVIFGEN_ATTR_AM_INTERNAL_DEPTH 1250403
#define IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM 1250404
#define IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY 1250405
/* Frequency modulation. */
#define IVIFGEN_ATTR_FM_ENABLED 1250501
#define IVIFGEN_ATTR_FM_SOURCE 1250502
#define IVIFGEN_ATTR_FM_INTERNAL_DEVIATION 1250503
#define IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM 1250504
#define IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY 1250505

/* ---- Attribute values ------------------------------------------------------------------------ */

#define IVIFGEN_VAL_OUTPUT_FUNC 0
#define IVIFGEN_VAL_OUTPUT_ARB 1
#define IVIFGEN_VAL_OUTPUT_SEQ 2

#define IVIFGEN_VAL_REF_CLOCK_INTERNAL 0
#define IVIFGEN_VAL_REF_CLOCK_EXTERNAL 1
#define IVIFGEN_VAL_REF_CLOCK_RTSI_CLOCK 101

#define IVIFGEN_VAL_OPERATE_CONTINUOUS 0
#define IVIFGEN_VAL_OPERATE_BURST 1

#define IVIFGEN_VAL_WFM_SINE 1
#define IVIFGEN_VAL_WFM_SQUARE 2
#define IVIFGEN_VAL_WFM_TRIANGLE 3
#define IVIFGEN_VAL_WFM_RAMP_UP 4
#define IVIFGEN_VAL_WFM_RAMP_DOWN 5
#define IVIFGEN_VAL_WFM_DC 6

#define IVIFGEN_VAL_ALL_WAVEFORMS (-1)
#define IVIFGEN_VAL_ALL_SEQUENCES (-1)

#define IVIFGEN_VAL_EXTERNAL 1
#define IVIFGEN_VAL_SOFTWARE_TRIG 2
#define IVIFGEN_VAL_INTERNAL_TRIGGER 3
#define IVIFGEN_VAL_TTL0 111
#define IVIFGEN_VAL_TTL7 118
#define IVIFGEN_VAL_ECL0 119
#define IVIFGEN_VAL_ECL1 120
#define IVIFGEN_VAL_PXI_STAR 131
#define IVIFGEN_VAL_RTSI_0 141
#define IVIFGEN_VAL_RTSI_6 147

#define IVIFGEN_VAL_AM_INTERNAL 0
#define IVIFGEN_VAL_AM_EXTERNAL 1
#define IVIFGEN_VAL_FM_INTERNAL 0
#define IVIFGEN_VAL_FM_EXTERNAL 1

/* ---- Class driver ---------------------------------------------------------------------------- */

QZIVI_EXPORT ViStatus IviFgen_InitWithOptions(ViRsrc logicalName, ViBoolean idQuery,
                                              ViBoolean reset, ViConstString optionString,
                                              ViSession* vi);
QZIVI_EXPORT ViStatus IviFgen_close(ViSession vi);
QZIVI_EXPORT ViStatus IviFgen_GetSpecificDriverCHandle(ViSession vi, ViSession* specificVi);
/* message holds 256 characters. */
QZIVI_EXPORT ViStatus IviFgen_error_message(ViSession vi, ViStatus status, ViChar message[]);
QZIVI_EXPORT ViStatus IviFgen_GetError(ViSession vi, ViStatus* code, ViInt32 bufferSize,
                                       ViChar description[]);

QZIVI_EXPORT ViStatus IviFgen_GetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                                  ViInt32* value);
QZIVI_EXPORT ViStatus IviFgen_GetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                                   ViReal64* value);
QZIVI_EXPORT ViStatus IviFgen_GetAttributeViBoolean(ViSession vi, ViConstString channel,
                                                    ViAttr attr, ViBoolean* value);
QZIVI_EXPORT ViStatus IviFgen_GetAttributeViSession(ViSession vi, ViConstString channel,
                                                    ViAttr attr, ViSession* value);
QZIVI_EXPORT ViStatus IviFgen_GetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                                   ViInt32 bufferSize, ViChar value[]);
QZIVI_EXPORT ViStatus IviFgen_SetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                                  ViInt32 value);
QZIVI_EXPORT ViStatus IviFgen_SetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                                   ViReal64 value);
QZIVI_EXPORT ViStatus IviFgen_SetAttributeViBoolean(ViSession vi, ViConstString channel,
                                                    ViAttr attr, ViBoolean value);
QZIVI_EXPORT ViStatus IviFgen_SetAttributeViSession(ViSession vi, ViConstString channel,
                                                    ViAttr attr, ViSession value);
QZIVI_EXPORT ViStatus IviFgen_SetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                                   ViConstString value);
QZIVI_EXPORT ViStatus IviFgen_CheckAttributeViInt32(ViSession vi, ViConstString channel,
                                                    ViAttr attr, ViInt32 value);
QZIVI_EXPORT ViStatus IviFgen_CheckAttributeViReal64(ViSession vi, ViConstString channel,
                                                     ViAttr attr, ViReal64 value);
QZIVI_EXPORT ViStatus IviFgen_CheckAttributeViBoolean(ViSession vi, ViConstString channel,
                                                      ViAttr attr, ViBoolean value);
QZIVI_EXPORT ViStatus IviFgen_CheckAttributeViSession(ViSession vi, ViConstString channel,
                                                      ViAttr attr, ViSession value);
QZIVI_EXPORT ViStatus IviFgen_CheckAttributeViString(ViSession vi, ViConstString channel,
                                                     ViAttr attr, ViConstString value);

QZIVI_EXPORT ViStatus IviFgen_ConfigureOutputMode(ViSession vi, ViInt32 outputMode);
QZIVI_EXPORT ViStatus IviFgen_ConfigureRefClockSource(ViSession vi, ViInt32 source);
QZIVI_EXPORT ViStatus IviFgen_ConfigureOutputImpedance(ViSession vi, ViConstString channel,
                                                       ViReal64 impedance);
QZIVI_EXPORT ViStatus IviFgen_ConfigureOperationMode(ViSession vi, ViConstString channel,
                                                     ViInt32 operationMode);
QZIVI_EXPORT ViStatus IviFgen_ConfigureOutputEnabled(ViSession vi, ViConstString channel,
                                                     ViBoolean enabled);
QZIVI_EXPORT ViStatus IviFgen_ConfigureStandardWaveform(ViSession vi, ViConstString channel,
                                                        ViInt32 waveform, ViReal64 amplitude,
                                                        ViReal64 dcOffset, ViReal64 frequency,
                                                        ViReal64 startPhase);

QZIVI_EXPORT ViStatus IviFgen_QueryArbWfmCapabilities(ViSession vi, ViInt32* maxNumWaveforms,
                                                      ViInt32* waveformQuantum,
                                                      ViInt32* minWaveformSize,
                                                      ViInt32* maxWaveformSize);
QZIVI_EXPORT ViStatus IviFgen_CreateArbWaveform(ViSession vi, ViInt32 size, const ViReal64 data[],
                                                ViInt32* handle);
QZIVI_EXPORT ViStatus IviFgen_ClearArbWaveform(ViSession vi, ViInt32 handle);
QZIVI_EXPORT ViStatus IviFgen_ConfigureArbWaveform(ViSession vi, ViConstString channel,
                                                   ViInt32 handle, ViReal64 gain, ViReal64 offset);
QZIVI_EXPORT ViStatus IviFgen_ConfigureSampleRate(ViSession vi, ViReal64 sampleRate);
QZIVI_EXPORT ViStatus IviFgen_ConfigureArbFrequency(ViSession vi, ViConstString channel,
                                                    ViReal64 frequency);

QZIVI_EXPORT ViStatus IviFgen_QueryArbSeqCapabilities(ViSession vi, ViInt32* maxNumSequences,
                                                      ViInt32* minSequenceLength,
                                                      ViInt32* maxSequenceLength,
                                                      ViInt32* maxLoopCount);
QZIVI_EXPORT ViStatus IviFgen_CreateArbSequence(ViSession vi, ViInt32 length,
                                                const ViInt32 waveformHandles[],
                                                const ViInt32 loopCounts[], ViInt32* handle);
QZIVI_EXPORT ViStatus IviFgen_ClearArbSequence(ViSession vi, ViInt32 handle);
QZIVI_EXPORT ViStatus IviFgen_ConfigureArbSequence(ViSession vi, ViConstString channel,
                                                   ViInt32 handle, ViReal64 gain, ViReal64 offset);

QZIVI_EXPORT ViStatus IviFgen_ConfigureTriggerSource(ViSession vi, ViConstString channel,
                                                     ViInt32 source);
QZIVI_EXPORT ViStatus IviFgen_ConfigureInternalTriggerRate(ViSession vi, ViReal64 rate);
QZIVI_EXPORT ViStatus IviFgen_SendSoftwareTrigger(ViSession vi);
QZIVI_EXPORT ViStatus IviFgen_ConfigureBurstCount(ViSession vi, ViConstString channel,
                                                  ViInt32 count);

QZIVI_EXPORT ViStatus IviFgen_ConfigureAMEnabled(ViSession vi, ViConstString channel,
                                                 ViBoolean enabled);
QZIVI_EXPORT ViStatus IviFgen_ConfigureAMSource(ViSession vi, ViConstString channel,
                                                ViInt32 source);
QZIVI_EXPORT ViStatus IviFgen_ConfigureAMInternal(ViSession vi, ViReal64 depth, ViInt32 waveform,
                                                  ViReal64 frequency);
QZIVI_EXPORT ViStatus IviFgen_ConfigureFMEnabled(ViSession vi, ViConstString channel,
                                                 ViBoolean enabled);
QZIVI_EXPORT ViStatus IviFgen_ConfigureFMSource(ViSession vi, ViConstString channel,
                                                ViInt32 source);
QZIVI_EXPORT ViStatus IviFgen_ConfigureFMInternal(ViSession vi, ViReal64 deviation,
                                                  ViInt32 waveform, ViReal64 frequency);

QZIVI_EXPORT ViStatus IviFgen_InitiateGeneration(ViSession vi);
QZIVI_EXPORT ViStatus IviFgen_AbortGeneration(ViSession vi);

/* This class driver's own: the voltages the channel's connector carries from `startTime`
 * (seconds since generation was initiated), one every `timeStep` seconds. Drivers that cannot
 * tell answer IVI_ERROR_FUNCTION_NOT_SUPPORTED. */
QZIVI_EXPORT ViStatus QZIvi_RenderOutput(ViSession vi, ViConstString channel, ViReal64 startTime,
                                         ViReal64 timeStep, ViInt32 count, ViReal64 volts[]);

/* ---- Engine ---------------------------------------------------------------------------------- */

/* Works on the specific driver's session, as IviFgen_GetSpecificDriverCHandle gives it. */
QZIVI_EXPORT ViStatus Ivi_GetAttrMinMaxViReal64(ViSession specificVi, ViConstString channel,
                                                ViAttr attr, ViReal64* min, ViReal64* max,
                                                ViBoolean* hasMin, ViBoolean* hasMax);
QZIVI_EXPORT ViStatus Ivi_GetLogicalNamesList(ViInt32* listHandle, ViInt32* count);
/* index counts from 1; found is VI_FALSE past the end. */
QZIVI_EXPORT ViStatus Ivi_GetNthLogicalName(ViInt32 listHandle, ViInt32 index, ViChar buffer[],
                                            ViInt32 bufferSize, ViBoolean* found);
QZIVI_EXPORT ViStatus Ivi_DisposeLogicalNamesList(ViInt32 listHandle);

#ifdef __cplusplus
}
#endif

#endif /* QZIVI_IVIFGEN_H */
