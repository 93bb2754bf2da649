/* QZScpiFgen: bench generators of the 33500 and 33600 series on the network, as an IVI-C specific
 * driver. Its functions carry the prefix "QZScpiFgen"; their list and signatures are those of
 * IviDriverFunctions.h. The store names it by module, prefix, a VISA resource
 * (TCPIP0::host::5025::SOCKET or TCPIP0::host::inst0::INSTR) and options; "DriverSetup=Timeout=ms"
 * bounds every read and write (5000 ms unless given).
 */
#ifndef QZSCPIFGEN_H
#define QZSCPIFGEN_H

#include "IviDriverFunctions.h"

#ifdef __cplusplus
extern "C" {
#endif

#define QZSCPIFGEN_PREFIX "QZScpiFgen"

#define QZSCPIFGEN_DECLARE(name, params) QZIVI_EXPORT ViStatus QZScpiFgen_##name params;
QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZSCPIFGEN_DECLARE)
#undef QZSCPIFGEN_DECLARE

#ifdef __cplusplus
}
#endif

#endif /* QZSCPIFGEN_H */
