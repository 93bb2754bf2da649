// Arbitrary waveforms: where their points come from, how they are normalised, the instrument's
// handle once downloaded, and the collection that holds them.
#pragma once

#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/support/event.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class PropertyBag;

// Points are shared and never changed once made; null stands for "no points".
using Points = std::shared_ptr<const std::vector<double>>;

class QZIviFgenArbWaveform : public std::enable_shared_from_this<QZIviFgenArbWaveform>,
                             public ListMember<QZIviFgenArbWaveform> {
public:
    // ---- Public ----
    const std::string& Name() const { return m_sName; }
    void Name(const std::string& value);
    std::int32_t WaveformHandle() const { return m_lWaveformHandle; }
    std::int32_t Source() const { return m_lSource; }
    void Source(std::int32_t value) { m_lSource = value; }
    // Reads the file each time for sources 1 to 3; for a persisted waveform only the first time.
    Points Data();
    // Kept for a persisted waveform; for the others only the count counts. Not normalised.
    void Data(std::vector<double> points);
    const std::string& Filename() const { return m_sFilename; }
    void Filename(const std::string& value);
    std::int32_t AutoNormalizeMode() const { return m_lAutoNormalizeMode; }
    void AutoNormalizeMode(std::int32_t value) { m_lAutoNormalizeMode = value; }
    // True if the waveform had a handle; it is downloaded anew by the next Configure.
    bool ForceReload();
    // Points of the data file, normalised; null for none, and for a single point.
    Points GetDataSample(std::int32_t StartIndex, std::int32_t Interval, std::int32_t Count);
    std::int32_t DataSize();

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix);
    void Clone(QZIviFgenArbWaveform& target);
    const std::string& UniqueId() const { return m_sUniqueId; }
    void UniqueId(const std::string& value);
    void SetWaveformHandle(std::int32_t handle) { m_lWaveformHandle = handle; }
    std::string PersistedWfmSource() const { return std::to_string(m_lPersistedWfmSource); }
    void PersistedWfmSource(const std::string& value);
    bool DataGotOnce() const { return m_bDataGotOnce; }
    void DataGotOnce(bool value) { m_bDataGotOnce = value; }
    void Normalize(std::vector<double>& points) const;
    // Why the last read of the file gave no points, in words; empty when it gave points.
    const std::string& NoPointsCause() const { return m_sNoPointsCause; }

private:
    Points ReadData();
    // Error -31613 from `Name`, its text followed by `cause`.
    [[noreturn]] void InvalidWaveform(const std::string& cause) const;
    // The points a persisted waveform stores and copies.
    Points StoredPoints();

    std::string m_sName;
    std::int32_t m_lWaveformHandle = 0;
    std::int32_t m_lSource = qzivifgenASCIIFile;
    std::string m_sFilename;
    std::int32_t m_lAutoNormalizeMode = qzivifgenNormalize;
    std::int32_t m_lPersistedWfmSource = 1;
    bool m_bDataGotOnce = false;
    Points m_aData;
    std::int32_t m_lDataSize = 0;
    std::string m_sNoPointsCause;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
    std::string m_sUniqueId;
};

// The handles of removed objects, waiting to be cleared from the instrument.
class DeletedHandleQueue {
public:
    void Queue(std::int32_t handle) {
        if (handle != 0) handles_.push_back(handle);
    }
    std::int32_t DeletedHandleCount() const { return static_cast<std::int32_t>(handles_.size()); }
    std::int32_t DeletedHandleAt(std::int32_t i) const {
        return handles_.at(static_cast<std::size_t>(i - 1));
    }
    // The last entry takes the place of entry i: the queue keeps no order.
    void RemoveDeletedHandleAt(std::int32_t i);

private:
    std::vector<std::int32_t> handles_;
};

class QZIviFgenArbWaveforms : public std::enable_shared_from_this<QZIviFgenArbWaveforms>,
                              public ModelCollection<QZIviFgenArbWaveform>,
                              public DeletedHandleQueue {
public:
    QZIviFgenArbWaveforms() : ModelCollection("Waveforms", "Waveform") {}

    // ---- Public; iterating it walks the waveforms in order ----
    std::shared_ptr<QZIviFgenArbWaveform> Item(const Variant& Index);
    std::shared_ptr<QZIviFgenArbWaveform>
    Add(const std::string& WaveformName = "", const Variant& Source = Variant::Missing(),
        const std::string& Filename = "", const Variant& AutoNormalizeMode = Variant::Missing());
    void Remove(const Variant& Index);
    std::int32_t GetMaxNumWaveforms();
    std::int32_t GetMaxWaveformSize();
    std::int32_t GetMinWaveformSize();
    std::int32_t GetWaveformQuantum();

    // ---- Internal ----
    void Clone(QZIviFgenArbWaveforms& target) const { CloneInto(target); }
};

} // namespace qzivi
