// PArb, "Waveforms": the control's arbitrary waveforms, each with its data file, the file's format,
// whether its points are held in the configuration, and its normalisation; with a preview of the
// points the fields name. A file that cannot be read is refused on the page, and the waveform
// keeps what it had.
#pragma once

#include "qzivi/model/Waveforms.h"
#include "qzivi/pages/CCollectionUIMgr.h"
#include "qzivi/pages/NamedListPage.h"

class QCheckBox;
class QComboBox;
class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;
class QToolButton;

namespace qzivi {

class QZGraph;

class PArb : public NamedListPage<QZIviFgenArbWaveforms> {
    Q_OBJECT

public:
    explicit PArb(QWidget* parent = nullptr);

    QLabel *lblWaveform, *lblWfmSrc, *lblFileName, *lblAutoNormalize, *lblPreview;
    QListWidget* lstWaveforms;
    QPushButton *cmdAdd, *cmdDel;
    QLineEdit *txtRename, *txtFileName;
    QComboBox *cmbWfmSource, *cmbAutoNormalize;
    QToolButton* cmdFile;
    QCheckBox* chkPersist;
    QZGraph* qzgrphPreview;

    // The points of the fields, read as Configure would read them: the held points of a persisted
    // waveform whose file is unchanged, else the file's. Raises the system's error for a file that
    // gives none, or more than the instrument of an open session takes.
    Points FieldPoints();

protected:
    void Load() override;
    void Save() override;
    void Apply() override;
    QWidget* FirstControl() override;

private:
    QZIviFgenArbWaveforms& Entries() override;
    void SaveEntry(int index) override;
    void ShowEntry() override;
    void EnableEntries(bool on) override;
    Points PointsOfFields(QZIviFgenArbWaveform* model);
    void ClearFields();
    void Browse();
    void Preview();

    CCollectionUIMgr m_oLUI;
};

} // namespace qzivi
