// A specific driver with the three required functions and one configure call, nothing else.
#include "IviFgen.h"

#include <cstring>

extern "C" {

QZIVI_EXPORT ViStatus Partial_InitWithOptions(ViRsrc, ViBoolean, ViBoolean, ViConstString,
                                              ViSession* vi) {
    *vi = 77;
    return VI_SUCCESS;
}

QZIVI_EXPORT ViStatus Partial_close(ViSession) {
    return VI_SUCCESS;
}

QZIVI_EXPORT ViStatus Partial_error_message(ViSession, ViStatus, ViChar message[]) {
    std::strcpy(message, "partial driver");
    return VI_SUCCESS;
}

QZIVI_EXPORT ViStatus Partial_ConfigureOutputMode(ViSession, ViInt32 mode) {
    return mode == 0 ? VI_SUCCESS : IVI_ERROR_INVALID_VALUE;
}
}
