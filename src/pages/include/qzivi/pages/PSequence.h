// PSequence, "Sequences": the control's sequences and, for the one selected, its items in a table:
// which waveform and how many times, in playing order. The table is the editing copy; the items of
// the sequence are made anew from it whenever the page saves.
#pragma once

#include "qzivi/model/Sequences.h"
#include "qzivi/pages/CIviFgenSeqPageImp.h"
#include "qzivi/pages/NamedListPage.h"

#include <memory>
#include <vector>

class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;
class QTreeWidget;

namespace qzivi {

class PSequence : public NamedListPage<QZIviFgenSequences> {
    Q_OBJECT

public:
    explicit PSequence(QWidget* parent = nullptr);

    QLabel *lblSequence, *lblSeq;
    QListWidget* lstSequence;
    QPushButton *cmdAdd, *cmdDel;
    QLineEdit *txtRename, *txtSIRename;
    QTreeWidget* lstvWfmItems;
    QPushButton *cmdAddSeqItem, *cmdDelSeqItem, *cmdUp, *cmdDown;

protected:
    void Load() override;
    void Save() override;
    void Apply() override;
    QWidget* FirstControl() override;

private:
    QZIviFgenSequences& Entries() override;
    void SaveEntry(int index) override;
    void ShowEntry() override;
    void EnableEntries(bool on) override;
    void BeforeAddEntry() override;
    void ConnectEvents();
    void ValidateCell(std::int32_t column, std::string& text, bool& cancel);

    CIviFgenSeqPageImp m_oLUI;
    std::vector<Connection> m_vEvents;
};

} // namespace qzivi
