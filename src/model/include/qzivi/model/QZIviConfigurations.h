// Saved configurations: named snapshots of the whole property state, kept in the control and
// moved to and from .qzc files. A snapshot is the bytes of a bag the root set wrote itself into,
// without configurations; it is parsed only when it is loaded.
#pragma once

#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/PropertyBag.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class QZIviConfigurations;

class QZIviConfiguration {
public:
    // ---- Public; every failure reaches the caller ----
    const std::string& Name() const { return m_sName; }
    void Import(const std::string& FilePath);
    void Export(const std::string& FilePath);
    void Load();
    void Store();

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport, QZIviConfigurations* parent,
                const std::string& identifier);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    void SetName(const std::string& name) { m_sName = name; }
    void Clone(QZIviConfiguration& target) const;
    const SharedBytes& Bag() const { return m_aBag; }
    void Bag(SharedBytes contents) { m_aBag = std::move(contents); }
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    bool Importing() const { return m_bImporting; }
    bool Exporting() const { return m_bExporting; }

private:
    std::string m_sName;
    SharedBytes m_aBag; // the snapshot's Contents
    std::shared_ptr<CIviErrorReport> m_oErr;
    QZIviConfigurations* m_oParent = nullptr; // the collection that holds this one
    std::string m_sPath;
    std::string m_sFileIdentifier;
    bool m_bImporting = false;
    bool m_bExporting = false;
};

class QZIviConfigurations {
public:
    // ---- Public; every failure reaches the caller ----
    auto begin() const { return m_oItems.begin(); }
    auto end() const { return m_oItems.end(); }
    // A number is a position; a text, even a numeric one, is a name compared exactly.
    std::shared_ptr<QZIviConfiguration> Item(const Variant& Index);
    std::int32_t Count() const { return static_cast<std::int32_t>(m_oItems.size()); }
    // A snapshot of the source set, or of the file when one is named.
    std::shared_ptr<QZIviConfiguration> Add(const std::string& Name,
                                            const std::string& FilePath = "");
    void Remove(const Variant& Index);

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport, CIviFgenPropImp* sourceSet,
                const std::string& identifier);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    // What Load and Store act on: whoever last read the root's Configurations.
    CIviFgenPropImp* PropSet() const { return m_oPropSet; }
    void PropSet(CIviFgenPropImp* propSet) { m_oPropSet = propSet; }
    void Clone(QZIviConfigurations& target) const;
    void ReadProperties(const PropertyBag& bag);
    void WriteProperties(PropertyBag& bag) const;
    void LoadConfiguration(const Variant& index);
    void StoreConfiguration(const Variant& index);
    std::int32_t IndexOfObject(const QZIviConfiguration* object) const;
    std::int32_t IndexOfName(const std::string& name) const;
    const Variant& LastLoaded() const { return m_vLastLoaded; }
    const std::shared_ptr<CIviErrorReport>& ErrorReport() const { return m_oErr; }

private:
    std::shared_ptr<QZIviConfiguration> Find(const Variant& index) const;

    std::vector<std::shared_ptr<QZIviConfiguration>> m_oItems;
    std::shared_ptr<CIviErrorReport> m_oErr;
    CIviFgenPropImp* m_oSourceSet = nullptr;
    CIviFgenPropImp* m_oPropSet = nullptr;
    std::string m_sFileIdentifier = "QZIviFgen";
    std::string m_sPath;
    Variant m_vLastLoaded;
};

} // namespace qzivi
