// CIviFgenIOImp: the engine, the only class that makes output calls on the driver. Configure turns
// the whole property tree into driver calls in one fixed order; Initiate, Abort and
// SendSoftwareTrigger run generation; the capability queries tell the panels what the driver takes.
#pragma once

#include "IviFgen.h"
#include "qzivi/support/event.h"
#include "qzivi/support/variant.h"

#include <cstdint>
#include <initializer_list>
#include <memory>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class QZIviFgenChannel;

// The type forms of the attribute check and read family.
enum class AttrType { Boolean, Int32, Real64, Session, String };

class CIviFgenIOImp {
public:
    CIviFgenIOImp() = default;
    // Closes an open session, whatever fails.
    ~CIviFgenIOImp();
    CIviFgenIOImp(const CIviFgenIOImp&) = delete;
    CIviFgenIOImp& operator=(const CIviFgenIOImp&) = delete;

    void Construct(std::shared_ptr<CIviFgenPropImp> propSet,
                   std::shared_ptr<CIviErrorReport> errorReport);
    void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet);
    const std::shared_ptr<CIviFgenPropImp>& PropSet() const { return m_oProp; }

    // Opens the session of the set's LogicalName, unless the set is not Enabled.
    void Init(bool doIDQuery, bool doReset, const std::string& optionString,
              std::int32_t reInitBehavior);
    void CloseSession();

    // Sends the whole tree. The control passes false; the sequence pre-pass passes true.
    void Configure(bool internalCall);
    void Initiate(bool internalCall);
    void Abort(bool internalCall);
    void SendSoftwareTrigger();

    // ---- Capability queries ----
    // Minimum and maximum of a 64-bit float attribute, from the driver or from fixed fallbacks.
    std::vector<double> IviFgenGetRanges(ViAttr id, const std::string& channel);
    // Positions 0 to 5: the standard waveforms; 6: arbitrary waveforms; 7: sequences; each 1 or 0.
    // With keepStandard the first six stay as the last call left them (empty before any).
    std::vector<Variant> IVIFgenGetValidFunctions(bool keepStandard);
    // Whether the driver would take the value; nothing is reported.
    bool CheckAttributeVi(AttrType type, ViAttr id, const Variant& value,
                          const std::string& channel);
    // The value; a negative status raises with Path + "GetAttribute".
    Variant GetAttributeVi(AttrType type, ViAttr id, const std::string& channel);

    // What the instrument's output carries: `count` samples in volts from `startTime` seconds after
    // generation started, `timeStep` apart. Needs an open session and a driver that renders (the
    // simulator does); anything else raises with Path + "RenderOutput".
    std::vector<double> RenderOutput(const std::string& channel, double startTime, double timeStep,
                                     std::int32_t count);

    Event<> Configured;
    Event<std::int32_t, const std::string&, const std::string&> Error;

private:
    // One value of a checked call: its attribute, which names the owner's property row if the
    // call is refused.
    struct Param {
        template <typename Number>
        Param(ViAttr id, Number value) : id(id), value(static_cast<double>(value)) {}
        ViAttr id;
        double value;
    };

    void Run(bool internalCall);
    // `owner` is the object whose property rows and Path name a refused value.
    template <typename Owner>
    void Checked(ViStatus status, const char* word, const std::string& channel, const Owner& owner,
                 std::initializer_list<Param> params);
    void CheckExtensions(std::int32_t extensions, std::string_view capabilities);
    bool CheckNumber(AttrType type, ViAttr id, double value, const char* channel);
    void ClearDeletedHandles();
    void CreateMissingHandles();
    void ConfigureChannel(QZIviFgenChannel& channel, bool& anyTrigger, bool& anyAM, bool& anyFM);
    void Generation(bool internalCall, std::int32_t mask, const char* word,
                    ViStatus (*call)(ViSession));
    void ResetHandles();
    ViSession Vi() const;
    const std::string& Path() const;

    std::shared_ptr<CIviFgenPropImp> m_oProp;
    std::shared_ptr<CIviErrorReport> m_oErr;
    bool m_bSeqPrepassDone = false;
    bool m_bArbMemoryCleared = false;
    std::vector<Variant> m_aValidFunctions = std::vector<Variant>(8);
    std::int32_t m_lCheckedExtensions = -1; // the last extensions the driver was found to offer
    std::string m_sCheckedCapabilities;
    Connection m_cError, m_cAllError, m_cSessionClosed;
};

} // namespace qzivi
