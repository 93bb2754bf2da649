/* QZSimFgen: the simulated two-channel arbitrary function generator, as an IVI-C specific driver.
 *
 * Its functions carry the prefix "QZSimFgen"; their list and signatures are those of
 * IviDriverFunctions.h. docs/simulator.md describes the instrument it simulates.
 */
#ifndef QZSIMFGEN_H
#define QZSIMFGEN_H

#include "IviDriverFunctions.h"

#ifdef __cplusplus
extern "C" {
#endif

#define QZSIMFGEN_PREFIX "QZSimFgen"

#define QZSIMFGEN_DECLARE(name, params) QZIVI_EXPORT ViStatus QZSimFgen_##name params;
QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZSIMFGEN_DECLARE)
#undef QZSIMFGEN_DECLARE

#ifdef __cplusplus
}
#endif

#endif /* QZSIMFGEN_H */
