#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/Conventions.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

#include <unordered_map>

namespace qzivi {

std::shared_ptr<CIviFgenPropImp> CIviFgenPropImp::Create() {
    std::shared_ptr<CIviFgenPropImp> set(new CIviFgenPropImp);
    set->m_oConfigurations = std::make_shared<QZIviConfigurations>();
    set->m_oInternal = std::make_shared<QZIviFgenInternalConfig>();
    set->m_oChannels = std::make_shared<QZIviFgenChannels>();
    set->m_oWaveforms = std::make_shared<QZIviFgenArbWaveforms>();
    set->m_oSequences = std::make_shared<QZIviFgenSequences>();
    return set;
}

std::span<const PropertyRow<CIviFgenPropImp>> CIviFgenPropImp::Properties() {
    using R = CIviFgenPropImp;
    static const PropertyRow<R> rows[] = {
        Field<&R::m_dArbSampleRate>("ArbSampleRate", 1000.0, IVIFGEN_ATTR_ARB_SAMPLE_RATE),
        Field<&R::m_bAutoStopStart>("AutoStopStart", true),
        Field<&R::m_lExtensions>("Extensions", qzivifgenStdFuncExt | qzivifgenArbWfmExt),
        Field<&R::m_lOutputMode>("OutputMode", qzivifgenOutputFunc, IVIFGEN_ATTR_OUTPUT_MODE),
        Field<&R::m_lRefClockSource>("RefClockSource", qzivifgenRefClockInternal,
                                     IVIFGEN_ATTR_REF_CLOCK_SOURCE),
        [] {
            auto row = Field<&R::m_sLogicalName>("LogicalName", "SampleFGen");
            row.alwaysStored = true;
            return row;
        }(),
        Field<&R::m_bAutoConfigure>("AutoConfigure", false),
        Field<&R::m_bEnabled>("Enabled", true),
        Accessor<R>(
            "UIStyle", std::int32_t{qzivifgenAllowControl},
            [](const R& r) -> PropertyValue { return r.m_lUIStyle; },
            [](R& r, const PropertyValue& v) {
                const std::int32_t style = std::get<std::int32_t>(v);
                if (style < qzivifgenInvisibleAtRuntime || style > qzivifgenDisplayOnly)
                    StdError(r.m_oErr, errid::kInvalidArgument, r.m_sPath + "UIStyle");
                r.m_lUIStyle = style;
            }),
        Accessor<R>(
            "ExceptionOnError", true,
            [](const R& r) -> PropertyValue { return r.ExceptionOnError(); },
            [](R& r, const PropertyValue& v) {
                if (r.m_oErr) r.m_oErr->ExceptionOnError(std::get<bool>(v));
            }),
    };
    return rows;
}

CIviFgenPropImp::CIviFgenPropImp() {
    PutDefaults(Properties(), *this);
}

void CIviFgenPropImp::Put(const PropertyRow<CIviFgenPropImp>& row, const PropertyValue& value) {
    row.put(*this, value);
    PropertyChange(std::string(row.name));
}

bool CIviFgenPropImp::ExceptionOnError() const {
    return m_oErr ? m_oErr->ExceptionOnError()
                  : std::get<bool>(Properties()[kExceptionOnError].initial);
}

const std::shared_ptr<QZIviConfigurations>& CIviFgenPropImp::Configurations() {
    m_oConfigurations->PropSet(this);
    return m_oConfigurations;
}

void CIviFgenPropImp::InitProperties() {
    PutDefaults(Properties(), *this, WithNotice());
    m_oInternal->InitProperties();
    m_oChannels->InitProperties();
    m_oWaveforms->InitProperties();
    m_oSequences->InitProperties();
}

void CIviFgenPropImp::ReadProperties(const PropertyBag& bag, const std::string& prefix,
                                     bool withConfigurations) {
    CheckItemCounts(bag);
    ReadRows(Properties(), *this, bag, prefix, WithNotice());
    m_oInternal->ReadProperties(bag, prefix);
    m_oWaveforms->ReadProperties(bag, prefix);
    m_oSequences->ReadProperties(bag, prefix);
    m_oChannels->ReadProperties(bag, prefix);
    if (withConfigurations) m_oConfigurations->ReadProperties(bag);
}

void CIviFgenPropImp::WriteProperties(PropertyBag& bag, const std::string& prefix,
                                      bool withConfigurations) const {
    WriteRows(Properties(), *this, bag, prefix);
    m_oInternal->WriteProperties(bag, prefix);
    m_oChannels->WriteProperties(bag, prefix);
    m_oSequences->WriteProperties(bag, prefix);
    m_oWaveforms->WriteProperties(bag, prefix);
    if (withConfigurations) m_oConfigurations->WriteProperties(bag);
}

std::shared_ptr<CIviFgenPropImp>
CIviFgenPropImp::Clone(std::shared_ptr<CIviFgenPropImp> target) const {
    if (!target) target = Create();
    target->Attach(m_oErr);
    CopyRows(Properties(), *this, *target, WithNotice());
    m_oInternal->Clone(*target->m_oInternal);
    m_oWaveforms->Clone(*target->m_oWaveforms);
    m_oSequences->Clone(*target->m_oSequences);
    m_oChannels->Clone(*target->m_oChannels);
    m_oConfigurations->Clone(*target->m_oConfigurations);
    return target;
}

namespace {

// The members of a collection by unique id, ignoring case as the tree compares them.
template <typename Collection>
auto ByUniqueId(const Collection& collection) {
    using Ptr = std::decay_t<decltype(*collection.begin())>;
    std::unordered_map<std::string, Ptr, NoCaseHash, NoCaseEqual> index;
    for (const auto& member : collection)
        index.emplace(member->UniqueId(), member);
    return index;
}

// The twin of `object` in `index`, or `object` itself when it is of this tree or has no twin.
template <typename Index, typename Ptr>
Ptr Twin(const Index& index, const Ptr& object, bool own) {
    if (!object || own) return object;
    const auto found = index.find(object->UniqueId());
    return found == index.end() ? object : found->second;
}

} // namespace

void CIviFgenPropImp::OwnReferences() {
    const auto waveforms = ByUniqueId(*m_oWaveforms);
    const auto sequences = ByUniqueId(*m_oSequences);
    for (const auto& channel : *m_oChannels) {
        const auto& waveform = channel->ArbWaveform();
        if (auto twin = Twin(waveforms, waveform, waveform && m_oWaveforms->Holds(*waveform));
            twin != waveform)
            channel->ArbWaveform(twin);
        const auto& sequence = channel->Sequence();
        if (auto twin = Twin(sequences, sequence, sequence && m_oSequences->Holds(*sequence));
            twin != sequence)
            channel->Sequence(twin);
    }
    for (const auto& sequence : *m_oSequences)
        for (const auto& item : *sequence) {
            const auto& waveform = item->Waveform();
            if (auto twin = Twin(waveforms, waveform, waveform && m_oWaveforms->Holds(*waveform));
                twin != waveform)
                item->Waveform(twin);
        }
}

void CIviFgenPropImp::Attach(std::shared_ptr<CIviErrorReport> errorReport) {
    m_oErr = std::move(errorReport);
    const auto self = shared_from_this();
    m_oConfigurations->Attach(m_oErr, this, "");
    m_oInternal->Attach(m_oErr, self);
    m_oChannels->Attach(m_oErr, self);
    m_oWaveforms->Attach(m_oErr, self);
    m_oSequences->Attach(m_oErr, self);
}

void CIviFgenPropImp::Detach() {
    m_oInternal->Attach(m_oErr, nullptr);
    m_oChannels->Attach(m_oErr, nullptr);
    m_oWaveforms->Attach(m_oErr, nullptr);
    m_oSequences->Attach(m_oErr, nullptr);
    m_oConfigurations->Attach(m_oErr, nullptr, "");
    m_oConfigurations->PropSet(nullptr);
}

void CIviFgenPropImp::SetPath(const std::string& name) {
    m_sPath = JoinPath(name, "");
    m_oInternal->SetPath(m_sPath);
    m_oChannels->SetPath(m_sPath);
    m_oWaveforms->SetPath(m_sPath);
    m_oSequences->SetPath(m_sPath);
}

void CIviFgenPropImp::RaiseCollectionChanged(const std::string& collectionName,
                                             const Variant& collection, std::int32_t kind,
                                             const Variant& first, const Variant& second) {
    CollectionChanged(collectionName, collection, kind, first, second);
    // The tree's own members react once per notice, after the listeners.
    if (kind != ChangeRemoved && kind != ChangeRenamed) return;
    if (collectionName == "QZIviFgenArbWaveforms") {
        m_oChannels->ForgetWaveforms();
        if (kind == ChangeRenamed)
            m_oSequences->WaveformRenamed(first.AsText(), second.AsText());
        else
            m_oSequences->WaveformRemoved();
    } else if (collectionName == "QZIviFgenSequences") {
        m_oChannels->ForgetSequences();
    }
}

} // namespace qzivi
