// A property tree attached to an error report, with what its events and failures report.
#pragma once

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/support/failure.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>
#include <unistd.h>

namespace qzivi::test {

struct Change {
    std::string collection;
    std::int32_t kind;
    std::string first;
    std::string second;
    bool operator==(const Change&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const Change& c) {
    return out << c.collection << " " << c.kind << " " << c.first << " " << c.second;
}

// Everything a user set in a tree, as text, references by name.
inline std::string Describe(CIviFgenPropImp& t) {
    std::ostringstream o;
    o << t.ArbSampleRate() << ' ' << t.AutoStopStart() << ' ' << t.Extensions() << ' '
      << t.OutputMode() << ' ' << t.RefClockSource() << ' ' << t.LogicalName() << ' '
      << t.AutoConfigure() << ' ' << t.Enabled() << ' ' << t.UIStyle() << ' '
      << t.ExceptionOnError() << '\n';
    const auto& in = *t.Internal();
    o << in.AMInternalDepth() << ' ' << in.AMInternalFrequency() << ' ' << in.AMInternalWaveform()
      << ' ' << in.FMInternalDeviation() << ' ' << in.FMInternalFrequency() << ' '
      << in.FMInternalWaveform() << ' ' << in.InternalTriggerRate() << '\n';
    for (const auto& c : *t.Channels())
        o << "channel " << c->Name() << ' ' << c->AMEnabled() << ' ' << c->AMSource() << ' '
          << c->ArbFrequency() << ' ' << c->ArbGain() << ' ' << c->ArbOffset() << ' '
          << (c->ArbWaveform() ? c->ArbWaveform()->Name() : "-") << ' ' << c->BurstCount() << ' '
          << c->FMEnabled() << ' ' << c->FMSource() << ' ' << c->FuncAmplitude() << ' '
          << c->FuncDCOffset() << ' ' << c->FuncDutyCycleHigh() << ' ' << c->FuncFrequency() << ' '
          << c->FuncStartPhase() << ' ' << c->FuncWaveform() << ' ' << c->OperationMode() << ' '
          << c->OutputEnabled() << ' ' << c->OutputImpedance() << ' '
          << (c->Sequence() ? c->Sequence()->Name() : "-") << ' ' << c->TriggerSource() << '\n';
    for (const auto& w : *t.Waveforms()) {
        o << "waveform " << w->Name() << ' ' << w->Source() << ' ' << w->Filename() << ' '
          << w->AutoNormalizeMode() << ' ' << w->PersistedWfmSource() << ' ' << w->DataSize()
          << ':';
        if (const auto points = w->Data())
            for (double p : *points)
                o << ' ' << p;
        o << '\n';
    }
    for (const auto& s : *t.Sequences()) {
        o << "sequence " << s->Name();
        for (const auto& item : *s)
            o << " (" << (item->Waveform() ? item->Waveform()->Name() : "-") << " x"
              << item->Iterations() << ')';
        o << '\n';
    }
    return o.str();
}

class TreeTest : public ::testing::Test {
protected:
    TreeTest() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        err_ = std::make_shared<CIviErrorReport>();
        tree_ = NewTree();
        tree_->SetPath("Fgen1");
        changes_ = tree_->CollectionChanged.Connect([this](const std::string& name, const Variant&,
                                                           std::int32_t kind, const Variant& first,
                                                           const Variant& second) {
            seen_.push_back({name, kind, first.AsText(), second.AsText()});
        });
        errors_ = err_->Error.Connect([this](std::int32_t code, const std::string&,
                                             const std::string&) { codes_.push_back(code); });
        dir_ =
            std::filesystem::temp_directory_path() / ("qzivi-tree-" + std::to_string(::getpid()));
        std::filesystem::create_directories(dir_);
    }
    ~TreeTest() override { std::filesystem::remove_all(dir_); }

    std::shared_ptr<CIviFgenPropImp> NewTree() {
        auto tree = CIviFgenPropImp::Create();
        tree->Attach(err_);
        tree->InitProperties();
        return tree;
    }

    // The number of the failure that reaches the caller, 0 for none.
    static std::int32_t Raised(const std::function<void()>& action) {
        try {
            action();
        } catch (const Failure& f) {
            return f.Number();
        }
        return 0;
    }

    std::string File(const std::string& name, const std::string& bytes) {
        const auto path = (dir_ / name).string();
        std::ofstream(path, std::ios::binary) << bytes;
        return path;
    }

    std::shared_ptr<CIviErrorReport> err_;
    std::shared_ptr<CIviFgenPropImp> tree_;
    std::vector<Change> seen_;
    std::vector<std::int32_t> codes_;
    Connection changes_, errors_;
    std::filesystem::path dir_;
};

} // namespace qzivi::test
