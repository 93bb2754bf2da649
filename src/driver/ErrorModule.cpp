#include "qzivi/driver/ErrorModule.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/StringTable.h"
#include "qzivi/support/failure.h"

#include <cstdio>
#include <exception>
#include <filesystem>
#include <ios>
#include <new>
#include <typeinfo>
#include <variant>

namespace qzivi {

bool InSessionMgrCall = false;

namespace {
MessageBoxHandler g_messageBox;
} // namespace

void ShowMessageBox(const MessageBoxRequest& request) {
    if (g_messageBox)
        g_messageBox(request);
    else
        std::fprintf(stderr, "%s: %s\n", request.title.c_str(), request.text.c_str());
}

MessageBoxHandler SetMessageBoxHandler(MessageBoxHandler handler) {
    std::swap(g_messageBox, handler);
    return handler;
}

PendingFailure CurrentFailure() {
    try {
        throw;
    } catch (const Failure& f) {
        return {f.Number(), f.Source(), f.Description(), f.HelpFile(), f.HelpContext()};
    } catch (const std::bad_alloc&) {
        return {runtime::kOutOfMemory, {}, "Out of memory.", {}, 0};
    } catch (const std::bad_variant_access&) {
        return {runtime::kWrongType, {}, "Type mismatch.", {}, 0};
    } catch (const std::bad_cast&) {
        return {runtime::kWrongType, {}, "Type mismatch.", {}, 0};
    } catch (const std::out_of_range& e) {
        return {runtime::kIndexOutOfRange, {}, e.what(), {}, 0};
    } catch (const std::overflow_error& e) {
        return {runtime::kOverflow, {}, e.what(), {}, 0};
    } catch (const std::filesystem::filesystem_error& e) {
        const bool missing = e.code() == std::errc::no_such_file_or_directory;
        return {missing ? runtime::kFileNotFound : runtime::kFileAccess, {}, e.what(), {}, 0};
    } catch (const std::ios_base::failure& e) {
        return {runtime::kFileAccess, {}, e.what(), {}, 0};
    } catch (const std::exception& e) {
        return {0, {}, e.what(), {}, 0};
    } catch (...) {
        return {0, {}, "An unknown failure.", {}, 0};
    }
}

std::int32_t MapRuntimeError(PendingFailure& failure) {
    const std::int64_t number =
        failure.number < 0 ? -static_cast<std::int64_t>(failure.number) : failure.number;
    if (number >= 30000 && number < 40000) {
        if (number == 30717)
            failure.description = "Extension capability not supported by instrument driver.  (" +
                                  failure.source + ")";
        return static_cast<std::int32_t>(number);
    }
    switch (number) {
    case 13:
        return 30003;
    case 6:
        return 30006;
    case 7:
    case 14:
    case 28:
        return 30007;
    case 9:
        return 31611;
    case 11:
        return 30004;
    case 48:
    case 49:
    case 453:
        return 31605;
    case 53:
        return 31606;
    case 382:
    case 393:
        return 31608;
    case 60040:
        return 31609;
    case 60041:
        return 31607;
    case 60042:
        return 31615;
    case 17304:
        return 31614;
    default:
        break;
    }
    if (number >= 52 && number <= 76) return 31607;
    return 30000;
}

std::string FirstLine(std::string_view text) {
    const auto end = text.find_first_of("\r\n");
    if (end == 0 || end == std::string_view::npos) return std::string(text);
    return std::string(text.substr(0, end));
}

[[noreturn]] void ReRaise() {
    throw;
}

void HandleError(std::string source, std::int32_t mode, CIviErrorReport* reporter) {
    PendingFailure failure = CurrentFailure();
    std::int32_t id = MapRuntimeError(failure);
    if (InSessionMgrCall && id == 30000) id = 31619;
    std::string description = failure.description;
    try {
        if (id == 31619) {
            InSessionMgrCall = false;
            description = LoadResString(31619) + FirstLine(description);
        }
        if (source.empty()) source = "QZIviFgen";
        if (reporter != nullptr) reporter->RaiseErrorEvents(-id, source, description);
    } catch (...) {
        if (mode == 1) {
            std::string text;
            try {
                text = LoadResString(40000) + "\r\n\r\n" + LoadResString(30000);
            } catch (...) {
            }
            ShowMessageBox({text, source, kHelpFile, 30000});
            return;
        }
        throw Failure(kFallbackErrorNumber, source, failure.description, kHelpFile, kHelpContext);
    }
    if (mode == 1) {
        ShowMessageBox({LoadResString(40000) + std::to_string(id) + ":  " + description, source,
                        kHelpFile, id});
        return;
    }
    if (mode == -1)
        throw Failure(static_cast<std::int32_t>(static_cast<std::uint32_t>(-id) | 0x80040000u),
                      source, description, kHelpFile, kHelpContext);
}

} // namespace qzivi
