#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/CPropBagFile.h"
#include "qzivi/support/scoped_hook.h"

namespace qzivi {

namespace {
constexpr const char* kCount = "Config_Count";

std::string ItemPrefix(std::int32_t i) {
    return "Config_Item" + std::to_string(i) + "_";
}

// The frame of these members: every failure reaches the caller, under Path and the member's name.
template <typename F>
auto Always(const std::shared_ptr<CIviErrorReport>& err, const std::string& source, F&& body) {
    return Guard(err, source.c_str(), std::forward<F>(body), true);
}
} // namespace

// ---- QZIviConfiguration ---------------------------------------------------------------------

void QZIviConfiguration::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                QZIviConfigurations* parent, const std::string& identifier) {
    m_oErr = std::move(errorReport);
    m_oParent = parent;
    m_sFileIdentifier = identifier;
}

void QZIviConfiguration::SetPath(const std::string& parentPath) {
    // Without a path above, the sources hold the member's name alone, as for the tree's items.
    m_sPath =
        parentPath.empty() ? std::string() : JoinPath(parentPath, "Item(\"" + m_sName + "\")");
}

void QZIviConfiguration::Import(const std::string& FilePath) {
    Always(m_oErr, m_sPath + "Import", [&] {
        const FlagHold hold(m_bImporting);
        CPropBagFile file;
        file.LoadPropBagFile(FilePath, m_sFileIdentifier);
        if (!file.Bag())
            RaiseRuntime(runtime::kFileNotFound,
                         "The configuration file \"" + FilePath + "\" does not exist.");
        // A file this program wrote always holds a snapshot; one without is no configuration.
        if (file.Bag()->ReadSharedBytes("Bag").empty())
            RaiseRuntime(-runtime::kImproperFile, "Improper file type. The file \"" + FilePath +
                                                      "\" holds no configuration.");
        ReadProperties(*file.Bag(), "");
    });
}

void QZIviConfiguration::Export(const std::string& FilePath) {
    Always(m_oErr, m_sPath + "Export", [&] {
        const FlagHold hold(m_bExporting);
        CPropBagFile file;
        file.InitPropBagFile(FilePath, m_sFileIdentifier);
        WriteProperties(file.WritableBag(), "");
        file.SavePropBagFile();
    });
}

void QZIviConfiguration::Load() {
    Always(m_oErr, m_sPath + "Load", [&] { m_oParent->LoadConfiguration(m_sName); });
}

void QZIviConfiguration::Store() {
    Always(m_oErr, m_sPath + "Store", [&] { m_oParent->StoreConfiguration(m_sName); });
}

void QZIviConfiguration::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    SharedBytes snapshot = bag.ReadSharedBytes(prefix + "Bag");
    // A snapshot that is no bag is refused now, before it replaces the one held.
    if (!snapshot.empty()) PropertyBag().SetContents(snapshot);
    m_aBag = std::move(snapshot);
    if (!m_bImporting) m_sName = bag.ReadText(prefix + "Name", m_sName);
}

void QZIviConfiguration::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    bag.WriteBytes(prefix + "Bag", m_aBag);
    if (!m_bExporting) bag.WriteText(prefix + "Name", m_sName);
}

void QZIviConfiguration::Clone(QZIviConfiguration& target) const {
    target.SetName(m_sName);
    target.Bag(m_aBag);
}

// ---- QZIviConfigurations --------------------------------------------------------------------

void QZIviConfigurations::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                 CIviFgenPropImp* sourceSet, const std::string& identifier) {
    m_oErr = std::move(errorReport);
    m_oSourceSet = sourceSet;
    if (!identifier.empty()) m_sFileIdentifier = identifier;
    for (const auto& item : m_oItems)
        item->Attach(m_oErr, this, m_sFileIdentifier);
}

void QZIviConfigurations::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Configurations");
    for (const auto& item : m_oItems)
        item->SetPath(m_sPath);
}

std::shared_ptr<QZIviConfiguration> QZIviConfigurations::Find(const Variant& index) const {
    if (index.IsNumber()) {
        try {
            const std::int32_t position = index.AsInt32();
            if (position >= 1 && position <= Count())
                return m_oItems[static_cast<std::size_t>(position - 1)];
        } catch (...) {
        }
        return nullptr;
    }
    const std::string name = index.IsEmpty() || index.IsMissing() ? std::string() : index.AsText();
    for (const auto& item : m_oItems)
        if (item->Name() == name) return item;
    return nullptr;
}

