// The configuration store: which driver session a logical name opens.
//
// A small text file that people edit. The class driver reads the first of these that exists:
//   1. the file named by the environment variable QZIVI_CONFIG_STORE,
//   2. $XDG_CONFIG_HOME/qzivi/qzivi.conf (by default ~/.config/qzivi/qzivi.conf),
//   3. <system folder>/qzivi.conf (/etc/qzivi/qzivi.conf).
// An embedded default defines "SampleFGen" as the built-in simulator unless the file does.
//
//   # comment
//   trace = /tmp/qzivi-trace.log        (optional; before the first section)
//   [MyFgen]                            (a logical name)
//   module   = builtin                  (or the path of an IVI-C shared library, relative to
//                                        the store's folder)
//   prefix   = QZSimFgen                (the prefix of the module's functions)
//   resource = SIM::FGEN0
//   options  = Simulate=1, DriverSetup=...
//   channel Channel1 = 1                (virtual channel name = the driver's name)
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qzivi::ivi {

inline constexpr std::string_view kBuiltinModule = "builtin";

struct DriverSession {
    std::string logicalName;
    std::string module;
    std::string prefix;
    std::string resource;
    std::string options;
    std::vector<std::pair<std::string, std::string>> virtualNames; // application's -> driver's
};

struct ConfigStore {
    std::string path; // the file read; empty when only the embedded default stands
    std::string traceFile;
    std::vector<DriverSession> sessions;

    // Logical names compare without regard to case, as IVI's do.
    const DriverSession* Find(std::string_view logicalName) const;
};

// Parses the text of a store. Throws StatusError(IVI_ERROR_CONFIG_STORE_INVALID) naming `path`
// and the line. The embedded default is added.
ConfigStore ParseConfigStore(std::string_view text, const std::string& path);

// The files the class driver looks for, in order: the one QZIVI_CONFIG_STORE names alone, when
// it names one.
std::vector<std::string> ConfigStoreSearchOrder();

// The path the search order gives, or "" if no file exists.
std::string FindConfigStoreFile();

// The store for a person to edit: the one the search order gives, or else a new one at the user's
// place ($XDG_CONFIG_HOME/qzivi/qzivi.conf) holding the embedded default as a commented example.
// Throws StatusError if the new file cannot be written.
std::string EditableConfigStoreFile();

// Reads the store the search order gives. Throws StatusError for a file that cannot be read, is
// malformed, or can be written by others.
ConfigStore LoadConfigStore();

// Throws StatusError(IVI_ERROR_FILE_NOT_SECURE) if others than the owner and group may write the
// file, since a driver it names runs inside the caller's process.
void RefuseIfWritableByOthers(const std::string& path, std::string_view what);

// Opens a file whose code the process will run, and gives its descriptor, for the caller to load
// that very file through (no second look-up by path that a swap could slip into). Refused with
// IVI_ERROR_FILE_NOT_SECURE: a path with "..", a file others may write, and a folder on its way
// that others may write, unless the folder is sticky (as /tmp) and what lies in it belongs to the
// user or to root. The caller reports a missing file its own way, before.
int OpenTrustedFile(const std::string& path, std::string_view what);

} // namespace qzivi::ivi
