// PSequence, "Sequences": the control's sequences and, for the one selected, its items in a table:
// which waveform and how many times, in playing order. The table is the editing copy; the items of
// the sequence are made anew from it whenever the page saves.
#pragma once

#include "qzivi/pages/CIviFgenSeqPageImp.h"
#include "qzivi/pages/PropertyPage.h"

#include <memory>
#include <vector>

class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;
class QTreeWidget;

namespace qzivi {

class QZIviFgenSequence;

class PSequence : public PropertyPage {
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
    void ConnectEvents();
    std::shared_ptr<QZIviFgenSequence> SequenceAt(int index);
    void ShowSequence();
    void SaveSequence(int index);
    void EnableControls(bool on);
    void ValidateCell(std::int32_t column, std::string& text, bool& cancel);
    void Validate(std::int32_t index, std::string& text, bool& cancel);

    CIviFgenSeqPageImp m_oLUI;
    std::vector<Connection> m_vEvents;
    bool m_bRemoving = false;
    bool m_bAppliedByRename = false;
    int m_lCurrent = 0;
    int m_lRemembered = 0;
};

} // namespace qzivi
