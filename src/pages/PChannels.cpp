#include "qzivi/pages/PChannels.h"

#include "qzivi/support/scoped_hook.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/Channels.h"
#include "qzivi/model/QZIviFgenEnum.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/text.h"

#include <QCheckBox>
#include <QComboBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QStackedLayout>
#include <QTabBar>
#include <QVBoxLayout>

#include <optional>

namespace qzivi {

namespace {

using Channel = QZIviFgenChannel;

enum class Kind { Text, List, Check };

struct FieldRow {
    Kind kind;
    const char* caption;
    int frame;
    const char* tip;
};

constexpr FieldRow kRows[PChannels::kFields] = {
    {Kind::Text, "Amplitude (V):", 1, "Changes the waveform amplitude."},
    {Kind::Text, "Frequency (Hz):", 1, "Changes the output frequency."},
    {Kind::Text, "Phase (Deg):", 1, "Changes the start phase of the output function."},
    {Kind::Text, "Duty cycle (%):", 1, "Changes the duty cycle for a square waveform."},
    {Kind::Text, "Offset (V):", 1, "Changes the waveform offset."},
    {Kind::List, "Waveform:", 1, "Selects the output function."},
    {Kind::Text, "Output impedance:", 2, "Changes the output impedance."},
    {Kind::List, "Operation mode:", 2, "Selects the operation mode."},
    {Kind::List, "Trigger source:", 2, "Selects the trigger source."},
    {Kind::Text, "Burst count:", 2, "Changes the burst count."},
    {Kind::Check, "AM enabled", 3, "Enables amplitude modulation on the carrier waveform."},
    {Kind::List, "AM source:", 3, "Selects the source for amplitude modulation."},
    {Kind::Check, "FM enabled", 3, "Enables frequency modulation on the carrier waveform."},
    {Kind::List, "FM source:", 3, "Selects the source for frequency modulation."},
    {Kind::List, "Waveform:", 4, "Selects the output waveform."},
    {Kind::Text, "Frequency (Hz):", 4, "Changes the output frequency."},
    {Kind::Text, "Waveform gain:", 4, "Changes the waveform gain."},
    {Kind::Text, "Waveform offset (V):", 4, "Changes the waveform offset."},
    {Kind::List, "Sequence:", 5, "Selects the output sequence."},
    {Kind::Text, "Frequency (Hz):", 5, "Changes the output frequency."},
    {Kind::Text, "Waveform gain:", 5, "Changes the waveform gain."},
    {Kind::Text, "Waveform offset (V):", 5, "Changes the waveform offset."},
};

// The edit boxes of a channel's numbers; the arbitrary ones, which stand twice (frames 4 and 5),
// are ShowArb's and WriteArb's.
struct NumberField {
    int index;
    double (*get)(const Channel&);
    void (*set)(Channel&, double);
};

constexpr NumberField kNumbers[] = {
    {0, [](const Channel& c) { return c.FuncAmplitude(); },
     [](Channel& c, double v) { c.FuncAmplitude(v); }},
    {1, [](const Channel& c) { return c.FuncFrequency(); },
     [](Channel& c, double v) { c.FuncFrequency(v); }},
    {2, [](const Channel& c) { return c.FuncStartPhase(); },
     [](Channel& c, double v) { c.FuncStartPhase(v); }},
    {3, [](const Channel& c) { return c.FuncDutyCycleHigh(); },
     [](Channel& c, double v) { c.FuncDutyCycleHigh(v); }},
    {4, [](const Channel& c) { return c.FuncDCOffset(); },
     [](Channel& c, double v) { c.FuncDCOffset(v); }},
    {6, [](const Channel& c) { return c.OutputImpedance(); },
     [](Channel& c, double v) { c.OutputImpedance(v); }},
    {9, [](const Channel& c) { return static_cast<double>(c.BurstCount()); },
     [](Channel& c, double v) { c.BurstCount(Variant(v).AsInt32()); }},
};

// Frequency, gain and offset from the field `first` on.
void ShowArb(const Channel& c, QLineEdit* const* txt, int first) {
    txt[first]->setText(QString::fromStdString(text::FormatNumber(c.ArbFrequency())));
    txt[first + 1]->setText(QString::fromStdString(text::FormatNumber(c.ArbGain())));
    txt[first + 2]->setText(QString::fromStdString(text::FormatNumber(c.ArbOffset())));
}

double Number(const QLineEdit& field) {
    return ParseLeadingNumber(field.text().toStdString());
}

void WriteArb(Channel& c, QLineEdit* const* txt, int first) {
    c.ArbFrequency(Number(*txt[first]));
    c.ArbGain(Number(*txt[first + 1]));
    c.ArbOffset(Number(*txt[first + 2]));
}

// The lists of fixed values: field, names, property.
struct ListField {
    int index;
    Variant (QZIviFgenEnum::*names)(std::int32_t) const;
    std::int32_t (*get)(const Channel&);
    void (*set)(Channel&, std::int32_t);
};

const ListField kLists[] = {
    {5, &QZIviFgenEnum::FuncWaveformNames, [](const Channel& c) { return c.FuncWaveform(); },
     [](Channel& c, std::int32_t v) { c.FuncWaveform(v); }},
    {7, &QZIviFgenEnum::OperationModeNames, [](const Channel& c) { return c.OperationMode(); },
     [](Channel& c, std::int32_t v) { c.OperationMode(v); }},
    {8, &QZIviFgenEnum::TriggerSourceNames, [](const Channel& c) { return c.TriggerSource(); },
     [](Channel& c, std::int32_t v) { c.TriggerSource(v); }},
    {11, &QZIviFgenEnum::AMSourceNames, [](const Channel& c) { return c.AMSource(); },
     [](Channel& c, std::int32_t v) { c.AMSource(v); }},
    {13, &QZIviFgenEnum::FMSourceNames, [](const Channel& c) { return c.FMSource(); },
     [](Channel& c, std::int32_t v) { c.FMSource(v); }},
};

constexpr std::int32_t kOutputModeExtensions =
    qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt;

} // namespace

PChannels::PChannels(QWidget* parent) : PropertyPage(tr("Channels"), parent) {
    lstChans = new QListWidget(this);
    lstChans->setObjectName("lstChans");
    lstChans->setToolTip(tr("Selects a channel."));
    lstChans->setAccessibleName(tr("Channels"));
    cmdAdd = new QPushButton(tr("Add"), this);
    cmdAdd->setObjectName("cmdAdd");
    cmdAdd->setToolTip(tr("Adds a channel."));
    cmdDel = new QPushButton(tr("Remove"), this);
    cmdDel->setObjectName("cmdDel");
    cmdDel->setToolTip(tr("Removes a channel."));
    txtRename = new QLineEdit(this);
    txtRename->setObjectName("txtRename");
    txtRename->setToolTip(tr("Rename the channel."));
    tabChan = new QTabBar(this);
    tabChan->setObjectName("tabChan");
    for (const char* caption : {"Output Signal", "Operation", "Modulation"})
        tabChan->addTab(tr(caption));
    tabChan->setExpanding(false);
    BuildFields();

    auto* box = new QFrame(this);
    box->setFrameShape(QFrame::StyledPanel);
    m_oFrames = new QStackedLayout(box);
    for (QFrame* frame : fraChan)
        m_oFrames->addWidget(frame);
    auto* left = new QVBoxLayout;
    left->addWidget(lstChans, 1);
    auto* buttons = new QHBoxLayout;
    buttons->addWidget(cmdAdd);
    buttons->addWidget(cmdDel);
    left->addLayout(buttons);
    auto* right = new QVBoxLayout;
    right->setSpacing(0);
    right->addWidget(tabChan);
    right->addWidget(box, 1);
    auto* layout = new QHBoxLayout(this);
    layout->addLayout(left, 2);
    layout->addLayout(right, 5);

    m_oLUI.Attach(lstChans, cmdAdd, cmdDel, txtRename);
    m_oLUI.CheckBoxes(true);
    m_oLUI.BaseName("CHANNEL");
    ConnectList();
    // A click on the tab in view switches too: it is how the page notices extensions gone.
    connect(tabChan, &QTabBar::tabBarClicked, this, [this](int tab) {
        if (tab == tabChan->currentIndex()) Handled([&] { SwitchFrame(tab + 1); });
    });
    connect(tabChan, &QTabBar::currentChanged, this,
            [this](int tab) { Handled([&] { SwitchFrame(tab + 1); }); });
    connect(txtRename, &QLineEdit::textChanged, this, [this] {
        if (!m_bUpdating) Changed(true);
    });
    connect(lstChans, &QListWidget::itemChanged, this, [this](QListWidgetItem* item) {
        Handled([&] { OutputChecked(lstChans->row(item)); });
    });
}

void PChannels::BuildFields() {
    QFormLayout* forms[kFrames];
    for (int f = 0; f < kFrames; ++f) {
        fraChan[f] = new QFrame(this);
        fraChan[f]->setObjectName(QStringLiteral("fraChan%1").arg(f));
        forms[f] = new QFormLayout(fraChan[f]);
        forms[f]->setFieldGrowthPolicy(QFormLayout::AllNonFixedFieldsGrow);
    }
    for (int i = 0; i < kFields; ++i) {
        const FieldRow& field = kRows[i];
        QFrame* frame = fraChan[field.frame];
        const QString tip = tr(field.tip);
        QWidget* control = nullptr;
        switch (field.kind) {
        case Kind::Text:
            txtChan[i] = new QLineEdit(frame);
            connect(txtChan[i], &QLineEdit::textChanged, this, [this] {
                if (!m_bUpdating) Changed(true);
            });
            control = txtChan[i];
            control->setObjectName(QStringLiteral("txtChan%1").arg(i));
            break;
        case Kind::List:
            cmbChannel[i] = new QComboBox(frame); // fixed: nothing can be typed
            connect(cmbChannel[i], &QComboBox::currentIndexChanged, this, [this] {
                Handled([&] {
                    if (!m_bUpdating) Changed(true);
                    Update(true);
                });
            });
            control = cmbChannel[i];
            control->setObjectName(QStringLiteral("cmbChannel%1").arg(i));
            break;
        case Kind::Check:
            chkChan[i] = new QCheckBox(tr(field.caption), frame);
            connect(chkChan[i], &QCheckBox::clicked, this,
                    [this] { Handled([&] { CheckBoxClicked(); }); });
            control = chkChan[i];
            control->setObjectName(QStringLiteral("chkChan%1").arg(i));
            break;
        }
        control->setToolTip(tip);
        if (field.kind == Kind::Check) {
            forms[field.frame]->addRow(control);
            continue;
        }
        lblChan[i] = new QLabel(tr(field.caption), frame);
        lblChan[i]->setObjectName(QStringLiteral("lblChan%1").arg(i));
        lblChan[i]->setToolTip(tip);
        lblChan[i]->setBuddy(control);
        control->setAccessibleName(lblChan[i]->text().chopped(1));
        forms[field.frame]->addRow(lblChan[i], control);
    }
    lblChan[kFields] = new QLabel(
        tr("There are no output mode extensions checked on the extensions property page."),
        fraChan[0]);
    lblChan[kFields]->setObjectName(QStringLiteral("lblChan%1").arg(kFields));
    lblChan[kFields]->setWordWrap(true);
    forms[0]->addRow(lblChan[kFields]);
}

void PChannels::ConnectList() {
    m_vEvents.push_back(m_oLUI.BeforeAdd.Connect([this](std::string&) {
        if (!m_bUpdating && lstChans->count() > 0) Handled([&] { Write(false); });
    }));
    m_vEvents.push_back(m_oLUI.ItemAdded.Connect([this](std::int32_t index) {
        if (m_bUpdating) return;
        Handled([&] {
            Changed(true);
            Props().Channels()->Add(lstChans->item(index)->text().toStdString());
            m_lSelected = index;
            Show();
            Update(true);
        });
    }));
    m_vEvents.push_back(m_oLUI.BeforeRemove.Connect([this](std::int32_t) { m_bRemoving = true; }));
    m_vEvents.push_back(m_oLUI.ItemRemoved.Connect([this](std::int32_t index) {
        if (!m_bUpdating)
            Handled([&] {
                Changed(true);
                Props().Channels()->Remove(index + 1);
                m_lSelected = std::max(0, lstChans->currentRow());
                if (lstChans->count() > 0) Show();
                Update(true);
                Link().AlertChanges();
            });
        m_bRemoving = false;
    }));
    m_vEvents.push_back(m_oLUI.ListItemSelected.Connect([this](std::int32_t& index) {
        if (m_bUpdating) return;
        Handled([&] {
            if (Props().Channels()->Count() > index && index >= 0) {
                if (!m_bRemoving) Write(true);
                Show();
            }
            m_lSelected = index;
        });
    }));
    m_vEvents.push_back(
        m_oLUI.Validate.Connect([this](std::int32_t& index, std::string& text, bool& cancel) {
            if (!m_bUpdating) Handled([&] { Validate(index, text, cancel); });
        }));
}

int PChannels::FrameShown() const {
    return m_oFrames->currentIndex();
}

std::shared_ptr<QZIviFgenChannel> PChannels::Selected() {
    auto& channels = *Props().Channels();
    const int row = lstChans->currentRow();
    return channels.Count() > row && row >= 0 ? channels.Item(row + 1) : nullptr;
}

void PChannels::Painting() {
    SwitchFrame(m_lTab);
}

void PChannels::Load() {
    const FlagHold updating(m_bUpdating);
    ClearFields();
    CIviFgenPropImp& props = Props();
    const QZIviFgenEnum names;
    for (const ListField& list : kLists)
        FillComboFromTable(*cmbChannel[list.index], (names.*list.names)(props.Extensions()), true);
    lstChans->clear();
    auto& channels = *props.Channels();
    for (const auto& channel : channels) {
        m_oLUI.Add(channel->Name());
        // Every entry shows its own output, not only the one shown.
        lstChans->item(lstChans->count() - 1)
            ->setCheckState(channel->OutputEnabled() ? Qt::Checked : Qt::Unchecked);
    }
    m_lSelected = 0;
    if (channels.Count() > 0) {
        lstChans->setCurrentRow(0);
        Show();
    }
    Update(true);
}

void PChannels::ClearFields() {
    for (int i = 0; i < kFields; ++i) {
        if (txtChan[i]) txtChan[i]->clear();
        if (cmbChannel[i]) ClearCombo(*cmbChannel[i]);
    }
}

void PChannels::Show() {
    const auto channel = Selected();
    if (!channel) return;
    const bool refill = m_bUpdating;
    const FlagHold updating(m_bUpdating);
    Channel& c = *channel;
    std::optional<FlagHold> filling(m_bEnabling); // the enabling waits for the whole channel
    for (const NumberField& number : kNumbers)
        txtChan[number.index]->setText(QString::fromStdString(text::FormatNumber(number.get(c))));
    for (const ListField& list : kLists) {
        SelectComboEntry(*cmbChannel[list.index], list.get(c), true, false);
        if (list.index == 7) c.OperationMode(ComboNumber(*cmbChannel[7]));
    }
    chkChan[10]->setChecked(c.AMEnabled());
    chkChan[12]->setChecked(c.FMEnabled());
    FillNames(14, false, c);
    ShowArb(c, txtChan, 15);
    FillNames(18, true, c);
    ShowArb(c, txtChan, 19);
    SwitchFrame(tabChan->currentIndex() + 1);
    filling.reset();
    if (refill && lstChans->currentItem()) // the switch empties the list without an output mode
        lstChans->currentItem()->setCheckState(c.OutputEnabled() ? Qt::Checked : Qt::Unchecked);
    // The enabled state follows the channel shown, whichever list changed on the way.
    Enabling(true);
}

// Fills the waveform (14) or sequence (18) list. A channel in that output mode without a
// reference takes the first entry, which is a change of the page's.
void PChannels::FillNames(int field, bool sequences, QZIviFgenChannel& channel) {
    QComboBox& list = *cmbChannel[field];
    CIviFgenPropImp& props = Props();
    list.clear();
    const std::int32_t count = sequences ? props.Sequences()->Count() : props.Waveforms()->Count();
    if (count == 0) { // an entry that no name finds, so it writes none
        list.addItem(tr("None"));
        list.setCurrentIndex(0);
        return;
    }
    if (sequences)
        for (const auto& sequence : *props.Sequences())
            list.addItem(QString::fromStdString(sequence->Name()));
    else
        for (const auto& waveform : *props.Waveforms())
            list.addItem(QString::fromStdString(waveform->Name()));
    const bool none = sequences ? !channel.Sequence() : !channel.ArbWaveform();
    if (none) {
        list.setCurrentIndex(0);
        const std::string first = list.currentText().toStdString();
        if (sequences)
            channel.Sequence(props.Sequences()->Item(props.Sequences()->IndexOfName(first)));
        else
            channel.ArbWaveform(props.Waveforms()->Item(props.Waveforms()->IndexOfName(first)));
        if (props.OutputMode() == (sequences ? qzivifgenOutputSeq : qzivifgenOutputArb))
            Changed(true);
    } else {
        SelectComboEntry(list,
                         sequences ? channel.Sequence()->Name() : channel.ArbWaveform()->Name(),
                         true, false);
    }
}

void PChannels::Apply() {
    Write(false);
    // A rename that the validation ended goes along: OK must not lose it.
    Link().ApplyChanges(true);
}

void PChannels::Write(bool spareValidation) {
    if (!spareValidation) m_oLUI.CommitRename();
    CIviFgenPropImp& props = Props();
    auto& channels = *props.Channels();
    if (lstChans->count() == 0 || channels.Count() == 0) return;
    std::int32_t index = m_lSelected;
    if (index + 1 > channels.Count() || index < 0) index = 0;
    Channel& c = *channels.Item(index + 1);
    for (const NumberField& number : kNumbers)
        number.set(c, Number(*txtChan[number.index]));
    for (const ListField& list : kLists)
        list.set(c, ComboNumber(*cmbChannel[list.index]));
    c.AMEnabled(chkChan[10]->isChecked());
    c.FMEnabled(chkChan[12]->isChecked());
    auto& waveforms = *props.Waveforms();
    const std::int32_t waveform =
        waveforms.IndexOfName(cmbChannel[14]->currentText().toStdString());
    c.ArbWaveform(waveform == -1 ? nullptr : waveforms.Item(waveform));
    if (props.OutputMode() == qzivifgenOutputArb) WriteArb(c, txtChan, 15);
    auto& sequences = *props.Sequences();
    const std::int32_t sequence =
        sequences.IndexOfName(cmbChannel[18]->currentText().toStdString());
    c.Sequence(sequence == -1 ? nullptr : sequences.Item(sequence));
    if (props.OutputMode() == qzivifgenOutputSeq) WriteArb(c, txtChan, 19);
}

void PChannels::Update(bool on) {
    m_oLUI.Enabled(on && (Props().Extensions() & kOutputModeExtensions));
    Enabling(on && lstChans->count() > 0);
}

void PChannels::Enabling(bool on) {
    if (m_bEnabling) return; // the lists it clears come back here
    const FlagHold enabling(m_bEnabling);
    const FlagHold updating(m_bUpdating);
    if (!on) ClearFields();
    // The field of index i and its label.
    const auto open = [&](int i, bool state) {
        for (QWidget* w : {static_cast<QWidget*>(txtChan[i]), static_cast<QWidget*>(cmbChannel[i]),
                           static_cast<QWidget*>(chkChan[i]), static_cast<QWidget*>(lblChan[i])})
            if (w) w->setEnabled(state);
    };
    for (int i = 0; i < kFields; ++i)
        open(i, on);
    const std::int32_t ext = Props().Extensions();
    open(9, on && (ext & qzivifgenBurstExt));
    open(8, on && (ext & qzivifgenTriggerExt));
    open(10, on && (ext & qzivifgenModulateAMExt));
    open(11, on && (ext & qzivifgenModulateAMExt) && chkChan[10]->isChecked());
    open(12, on && (ext & qzivifgenModulateFMExt));
    open(13, on && (ext & qzivifgenModulateFMExt) && chkChan[12]->isChecked());
    open(3, lstChans->count() > 0 && ComboNumber(*cmbChannel[5]) == qzivifgenWaveformSquare);
    // A duty cycle that comes back shows the channel's; one being typed stays.
    if (txtChan[3]->isEnabled() && txtChan[3]->text().isEmpty())
        if (const auto channel = Selected())
            txtChan[3]->setText(
                QString::fromStdString(text::FormatNumber(channel->FuncDutyCycleHigh())));
    for (int i = 0; i < kFields; ++i) {
        if (txtChan[i] && !txtChan[i]->isEnabled()) txtChan[i]->clear();
        if (cmbChannel[i] && !cmbChannel[i]->isEnabled()) ClearCombo(*cmbChannel[i]);
        if (chkChan[i] && !chkChan[i]->isEnabled()) chkChan[i]->setChecked(false);
    }
}

void PChannels::SwitchFrame(int tab) {
    m_lTab = tab;
    int frame = tab;
    CIviFgenPropImp& props = Props();
    if (!(props.Extensions() & kOutputModeExtensions)) {
        const FlagHold updating(m_bUpdating);
        lstChans->clear();
        auto& channels = *props.Channels();
        for (std::int32_t i = channels.Count(); i >= 1; --i)
            channels.Remove(i);
        ClearFields();
        cmdAdd->setEnabled(false);
        frame = 0;
    } else if (tab == 1) {
        switch (props.OutputMode()) {
        case qzivifgenOutputArb:
            frame = 4;
            break;
        case qzivifgenOutputSeq:
            frame = 5;
            break;
        default:
            frame = 1;
            break;
        }
    }
    fraChan[frame]->setEnabled(true);
    m_oFrames->setCurrentWidget(fraChan[frame]);
}

void PChannels::Validate(std::int32_t index, std::string& text, bool& cancel) {
    auto& channels = *Props().Channels();
    if (cancel || RenameRefused(text, channels.IndexOfName(text))) {
        cancel = true;
    } else {
        channels.Item(index + 1)->Name(text);
        Link().AlertChanges();
    }
    Changed(true);
}

void PChannels::CheckBoxClicked() {
    if (m_bUpdating) return;
    Changed(true);
    Update(true);
    const auto channel = Selected();
    if (!channel) return;
    // A source list that comes back shows the channel's source; a choice made stays.
    if (chkChan[10]->isChecked() && cmbChannel[11]->currentIndex() < 0)
        SelectComboEntry(*cmbChannel[11], channel->AMSource(), true, false);
    if (chkChan[12]->isChecked() && cmbChannel[13]->currentIndex() < 0)
        SelectComboEntry(*cmbChannel[13], channel->FMSource(), true, false);
}

void PChannels::OutputChecked(int row) {
    if (m_bUpdating) return;
    auto& channels = *Props().Channels();
    if (channels.Count() == 0 || row < 0 || row >= channels.Count()) return;
    channels.Item(row + 1)->OutputEnabled(lstChans->item(row)->checkState() == Qt::Checked);
    Changed(true);
}

QWidget* PChannels::FirstControl() {
    return lstChans->count() > 0 ? static_cast<QWidget*>(lstChans) : cmdAdd;
}

} // namespace qzivi
