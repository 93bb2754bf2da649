#include "qzivi/model/Waveforms.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/model/CDblArrayFromFile.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/wait_cursor.h"

#include <cctype>
#include <cmath>
#include <cstring>
#include <filesystem>

namespace qzivi {

namespace {

// Floating division that fails where the system's first language failed: x / 0 and 0 / 0.
double Divide(double a, double b) {
    if (b == 0) {
        if (a == 0) RaiseRuntime(runtime::kOverflow, "Overflow.");
        RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
    }
    return a / b;
}

constexpr const char* kCollection = "QZIviFgenArbWaveforms";

std::string FormatName(std::int32_t format) {
    switch (format) {
    case qzivifgenASCIIFile:
        return "text";
    case qzivifgen2ByteInteger:
        return "16-bit integer";
    case qzivifgen4ByteInteger:
        return "32-bit integer";
    default:
        return std::to_string(format);
    }
}

} // namespace

// ---- QZIviFgenArbWaveform -------------------------------------------------------------------

void QZIviFgenArbWaveform::Name(const std::string& value) {
    const std::string old = m_sName;
    m_sName = value;
    NameChanged(old);
    if (const auto propSet = PropSet())
        propSet->RaiseCollectionChanged(kCollection, Variant::Object(propSet->Waveforms()),
                                        ChangeRenamed, value, old);
}

void QZIviFgenArbWaveform::UniqueId(const std::string& value) {
    const std::string old = m_sUniqueId;
    m_sUniqueId = value;
    UniqueIdChanged(old);
}

void QZIviFgenArbWaveform::Filename(const std::string& value) {
    if (value != m_sFilename) m_bDataGotOnce = false;
    m_sFilename = value;
}

Points QZIviFgenArbWaveform::ReadData() {
    Points result;
    const bool fromFile = m_lSource > 0 || !m_bDataGotOnce;
    try {
        if (fromFile) result = GetDataSample(0, 1, -1);
    } catch (const Failure& f) {
        m_lDataSize = 0;
        if (f.Number() == errid::kInvalidWaveform) throw;
        InvalidWaveform(f.Description());
    } catch (...) {
        m_lDataSize = 0;
        InvalidWaveform("");
    }
    if (fromFile) {
        if (!result)
            RaiseRuntime(runtime::kWrongType, "Type mismatch: the waveform \"" + m_sName +
                                                  "\" got no points, as " + m_sNoPointsCause + ".");
        m_aData = result;
        if (m_lSource == 0) m_bDataGotOnce = true;
    } else {
        result = m_aData;
    }
    if (!result) {
        m_lDataSize = 0;
        StdError(m_oErr, errid::kInvalidWaveform, m_sName);
    }
    m_lDataSize = static_cast<std::int32_t>(result->size());
    return result;
}

void QZIviFgenArbWaveform::InvalidWaveform(const std::string& cause) const {
    try {
        StdError(m_oErr, errid::kInvalidWaveform, m_sName);
    } catch (const Failure& f) {
        if (cause.empty()) throw;
        std::string told = cause;
        told[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(told[0])));
        if (told.back() != '.') told += '.';
        throw Failure(f.Number(), f.Source(), f.Description() + "  " + told);
    }
}

Points QZIviFgenArbWaveform::StoredPoints() {
    // With no points held and no file named there is nothing to obtain, and no failure to report.
    if (!m_bDataGotOnce && m_sFilename.empty()) return nullptr;
    return Data();
}

Points QZIviFgenArbWaveform::Data() {
    return Guard(m_oErr, "Data", [&] { return ReadData(); });
}

void QZIviFgenArbWaveform::Data(std::vector<double> points) {
    const auto count = static_cast<std::int32_t>(points.size());
    if (!points.empty() && m_lSource == 0) {
        m_aData = std::make_shared<const std::vector<double>>(std::move(points));
        m_bDataGotOnce = true;
    }
    m_lDataSize = count;
}

bool QZIviFgenArbWaveform::ForceReload() {
    const bool had = m_lWaveformHandle != 0;
    m_lWaveformHandle = 0;
    return had;
}

