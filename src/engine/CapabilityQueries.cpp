// The engine's queries of what the driver takes and offers: the check and read families, the
// ranges of a value with their fallbacks, and which output functions the panels may offer.
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"

namespace qzivi {

namespace {
bool Has(std::int32_t extensions, std::int32_t flag) {
    return (extensions & flag) != 0;
}
} // namespace

// ---- Capability queries -------------------------------------------------------------------------

bool CIviFgenIOImp::CheckNumber(AttrType type, ViAttr id, double value, const char* channel) {
    return type == AttrType::Real64 ? CheckAttributeVi(type, id, value, channel)
                                    : CheckAttributeVi(type, id, static_cast<int>(value), channel);
}

bool CIviFgenIOImp::CheckAttributeVi(AttrType type, ViAttr id, const Variant& value,
                                     const std::string& channel) {
    const ViSession vi = Vi();
    const char* ch = channel.c_str();
    ViStatus status = 0;
    switch (type) {
    case AttrType::Boolean:
        status =
            IviFgen_CheckAttributeViBoolean(vi, ch, id, static_cast<ViBoolean>(value.AsInt16()));
        break;
    case AttrType::Int32:
        status = IviFgen_CheckAttributeViInt32(vi, ch, id, value.AsInt32());
        break;
    case AttrType::Real64:
        status = IviFgen_CheckAttributeViReal64(vi, ch, id, value.AsDouble());
        break;
    case AttrType::Session:
        status =
            IviFgen_CheckAttributeViSession(vi, ch, id, static_cast<ViSession>(value.AsInt32()));
        break;
    case AttrType::String:
        status = IviFgen_CheckAttributeViString(vi, ch, id, value.AsText().c_str());
        break;
    }
    if (status == IVI_ERROR_FUNCTION_NOT_SUPPORTED) status = 0;
    return status == 0;
}

Variant CIviFgenIOImp::GetAttributeVi(AttrType type, ViAttr id, const std::string& channel) {
    const ViSession vi = Vi();
    const char* ch = channel.c_str();
    ViStatus status = 0;
    Variant result;
    switch (type) {
    case AttrType::Boolean: {
        ViBoolean v = 0;
        status = IviFgen_GetAttributeViBoolean(vi, ch, id, &v);
        result = static_cast<int>(static_cast<std::int16_t>(v));
        break;
    }
    case AttrType::Int32: {
        ViInt32 v = 0;
        status = IviFgen_GetAttributeViInt32(vi, ch, id, &v);
        result = static_cast<int>(v);
        break;
    }
    case AttrType::Real64: {
        ViReal64 v = 0;
        status = IviFgen_GetAttributeViReal64(vi, ch, id, &v);
        result = v;
        break;
    }
    case AttrType::Session: {
        ViSession v = 0;
        status = IviFgen_GetAttributeViSession(vi, ch, id, &v);
        result = static_cast<int>(static_cast<std::int32_t>(v));
        break;
    }
    case AttrType::String: {
        ViChar text[1000] = {};
        status = IviFgen_GetAttributeViString(vi, ch, id, sizeof text, text);
        result = TrimAtNull(text, sizeof text);
        break;
    }
    }
    m_oErr->IviCheckError(status, Path() + "GetAttribute", 0, "");
    return result;
}

std::vector<double> CIviFgenIOImp::IviFgenGetRanges(ViAttr id, const std::string& channel) {
    double minimum = 0, maximum = 0;
    ViSession specific = 0;
    ViStatus status = IviFgen_GetSpecificDriverCHandle(Vi(), &specific);
    if (status == 0) {
        ViBoolean hasMinimum = 0, hasMaximum = 0;
        status = Ivi_GetAttrMinMaxViReal64(specific, channel.c_str(), id, &minimum, &maximum,
                                           &hasMinimum, &hasMaximum);
    }
    m_oErr->IviCheckError(status, "", 8, "");
    if (status != 0) {
        struct Fallback {
            ViAttr id;
            double minimum, maximum;
        };
        static constexpr Fallback kFallbacks[] = {
            {IVIFGEN_ATTR_FUNC_AMPLITUDE, -10, 10},
            {IVIFGEN_ATTR_FUNC_DC_OFFSET, -10, 10},
            {IVIFGEN_ATTR_FUNC_FREQUENCY, 1e-10, 1e12},
            {IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, 0, 100},
            {IVIFGEN_ATTR_ARB_GAIN, 0.1, 5},
            {IVIFGEN_ATTR_ARB_OFFSET, -5, 5},
            {IVIFGEN_ATTR_ARB_FREQUENCY, 1e-11, 1e12},
        };
        minimum = maximum = 0;
        for (const auto& f : kFallbacks)
            if (f.id == id) {
                minimum = f.minimum;
                maximum = f.maximum;
            }
    }
    return {minimum, maximum};
}

std::vector<Variant> CIviFgenIOImp::IVIFgenGetValidFunctions(bool keepStandard) {
    const std::int32_t ext = m_oProp->Extensions();
    if (!keepStandard)
        for (std::int32_t v = 1; v <= 6; ++v) {
            const bool available =
                Has(ext, qzivifgenStdFuncExt) &&
                (CheckAttributeVi(AttrType::Int32, IVIFGEN_ATTR_FUNC_WAVEFORM, v, "") ||
                 CheckAttributeVi(AttrType::Int32, IVIFGEN_ATTR_FUNC_WAVEFORM, v, "1"));
            m_aValidFunctions[static_cast<std::size_t>(v - 1)] = available ? 1 : 0;
        }
    ViInt32 a = 0, b = 0, c = 0, d = 0;
    m_aValidFunctions[6] = Has(ext, qzivifgenArbWfmExt) &&
                                   IviFgen_QueryArbWfmCapabilities(Vi(), &a, &b, &c, &d) == 0 &&
                                   m_oProp->Waveforms()->Count() > 0
                               ? 1
                               : 0;
    m_aValidFunctions[7] = Has(ext, qzivifgenArbSeqExt) &&
                                   IviFgen_QueryArbSeqCapabilities(Vi(), &a, &b, &c, &d) == 0 &&
                                   m_oProp->Sequences()->Count() > 0
                               ? 1
                               : 0;
    return m_aValidFunctions;
}

} // namespace qzivi
