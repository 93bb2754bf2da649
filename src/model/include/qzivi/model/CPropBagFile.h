// CPropBagFile: one property bag kept in a .qzc file, the only reader and writer of that format.
//
// Layout, little-endian, nothing between the fields:
//   identifier (n bytes, no length, no terminator: "QZIviFgen")
//   size field (int32: byte count - 1), type tag (uint16 0x2011), dimensions (uint16 1),
//   element count (int32: byte count), lower bound (int32 0), the bag's Contents
// A bag without content ends the file after the identifier.
#pragma once

#include "qzivi/model/PropertyBag.h"

#include <memory>
#include <string>

namespace qzivi {

class CPropBagFile {
public:
    CPropBagFile() = default;
    // Saves a dirty bag; a failure here reaches no one.
    ~CPropBagFile();
    CPropBagFile(const CPropBagFile&) = delete;
    CPropBagFile& operator=(const CPropBagFile&) = delete;

    const std::string& FilePath() const { return m_sFilePath; }
    void FilePath(const std::string& value);
    const std::string& FileIdentifier() const { return m_sFileIdentifier; }
    void FileIdentifier(const std::string& value);

    // A new empty bag for `path`; the object is dirty.
    void InitPropBagFile(const std::string& path, const std::string& identifier);
    // Reads the file. No file at `path`: no error, and the bag stays as it was. Another
    // identifier: -60040 "Improper file type."; a corrupt block: the improper-file failure.
    void LoadPropBagFile(const std::string& path, const std::string& identifier);
    // Writes the file if dirty: a new file beside the old one, flushed, then renamed over it, so
    // that a crash or a full disk never leaves a torn file.
    void SavePropBagFile();

    // The bag, or null before InitPropBagFile or a read of a file.
    const PropertyBag* Bag() const { return m_oBag.get(); }
    // The bag for writing: the object becomes dirty.
    PropertyBag& WritableBag();

private:
    std::string m_sFilePath;
    std::string m_sFileIdentifier;
    bool m_bDirty = false;
    std::unique_ptr<PropertyBag> m_oBag;
};

} // namespace qzivi
