// The simulator's attribute catalogue: one row per attribute with its type, group and access,
// and the words its refusals use.
#pragma once

#include "IviFgen.h"
#include "synthesis.h"

#include <string>
#include <variant>

namespace qzivi::sim {

class Instrument;

enum class Group {
    Base,
    StdFunc,
    ArbWfm,
    ArbFrequency,
    ArbSeq,
    Trigger,
    InternalTrigger,
    SoftwareTrigger,
    Burst,
    ModulateAM,
    ModulateFM,
};
// "IviFgenBase", "IviFgenStdFunc", ...
const char* GroupName(Group group);

using AttrValue = std::variant<ViInt32, ViReal64, ViBoolean, ViSession, std::string>;
enum class Kind { Int32, Real64, Boolean, Session, String };
const char* KindName(Kind kind);
inline Kind KindOf(const AttrValue& value) {
    return static_cast<Kind>(value.index());
}

struct AttrInfo {
    ViAttr id;
    const char* name;
    Kind kind;
    Group group;
    bool perChannel;
    // A setting: its number in a state, and how a number is stored there (null if read-only).
    double (*read)(const GlobalState&, const ChannelState&);
    void (*write)(GlobalState&, ChannelState&, double);
    // A fixed fact of the instrument (identity, limits): read instead of `read`.
    AttrValue (*fact)(const Instrument&);
};

// The row of an attribute, or null.
const AttrInfo* FindAttr(ViAttr id);
// Its name for messages; "attribute" for an unknown one.
const char* AttrName(ViAttr id);

// The words of refusals.
std::string Number(double value);
[[noreturn]] void Invalid(const std::string& what);
[[noreturn]] void NotSupported(ViAttr attr, ViInt32 value);

} // namespace qzivi::sim