std::shared_ptr<QZIviConfiguration> QZIviConfigurations::Item(const Variant& Index) {
    return Always(m_oErr, m_sPath + "Item", [&] {
        auto found = Find(Index);
        if (!found) StdError(m_oErr, errid::kNoSuchConfiguration, m_sPath + "Item");
        return found;
    });
}

std::shared_ptr<QZIviConfiguration> QZIviConfigurations::Add(const std::string& Name,
                                                             const std::string& FilePath) {
    return Always(m_oErr, m_sPath + "Add", [&] {
        auto item = std::make_shared<QZIviConfiguration>();
        item->Attach(m_oErr, this, m_sFileIdentifier);
        if (!FilePath.empty()) {
            item->Import(FilePath);
        } else {
            PropertyBag snapshot;
            if (m_oSourceSet) m_oSourceSet->WriteProperties(snapshot, "", false);
            item->Bag(SharedBytes(snapshot.Contents()));
        }
        item->SetName(Name);
        item->SetPath(m_sPath);
        m_oItems.push_back(item);
        return item;
    });
}

void QZIviConfigurations::Remove(const Variant& Index) {
    Always(m_oErr, m_sPath + "Remove", [&] {
        std::int32_t position = 0;
        if (Index.IsNumeric()) {
            position = Index.AsInt32();
        } else {
            position = IndexOfName(Index.IsEmpty() ? std::string() : Index.AsText());
        }
        if (position < 1 || position > Count())
            StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        m_oItems.erase(m_oItems.begin() + (position - 1));
    });
}

void QZIviConfigurations::LoadConfiguration(const Variant& index) {
    const auto item = Find(index);
    if (!item) StdError(m_oErr, errid::kNoSuchConfiguration, m_sPath + "Item");
    if (!m_oPropSet)
        RaiseRuntime(91, "Object variable not set: the configurations belong to no property set.");
    PropertyBag snapshot;
    snapshot.SetContents(item->Bag());
    m_oPropSet->InitProperties();
    m_oPropSet->ReadProperties(snapshot, "", false);
    m_vLastLoaded = IndexOfObject(item.get());
}

void QZIviConfigurations::StoreConfiguration(const Variant& index) {
    const auto item = Find(index);
    if (!item) StdError(m_oErr, errid::kNoSuchConfiguration, m_sPath + "Item");
    if (!m_oPropSet)
        RaiseRuntime(91, "Object variable not set: the configurations belong to no property set.");
    PropertyBag snapshot;
    m_oPropSet->WriteProperties(snapshot, "", false);
    item->Bag(SharedBytes(snapshot.Contents()));
}

std::int32_t QZIviConfigurations::IndexOfObject(const QZIviConfiguration* object) const {
    for (std::int32_t i = 1; i <= Count(); ++i)
        if (m_oItems[static_cast<std::size_t>(i - 1)].get() == object) return i;
    return -1;
}

std::int32_t QZIviConfigurations::IndexOfName(const std::string& name) const {
    for (std::int32_t i = 1; i <= Count(); ++i)
        if (m_oItems[static_cast<std::size_t>(i - 1)]->Name() == name) return i;
    return -1;
}

void QZIviConfigurations::ReadProperties(const PropertyBag& bag) {
    const std::int32_t count = bag.ReadInt32(kCount, 0);
    for (std::int32_t i = 1; i <= count; ++i) {
        auto item = std::make_shared<QZIviConfiguration>();
        item->Attach(m_oErr, this, m_sFileIdentifier);
        item->ReadProperties(bag, ItemPrefix(i));
        item->SetPath(m_sPath);
        m_oItems.push_back(std::move(item));
    }
}

void QZIviConfigurations::WriteProperties(PropertyBag& bag) const {
    bag.WriteInt32(kCount, Count(), 0);
    std::int32_t i = 0;
    for (const auto& item : m_oItems)
        item->WriteProperties(bag, ItemPrefix(++i));
}

void QZIviConfigurations::Clone(QZIviConfigurations& target) const {
    for (const auto& item : m_oItems) {
        const auto copy = std::make_shared<QZIviConfiguration>();
        copy->Attach(target.m_oErr, &target, target.m_sFileIdentifier);
        item->Clone(*copy);
        copy->SetPath(target.m_sPath);
        target.m_oItems.push_back(copy);
    }
}

} // namespace qzivi
