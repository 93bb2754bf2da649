// The collections under the root property set. They keep the member conventions (attach, path,
// reset, bag, clone); their items come with the object model of channels, waveforms, sequences
// and saved configurations.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class PropertyBag;

class MemberCollection {
public:
    MemberCollection(std::string word, std::string part)
        : word_(std::move(word)), part_(std::move(part)) {}

    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    std::int32_t Count() const { return 0; }
    void InitProperties() {}
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;

protected:
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;

private:
    std::string word_;
    std::string part_;
};

class QZIviFgenChannels : public MemberCollection {
public:
    QZIviFgenChannels() : MemberCollection("Channels", "Channels") {}
    void Clone(QZIviFgenChannels&) const {}
};

class QZIviFgenArbWaveforms : public MemberCollection {
public:
    QZIviFgenArbWaveforms() : MemberCollection("Waveforms", "Waveforms") {}
    void Clone(QZIviFgenArbWaveforms&) const {}
};

class QZIviFgenSequences : public MemberCollection {
public:
    QZIviFgenSequences() : MemberCollection("Sequences", "Sequences") {}
    void Clone(QZIviFgenSequences&) const {}
};

// The saved configurations. The owning property set is a bare reference (set again on each get
// of the root's Configurations); a configuration holds no configurations.
class QZIviConfigurations {
public:
    void Attach(std::shared_ptr<CIviErrorReport> errorReport, CIviFgenPropImp* propSet,
                const std::string& name);
    void SetOwner(CIviFgenPropImp* propSet) { m_oPropSet = propSet; }
    CIviFgenPropImp* PropSet() const { return m_oPropSet; }
    std::int32_t Count() const { return 0; }
    void ReadProperties(const PropertyBag& bag);
    void WriteProperties(PropertyBag& bag) const;
    void Clone(QZIviConfigurations&) const {}

private:
    std::shared_ptr<CIviErrorReport> m_oErr;
    CIviFgenPropImp* m_oPropSet = nullptr;
};

} // namespace qzivi
