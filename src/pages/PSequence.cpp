#include "qzivi/pages/PSequence.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/MUiAndStringUtil.h"

#include <QGridLayout>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTreeWidget>
#include <QVBoxLayout>

#include <cmath>

namespace qzivi {

namespace {} // namespace

PSequence::PSequence(QWidget* parent) : NamedListPage(tr("Sequences"), parent) {
    lstSequence = Made(new QListWidget(this), "lstSequence", tr("Selects a sequence."));
    lblSequence = Made(new QLabel(tr("Sequences:"), this), "lblSequence");
    lblSequence->setBuddy(lstSequence);
    cmdAdd = Made(new QPushButton(tr("Add"), this), "cmdAdd", tr("Adds a sequence."));
    cmdDel = Made(new QPushButton(tr("Remove"), this), "cmdDel", tr("Removes a sequence."));
    txtRename = Made(new QLineEdit(this), "txtRename", tr("Rename the sequence."));
    lstvWfmItems = Made(new QTreeWidget(this), "lstvWfmItems",
                        tr("The waveforms of the sequence in playing order, with their "
                           "iterations. Click a cell twice to change it."));
    lblSeq = Made(new QLabel(tr("Sequence items:"), this), "lblSeq");
    lblSeq->setBuddy(lstvWfmItems);
    cmdAddSeqItem =
        Made(new QPushButton(tr("Add"), this), "cmdAddSeqItem", tr("Adds a sequence item."));
    cmdDelSeqItem = Made(new QPushButton(tr("Remove"), this), "cmdDelSeqItem",
                         tr("Removes the selected sequence item."));
    cmdUp =
        Made(new QPushButton(tr("Up"), this), "cmdUp", tr("Moves the selected sequence item up."));
    cmdDown = Made(new QPushButton(tr("Down"), this), "cmdDown",
                   tr("Moves the selected sequence item down."));
    txtSIRename = Made(new QLineEdit(this), "txtSIRename", tr("Change the cell."));
    lstSequence->setAccessibleName(tr("Sequences"));
    lstvWfmItems->setAccessibleName(tr("Sequence items"));

    auto* left = new QVBoxLayout;
    left->addWidget(lblSequence);
    left->addWidget(lstSequence, 1);
    auto* buttons = new QHBoxLayout;
    buttons->addWidget(cmdAdd);
    buttons->addWidget(cmdDel);
    left->addLayout(buttons);
    auto* items = new QGridLayout;
    items->addWidget(lblSeq, 0, 0, 1, 2);
    items->addWidget(lstvWfmItems, 1, 0);
    auto* side = new QVBoxLayout;
    for (QPushButton* b : {cmdAddSeqItem, cmdDelSeqItem, cmdUp, cmdDown})
        side->addWidget(b);
    side->addStretch(1);
    items->addLayout(side, 1, 1);
    items->setRowStretch(1, 1);
    auto* layout = new QHBoxLayout(this);
    layout->addLayout(left, 2);
    layout->addLayout(items, 5);

    m_oLUI.Attach(lstSequence, lstvWfmItems, cmdAdd, cmdDel, cmdAddSeqItem, cmdDelSeqItem,
                  txtRename, txtSIRename, nullptr, nullptr, cmdUp, cmdDown);
    m_oLUI.BaseName("Sequence");
    // The blanks keep the first column wide enough for a waveform's name.
    m_oLUI.SetLVHeaderInfo({"Waveform                  ", "Iterations"});
    m_oLUI.BaseNamesLV({"Waveform1", "1"});
    m_oLUI.AutosizeColumns();
    ConnectEvents();
}

void PSequence::ConnectEvents() {
    auto& lui = m_oLUI;
    WireList(lui, lstSequence);
    m_vEvents.push_back(lui.LVListItemSelected.Connect([this](std::int32_t row) {
        if (Loading()) return;
        Handled([&] {
            if (const auto sequence = EntryAt(lstSequence->currentRow()))
                sequence->CurrentItem(row);
        });
    }));
    m_vEvents.push_back(lui.BeforeAddLVItem.Connect([this](std::vector<std::string>& cells) {
        Handled([&] {
            auto& waveforms = *Props().Waveforms();
            cells = {waveforms.Count() > 0 ? waveforms.Item(1)->Name() : std::string(), "1"};
        });
    }));
    m_vEvents.push_back(lui.LVItemAdded.Connect([this](std::int32_t) { UserChanged(); }));
    m_vEvents.push_back(lui.LVItemRemoved.Connect([this](std::int32_t) { UserChanged(); }));
    m_vEvents.push_back(lui.LVValidate.Connect(
        [this](std::int32_t, std::int32_t column, std::string& text, bool& cancel) {
            if (!Loading()) Handled([&] { ValidateCell(column, text, cancel); });
        }));
    for (QPushButton* move : {cmdUp, cmdDown})
        connect(move, &QPushButton::clicked, this, [this] { UserChanged(); });
    for (QLineEdit* box : {txtRename, txtSIRename})
        connect(box, &QLineEdit::textChanged, this, [this] { UserChanged(); });
}

QZIviFgenSequences& PSequence::Entries() {
    return *Props().Sequences();
}

void PSequence::Load() {
    CIviFgenPropImp& props = Props();
    auto& sequences = *props.Sequences();
    const bool on = (props.Extensions() & qzivifgenArbSeqExt) && props.Waveforms()->Count() > 0;
    if (!on) {
        for (std::int32_t i = sequences.Count(); i >= 1; --i)
            sequences.Remove(i);
        m_oLUI.Enabled(true);
        m_oLUI.ClearLV();
    }
    lstSequence->clear();
    // Whether the list is open is decided by the tree as it is now, not as it was at the last
    // load: sequences that came with a configuration since must show.
    if (on) {
        for (const auto& sequence : sequences)
            m_oLUI.Add(sequence->Name());
        if (lstSequence->count() > 0) {
            m_lCurrent = RememberedEntry();
            lstSequence->setCurrentRow(m_lCurrent);
            ShowEntry();
        } else {
            m_oLUI.ClearLV();
        }
    }
    EnableEntries(on);
}

void PSequence::ShowEntry() {
    WhileLoading([&] {
        m_oLUI.ClearLV();
        const auto sequence = EntryAt(lstSequence->currentRow());
        if (!sequence) return;
        for (const auto& item : *sequence) {
            if (!item->Waveform()) {
                Changed(true); // the next save drops the item
                continue;
            }
            m_oLUI.AddLVI({item->Waveform()->Name(), std::to_string(item->Iterations())});
        }
        if (sequence->Count() > 0) m_oLUI.LVIndex(sequence->CurrentItem());
    });
}

// The items of the sequence of entry `index`, made anew from the table's rows. A row whose name no
// waveform has any more is dropped.
void PSequence::SaveEntry(int index) {
    const auto sequence = EntryAt(index);
    if (!sequence) return;
    for (std::int32_t i = sequence->Count(); i >= 1; --i)
        sequence->Remove(i);
    auto& waveforms = *Props().Waveforms();
    for (int r = 0; r < lstvWfmItems->topLevelItemCount(); ++r) {
        const QTreeWidgetItem* row = lstvWfmItems->topLevelItem(r);
        const std::int32_t waveform = waveforms.IndexOfName(row->text(0).toStdString());
        if (waveform == -1) continue;
        sequence->Add(waveforms.Item(waveform),
                      static_cast<std::int32_t>(
                          std::llround(ParseLeadingNumber(row->text(1).toStdString()))));
    }
}

void PSequence::Save() {
    if (lstSequence->count() > 0) SaveEntry(m_lCurrent);
}

void PSequence::Apply() {
    m_oLUI.CommitRename();
    m_oLUI.CommitCellEdit();
    Handled([&] { Save(); });
    // A rename that the validation ended goes along: OK must not lose it.
    Link().ApplyChanges(true);
}

// A waveform cell takes only a waveform's exact name; an iteration cell a whole number from 1,
// rounded from what the text starts with.
void PSequence::BeforeAddEntry() {
    m_oLUI.ClearLV();
}

void PSequence::ValidateCell(std::int32_t column, std::string& text, bool& cancel) {
    if (column == 0) {
        if (Props().Waveforms()->IndexOfName(text) == -1) cancel = true;
    } else if (column == 1) {
        const double iterations = std::round(ParseLeadingNumber(text));
        if (iterations >= 1 && iterations <= 2147483647.0)
            text = std::to_string(static_cast<std::int64_t>(iterations));
        else
            cancel = true;
    }
    Changed(true);
}

void PSequence::EnableEntries(bool on) {
    const bool wasOpen = lstvWfmItems->isEnabled();
    const bool table = on && lstSequence->count() > 0;
    m_oLUI.Enabled(on);
    lstSequence->setEnabled(on && lstSequence->count() > 0);
    if ((table && !wasOpen) || !on) {
        const bool enabled = m_oLUI.Enabled();
        m_oLUI.Enabled(true); // the table empties only under an open list
        m_oLUI.ClearLV();
        m_oLUI.Enabled(enabled);
    }
    m_oLUI.LVEnabled(table);
    lblSeq->setEnabled(table);
    m_oLUI.AutosizeColumns();
}

QWidget* PSequence::FirstControl() {
    return lstSequence->count() > 0 ? static_cast<QWidget*>(lstSequence) : cmdAdd;
}

} // namespace qzivi
