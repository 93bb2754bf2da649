// The Ivi engine functions the control uses: the range of an attribute, asked of the specific
// session, and the list of the store's logical names.
#include "class_session.h"
#include "qzivi/config_store.h"

#include <map>
#include <mutex>

namespace {

using namespace qzivi::ivi;

std::mutex g_listsMutex;
std::map<ViInt32, std::vector<std::string>> g_lists;
ViInt32 g_nextList = 1;

[[noreturn]] void NoList(ViInt32 listHandle) {
    throw StatusError(IVI_ERROR_INVALID_VALUE,
                      std::to_string(listHandle) + " is not a list of logical names");
}

} // namespace

extern "C" {

ViStatus Ivi_GetAttrMinMaxViReal64(ViSession specificVi, ViConstString channel, ViAttr attr,
                                   ViReal64* min, ViReal64* max, ViBoolean* hasMin,
                                   ViBoolean* hasMax) {
    // The engine knows a specific session by the class session that opened it.
    ClassSession* owner =
        ClassSessions().FindIf([&](const ClassSession& s) { return s.specific == specificVi; });
    return TracedEntry(
        "Ivi_GetAttrMinMaxViReal64", owner,
        [&]() -> ViStatus {
            if (owner == nullptr)
                throw StatusError(IVI_ERROR_INVALID_SESSION_HANDLE,
                                  std::to_string(specificVi) +
                                      " is not a specific driver session opened through IviFgen");
            if (owner->table.GetAttrMinMaxViReal64 == nullptr)
                throw StatusError(IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                                  "driver module \"" + owner->module->Location() +
                                      "\" gives no range information");
            return owner->table.GetAttrMinMaxViReal64(specificVi, Physical(*owner, channel), attr,
                                                      min, max, hasMin, hasMax);
        },
        specificVi, Channel{channel}, attr, min, max, hasMin, hasMax);
}

ViStatus Ivi_GetLogicalNamesList(ViInt32* listHandle, ViInt32* count) {
    return TracedEntry(
        "Ivi_GetLogicalNamesList", nullptr,
        [&]() -> ViStatus {
            if (listHandle == nullptr || count == nullptr)
                throw StatusError(IVI_ERROR_NULL_POINTER,
                                  "listHandle and count must not be null pointers");
            *listHandle = 0;
            *count = 0;
            std::vector<std::string> names;
            for (const auto& session : LoadConfigStore().sessions)
                names.push_back(session.logicalName);
            std::lock_guard lock(g_listsMutex);
            *count = static_cast<ViInt32>(names.size());
            *listHandle = g_nextList++;
            g_lists.emplace(*listHandle, std::move(names));
            return VI_SUCCESS;
        },
        listHandle, count);
}

ViStatus Ivi_GetNthLogicalName(ViInt32 listHandle, ViInt32 index, ViChar buffer[],
                               ViInt32 bufferSize, ViBoolean* found) {
    return TracedEntry(
        "Ivi_GetNthLogicalName", nullptr,
        [&]() -> ViStatus {
            std::lock_guard lock(g_listsMutex);
            const auto list = g_lists.find(listHandle);
            if (list == g_lists.end()) NoList(listHandle);
            const bool inRange = index >= 1 && static_cast<size_t>(index) <= list->second.size();
            if (found != nullptr) *found = inRange ? VI_TRUE : VI_FALSE;
            return CopyText(inRange ? list->second[static_cast<size_t>(index) - 1] : std::string(),
                            bufferSize, buffer);
        },
        listHandle, index, TraceOutText{buffer, bufferSize}, bufferSize, found);
}

ViStatus Ivi_DisposeLogicalNamesList(ViInt32 listHandle) {
    return TracedEntry(
        "Ivi_DisposeLogicalNamesList", nullptr,
        [&]() -> ViStatus {
            std::lock_guard lock(g_listsMutex);
            if (g_lists.erase(listHandle) == 0) NoList(listHandle);
            return VI_SUCCESS;
        },
        listHandle);
}

} // extern "C"