Points QZIviFgenArbWaveform::GetDataSample(std::int32_t StartIndex, std::int32_t Interval,
                                           std::int32_t Count) {
    return Guard(m_oErr, "GetDataSample", [&]() -> Points {
        const WaitCursor wait;
        std::error_code error;
        m_sNoPointsCause = m_sFilename.empty()
                               ? "no data file is named"
                               : "the data file \"" + m_sFilename + "\" does not exist";
        if (m_sFilename.empty() || !std::filesystem::exists(m_sFilename, error))
            InvalidWaveform(m_sNoPointsCause);
        const std::int32_t format = m_lSource > 0 ? m_lSource : m_lPersistedWfmSource;
        const CDblArrayFromFile reader;
        std::vector<double> points =
            reader.RetrieveDblArray(format, m_sFilename, StartIndex, Interval, Count);
        m_sNoPointsCause = !reader.Trouble().empty() ? reader.Trouble()
                           : points.size() == 1
                               ? "the data file \"" + m_sFilename + "\" gives only one point"
                               : "the data file \"" + m_sFilename + "\" gives no points in the " +
                                     FormatName(format) + " format";
        if (points.size() <= 1) return nullptr;
        m_sNoPointsCause.clear();
        Normalize(points);
        return std::make_shared<const std::vector<double>>(std::move(points));
    });
}

std::int32_t QZIviFgenArbWaveform::DataSize() {
    return Guard(m_oErr, "DataSize", [&] {
        if (!m_bDataGotOnce) Data();
        return m_lDataSize;
    });
}

void QZIviFgenArbWaveform::Normalize(std::vector<double>& points) const {
    if (m_lAutoNormalizeMode == qzivifgenNoAutoNormalize) return;
    double high = 0.0, low = 0.0;
    for (double p : points) {
        if (p > high) high = p;
        if (p < low) low = p;
    }
    const double peak = std::max(std::fabs(high), std::fabs(low));
    if (m_lAutoNormalizeMode == qzivifgenNormalize) {
        if (peak == 1.0) return;
        for (double& p : points)
            p = Divide(p, peak);
    } else {
        const double offset = (high + low) / 2;
        const double scale = peak - offset;
        for (double& p : points)
            p = Divide(p - offset, scale);
    }
}

void QZIviFgenArbWaveform::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                  const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
}

void QZIviFgenArbWaveform::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Item(\"" + m_sName + "\")");
}

void QZIviFgenArbWaveform::PersistedWfmSource(const std::string& value) {
    m_lPersistedWfmSource = Variant(value).AsInt32();
}

void QZIviFgenArbWaveform::InitProperties() {
    Name("");
    m_lWaveformHandle = 0;
    Source(qzivifgenASCIIFile);
    Data(std::vector<double>());
    Filename("");
    AutoNormalizeMode(qzivifgenNormalize);
    m_lPersistedWfmSource = 1;
    m_bDataGotOnce = false;
    m_aData = nullptr;
    UniqueId(NewUniqueId());
}

void QZIviFgenArbWaveform::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Waveform");
    Name(bag.ReadText(p + "Name", ""));
    Source(bag.ReadInt32(p + "Source", 1));
    Filename(bag.ReadText(p + "Filename", ""));
    AutoNormalizeMode(bag.ReadInt32(p + "AutoNormalizeMode", 1));
    PersistedWfmSource(bag.ReadText(p + "PersistedWfmSource", "1"));
    DataGotOnce(bag.ReadBool(p + "DataGotOnce", false));
    UniqueId(NewUniqueId());
    if (m_lSource != 0) return;
    const std::int32_t byteSize = bag.ReadInt32(p + "ByteSize", 0);
    if (byteSize <= 0) { // points claimed as got, but none held: none got, so it saves again
        m_bDataGotOnce = false;
        return;
    }
    if (byteSize % static_cast<std::int32_t>(sizeof(double)) != 0)
        RaiseRuntime(runtime::kImproperFile, "The waveform \"" + m_sName + "\" claims " +
                                                 std::to_string(byteSize) +
                                                 " bytes of points, which is no whole number of "
                                                 "8-byte points.");
    const SharedBytes bytes = bag.ReadSharedBytes(p + "Data");
    if (bytes.size() < static_cast<std::size_t>(byteSize))
        RaiseRuntime(runtime::kImproperFile, "The waveform \"" + m_sName + "\" claims " +
                                                 std::to_string(byteSize) +
                                                 " bytes of points but the bag holds " +
                                                 std::to_string(bytes.size()) + ".");
    std::vector<double> points(static_cast<std::size_t>(byteSize) / sizeof(double));
    std::memcpy(points.data(), bytes.data(), points.size() * sizeof(double));
    Data(std::move(points));
}

