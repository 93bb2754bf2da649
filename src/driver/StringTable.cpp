#include "qzivi/driver/StringTable.h"

#include "qzivi/support/failure.h"

#include <map>

namespace qzivi {

namespace {
const std::map<std::int32_t, std::string>& Table() {
    // One text a line, whole, as the system has them.
    // clang-format off
    static const std::map<std::int32_t, std::string> table = {
        {30000, "An unexpected error has occurred."},
        {30002, "An invalid argument has been passed to a property or method."},
        {30003, "An invalid type has been passed to a property or method."},
        {30004, "A division by zero error has occurred."},
        {30006, "An overflow error has occurred."},
        {30007, "An out of memory error has occurred."},
        {31600, "To access this property or method, you must first initialize the device by calling the Init method."},
        {31601, "To access this property or method, you must first configure the device by calling the Configure method."},
        {31602, "There is currently another operation in progress."},
        {31603, "The session handle is invalid or refers to a session that is not from a supported IVI class driver."},
        {31604, "The requested IVI attribute or its associated type is unknown and/or unsupported."},
        {31605, "Could not properly load or access required DLL."},
        {31606, "Could not find file."},
        {31607, "Errors occurred while accessing the file or the file does not exist."},
        {31608, "The control must be in design mode to set this property."},
        {31609, "The Quartzline IVI configuration file (.qzc) is not a valid format for this control."},
        {31610, "The IVI specific driver is not written to the proper version of the IVI class specification."},
        {31611, "The specified collection index is invalid."},
        {31612, "The instrument session is already initialized."},
        {31613, "Invalid Waveform."},
        {31614, "The specified logical name does not exist or is invalid for this instrument class."},
        {31615, "The number of points requested exceeds the amount of available data."},
        {31616, "Invalid Sequence."},
        {31617, "Channel name specified is not valid for the instrument."},
        {31618, "Invalid assignment.  The object does not belong to this control."},
        {31619, "Session Manager: "},
        {31620, "No channels were found."},
        {31621, "No output mode extensions have been checked."},
        {31622, "No waveform found."},
        {31623, "The specified configuration does not exist in the current collection."},
        {31624, "The specified channel does not exist in the current collection."},
        {31625, "The specified waveform does not exist in the current collection."},
        {31626, "The specified sequence item does not exist on the current collection."},
        {31627, "The specified sequence does not exist in the current collection."},
        {31628, "The extension for the specified output mode is not enabled"},
        {31629, "Visa Status.Wait terminated successfully on receipt of an event notification."},
        {40000, "An error has occurred.\n\nError "},
        {40001, "Extension capability not supported by instrument driver.  ("},
        {60000, "An invalid argument has been passed to a property or method."},
        {60020, "No available timers."},
        {60040, "Improper file type."},
        {60041, "Couldn't access specified file."},
        {60042, "The number of points requested exceeds the amount of available data."},
    };
    // clang-format on
    return table;
}
} // namespace

const std::string& LoadResString(std::int32_t id) {
    const auto found = Table().find(id);
    if (found == Table().end())
        RaiseRuntime(runtime::kIndexOutOfRange,
                     "The string table has no string " + std::to_string(id) + ".");
    return found->second;
}

} // namespace qzivi
