// PChannels, "Channels": the control's channels in a list whose check boxes switch their outputs,
// and each channel's settings on three tabs. The first tab shows the function, the waveform or the
// sequence fields by OutputMode; a field hangs on its extension. Values are not judged here: the
// instrument judges them at Configure.
#pragma once

#include "qzivi/pages/CCollectionUIMgr.h"
#include "qzivi/pages/PropertyPage.h"

#include <memory>
#include <vector>

class QCheckBox;
class QComboBox;
class QFrame;
class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;
class QStackedLayout;
class QTabBar;

namespace qzivi {

class QZIviFgenChannel;

class PChannels : public PropertyPage {
    Q_OBJECT

public:
    static constexpr int kFields = 22;
    static constexpr int kFrames = 6;

    explicit PChannels(QWidget* parent = nullptr);

    QListWidget* lstChans;
    QPushButton *cmdAdd, *cmdDel;
    QLineEdit* txtRename;
    QTabBar* tabChan; // tabs 0 to 2 stand for 1 to 3
    // One index a field across the four arrays; only the kind that the field is exists. lblChan 22
    // is frame 0's note.
    QLineEdit* txtChan[kFields] = {};
    QComboBox* cmbChannel[kFields] = {};
    QCheckBox* chkChan[kFields] = {};
    QLabel* lblChan[kFields + 1] = {};
    QFrame* fraChan[kFrames] = {};

    // The frame in view.
    int FrameShown() const;

protected:
    void Load() override;
    void Save() override { Write(false); }
    void Apply() override;
    QWidget* FirstControl() override;
    void Painting() override;

private:
    void BuildFields();
    void ConnectList();
    void ClearFields();
    void Show();
    void FillNames(int field, bool sequences, QZIviFgenChannel& channel);
    void Write(bool spareValidation);
    void Update(bool on);
    void Enabling(bool on);
    void SwitchFrame(int tab);
    void Validate(std::int32_t index, std::string& text, bool& cancel);
    void CheckBoxClicked();
    void OutputChecked(int row);
    std::shared_ptr<QZIviFgenChannel> Selected();

    CCollectionUIMgr m_oLUI;
    std::vector<Connection> m_vEvents;
    QStackedLayout* m_oFrames = nullptr;
    bool m_bUpdating = false;
    bool m_bRemoving = false;
    bool m_bEnabling = false;
    std::int32_t m_lSelected = 0;
    int m_lTab = 1;
};

} // namespace qzivi