void QZIviFgenArbWaveform::WriteProperties(PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Waveform");
    bag.WriteText(p + "Name", m_sName, "");
    bag.WriteInt32(p + "Source", m_lSource, 1);
    bag.WriteText(p + "Filename", m_sFilename, "");
    bag.WriteInt32(p + "AutoNormalizeMode", m_lAutoNormalizeMode, 1);
    bag.WriteText(p + "PersistedWfmSource", PersistedWfmSource(), "1");
    bag.WriteBool(p + "DataGotOnce", m_bDataGotOnce, false);
    if (m_lSource != 0) return;
    const Points points = StoredPoints();
    if (!points || points->empty()) {
        bag.WriteInt32(p + "ByteSize", 0, 0);
        return;
    }
    const std::size_t size = points->size() * sizeof(double);
    bag.WriteInt32(p + "ByteSize", static_cast<std::int32_t>(size), 0);
    // The bag shares the points (they never change once made): a snapshot copies them once.
    bag.WriteBytes(p + "Data", SharedBytes::Alias(points, points->data(), size));
}

void QZIviFgenArbWaveform::Clone(QZIviFgenArbWaveform& target) {
    target.Name(m_sName);
    target.SetWaveformHandle(m_lWaveformHandle);
    target.Source(m_lSource);
    target.DataGotOnce(m_bDataGotOnce);
    target.Filename(m_sFilename);
    if (m_lSource == 0) {
        const Points points = StoredPoints();
        target.Data(points ? *points : std::vector<double>());
    }
    target.AutoNormalizeMode(m_lAutoNormalizeMode);
    target.PersistedWfmSource(PersistedWfmSource());
    target.UniqueId(m_sUniqueId);
}

// ---- Queue of deleted handles ------------------------------------------------------------------

void DeletedHandleQueue::RemoveDeletedHandleAt(std::int32_t i) {
    handles_.at(static_cast<std::size_t>(i - 1)) = handles_.back();
    handles_.pop_back();
    if (handles_.empty()) handles_ = std::vector<std::int32_t>();
}

// ---- QZIviFgenArbWaveforms ---------------------------------------------------------------------

std::shared_ptr<QZIviFgenArbWaveform> QZIviFgenArbWaveforms::Item(const Variant& Index) {
    return ItemOrRefuse(Index, errid::kNoSuchWaveform);
}

std::shared_ptr<QZIviFgenArbWaveform> QZIviFgenArbWaveforms::Add(const std::string& WaveformName,
                                                                 const Variant& Source,
                                                                 const std::string& Filename,
                                                                 const Variant& AutoNormalizeMode) {
    return Guard(m_oErr, "Add", [&] {
        auto waveform = NewItem(WaveformName);
        waveform->Source(Source.IsMissing() ? 0 : Source.AsInt32());
        waveform->Filename(Filename);
        if (!AutoNormalizeMode.IsMissing())
            waveform->AutoNormalizeMode(AutoNormalizeMode.AsInt32());
        m_oItems.Append(waveform);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kCollection, Variant::Object(shared_from_this()),
                                            ChangeAdded, Count(), "");
        return waveform;
    });
}

void QZIviFgenArbWaveforms::Remove(const Variant& Index) {
    Guard(m_oErr, "Remove", [&] {
        const std::int32_t position = m_oItems.RemovalPosition(Index);
        if (position == 0) StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        const auto waveform = m_oItems.At(position);
        Queue(waveform->WaveformHandle());
        const auto propSet = PropSet();
        if (propSet && propSet->Sequences()->Count() > 0)
            propSet->Sequences()->RemoveItemsOf(*waveform);
        m_oItems.RemoveAt(position);
        if (propSet)
            propSet->RaiseCollectionChanged(kCollection, Variant::Object(shared_from_this()),
                                            ChangeRemoved, position, "");
    });
}

std::int32_t QZIviFgenArbWaveforms::GetMaxNumWaveforms() {
    return Limit("GetMaxNumWaveforms", IVIFGEN_ATTR_MAX_NUM_WAVEFORMS);
}
std::int32_t QZIviFgenArbWaveforms::GetMaxWaveformSize() {
    return Limit("GetMaxWaveformSize", IVIFGEN_ATTR_MAX_WAVEFORM_SIZE);
}
std::int32_t QZIviFgenArbWaveforms::GetMinWaveformSize() {
    return Limit("GetMinWaveformSize", IVIFGEN_ATTR_MIN_WAVEFORM_SIZE);
}
std::int32_t QZIviFgenArbWaveforms::GetWaveformQuantum() {
    return Limit("GetWaveformQuantum", IVIFGEN_ATTR_WAVEFORM_QUANTUM);
}

} // namespace qzivi
