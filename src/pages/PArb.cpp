#include "qzivi/pages/PArb.h"

#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorIds.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/QZIviFgenEnum.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/CCommonDialog.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/widgets/QZGraph.h"

#include <QCheckBox>
#include <QComboBox>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QToolButton>
#include <QVBoxLayout>

#include <algorithm>
#include <filesystem>

namespace qzivi {

namespace {

// The file's own failure before the readers see it: they take a missing file or a directory for a
// file without points.
void CheckFile(const std::string& path) {
    std::error_code error;
    const auto status = std::filesystem::status(path, error);
    if (!std::filesystem::exists(status))
        throw Failure(errid::kFileNotFound, path, "Could not find file. (" + path + ")");
    if (!std::filesystem::is_regular_file(status))
        throw Failure(errid::kFileAccess, path,
                      "Errors occurred while accessing the file or the file does not exist. (" +
                          path + " is no regular file)");
}

} // namespace

PArb::PArb(QWidget* parent) : NamedListPage(tr("Waveforms"), parent) {
    lstWaveforms = Made(new QListWidget(this), "lstWaveforms", tr("Selects a waveform."));
    lblWaveform = Made(new QLabel(tr("Waveforms:"), this), "lblWaveform");
    lblWaveform->setBuddy(lstWaveforms);
    cmdAdd = Made(new QPushButton(tr("Add"), this), "cmdAdd", tr("Adds a waveform."));
    cmdDel = Made(new QPushButton(tr("Remove"), this), "cmdDel", tr("Removes a waveform."));
    txtRename = Made(new QLineEdit(this), "txtRename", tr("Rename the waveform."));
    cmbWfmSource = Made(new QComboBox(this), "cmbWfmSource",
                        tr("Selects the format of the waveform's data file."));
    lblWfmSrc = Made(new QLabel(tr("File format:"), this), "lblWfmSrc", cmbWfmSource->toolTip());
    txtFileName = Made(new QLineEdit(this), "txtFileName",
                       tr("The data file that holds the waveform's points."));
    lblFileName = Made(new QLabel(tr("File name:"), this), "lblFileName", txtFileName->toolTip());
    cmdFile = Made(new QToolButton(this), "cmdFile", tr("Browses for the data file."));
    cmdFile->setIcon(LoadPictureFromResource(118));
    cmdFile->setAccessibleName(tr("Browse"));
    chkPersist = Made(new QCheckBox(tr("Keep the points in the configuration"), this), "chkPersist",
                      tr("Reads the file once and keeps its points with the control's settings."));
    cmbAutoNormalize = Made(new QComboBox(this), "cmbAutoNormalize",
                            tr("Selects how the waveform's points are normalised."));
    lblAutoNormalize = Made(new QLabel(tr("Normalization:"), this), "lblAutoNormalize",
                            cmbAutoNormalize->toolTip());
    qzgrphPreview = Made(new QZGraph(this), "qzgrphPreview", tr("The points of the waveform."));
    qzgrphPreview->setMinimumHeight(110);
    lblPreview = Made(new QLabel(this), "lblPreview");
    lblPreview->setWordWrap(true);
    for (auto [label, field] : {std::pair<QLabel*, QWidget*>{lblWfmSrc, cmbWfmSource},
                                {lblFileName, txtFileName},
                                {lblAutoNormalize, cmbAutoNormalize}}) {
        label->setBuddy(field);
        field->setAccessibleName(label->text().chopped(1));
    }

    auto* left = new QVBoxLayout;
    left->addWidget(lblWaveform);
    left->addWidget(lstWaveforms, 1);
    auto* buttons = new QHBoxLayout;
    buttons->addWidget(cmdAdd);
    buttons->addWidget(cmdDel);
    left->addLayout(buttons);
    auto* file = new QHBoxLayout;
    file->addWidget(txtFileName, 1);
    file->addWidget(cmdFile);
    auto* form = new QFormLayout;
    form->setFieldGrowthPolicy(QFormLayout::AllNonFixedFieldsGrow);
    form->addRow(lblFileName, file);
    form->addRow(lblWfmSrc, cmbWfmSource);
    form->addRow(chkPersist);
    form->addRow(lblAutoNormalize, cmbAutoNormalize);
    auto* right = new QVBoxLayout;
    right->addLayout(form);
    right->addWidget(qzgrphPreview, 1);
    right->addWidget(lblPreview);
    auto* layout = new QHBoxLayout(this);
    layout->addLayout(left, 2);
    layout->addLayout(right, 5);

    m_oLUI.Attach(lstWaveforms, cmdAdd, cmdDel, txtRename);
    m_oLUI.BaseName("Waveform");
    WireList(m_oLUI, lstWaveforms);

    for (QComboBox* list : {cmbWfmSource, cmbAutoNormalize})
        connect(list, &QComboBox::currentIndexChanged, this, [this] {
            UserChanged();
            if (!Loading()) Preview();
        });
    connect(txtFileName, &QLineEdit::textChanged, this, [this] { UserChanged(); });
    connect(txtFileName, &QLineEdit::editingFinished, this, [this] { Preview(); });
    connect(chkPersist, &QCheckBox::toggled, this, [this] {
        UserChanged();
        if (!Loading()) Preview();
    });
    connect(txtRename, &QLineEdit::textChanged, this, [this] { UserChanged(); });
    connect(cmdFile, &QToolButton::clicked, this, [this] { Handled([&] { Browse(); }); });
}

QZIviFgenArbWaveforms& PArb::Entries() {
    return *Props().Waveforms();
}

void PArb::Load() {
    CIviFgenPropImp& props = Props();
    const bool on = props.Extensions() & qzivifgenArbWfmExt;
    auto& waveforms = *props.Waveforms();
    if (!on)
        for (std::int32_t i = waveforms.Count(); i >= 1; --i)
            waveforms.Remove(i);
    ClearFields();
    const QZIviFgenEnum names;
    FillComboFromTable(*cmbWfmSource, names.WaveformSourceNames(props.Extensions()), true);
    if (on && cmbWfmSource->count() > 0) cmbWfmSource->setCurrentIndex(0);
    FillComboFromTable(*cmbAutoNormalize, names.AutoNormalizeNames(), true);
    lstWaveforms->clear();
    for (const auto& waveform : waveforms)
        m_oLUI.Add(waveform->Name());
    if (lstWaveforms->count() > 0) {
        m_lCurrent = RememberedEntry();
        lstWaveforms->setCurrentRow(m_lCurrent);
        ShowEntry();
    } else {
        m_lCurrent = 0;
        qzgrphPreview->ClearData();
        lblPreview->clear();
    }
    EnableEntries(on);
}

void PArb::ShowEntry() {
    const auto waveform = EntryAt(lstWaveforms->currentRow());
    if (!waveform) return;
    WhileLoading([&] {
        SelectComboEntry(*cmbWfmSource, Variant(waveform->PersistedWfmSource()).AsInt32(), true,
                         false);
        txtFileName->setText(QString::fromStdString(waveform->Filename()));
        SelectComboEntry(*cmbAutoNormalize, waveform->AutoNormalizeMode(), true, false);
        chkPersist->setChecked(waveform->Source() == qzivifgenpersisted);
    });
    Preview();
}

Points PArb::FieldPoints() {
    return PointsOfFields(EntryAt(m_lCurrent).get());
}

Points PArb::PointsOfFields(QZIviFgenArbWaveform* model) {
    const std::string file = txtFileName->text().toStdString();
    const std::int32_t format = ComboNumber(*cmbWfmSource);
    const std::int32_t normalize = ComboNumber(*cmbAutoNormalize);
    if (model && chkPersist->isChecked() && model->DataGotOnce() && file == model->Filename())
        return model->Data(); // normalised when they were read
    CheckFile(file);
    QZIviFgenArbWaveform probe;
    probe.Name(model ? model->Name() : file);
    probe.Source(format);
    probe.Filename(file);
    probe.AutoNormalizeMode(normalize);
    Points points = probe.GetDataSample(0, 1, -1);
    if (!points)
        throw Failure(errid::kInvalidWaveform, file,
                      "Invalid Waveform. (" + probe.NoPointsCause() + ")");
    // The instrument's limit is known only while the control has a session.
    const auto& selected = SelectedControls();
    const bool session = !selected.empty() && selected[0] && selected[0]->SessionHandle() != 0;
    const std::int32_t most = session ? Props().Waveforms()->GetMaxWaveformSize() : 0;
    if (most > 0 && points->size() > static_cast<std::size_t>(most))
        throw Failure(errid::kInvalidWaveform, file,
                      "Invalid Waveform. (" + file + " holds " + std::to_string(points->size()) +
                          " points; the instrument takes at most " + std::to_string(most) + ")");
    return points;
}

void PArb::Preview() {
    if (txtFileName->text().isEmpty() && !chkPersist->isChecked()) {
        qzgrphPreview->ClearData();
        lblPreview->setText(tr("No data file."));
        return;
    }
    try {
        const Points points = FieldPoints();
        const auto [low, high] = std::minmax_element(points->begin(), points->end());
        qzgrphPreview->ClearData();
        qzgrphPreview->XAxis().Minimum(0);
        qzgrphPreview->XAxis().Maximum(static_cast<double>(points->size() - 1));
        qzgrphPreview->YAxis().Minimum(std::min(-1.0, *low));
        qzgrphPreview->YAxis().Maximum(std::max(1.0, *high));
        qzgrphPreview->PlotY(points);
        lblPreview->setText(tr("%1 points").arg(points->size()));
    } catch (const std::exception& e) {
        qzgrphPreview->ClearData();
        lblPreview->setText(QString::fromStdString(e.what()));
    }
}

// A file chosen is read before it is taken: one that gives no points leaves the field as it was.
void PArb::Browse() {
    CCommonDialog dialog;
    dialog.DialogTitle = tr("Load Arb Waveform ...");
    switch (ComboNumber(*cmbWfmSource)) {
    case qzivifgenASCIIFile:
        dialog.Filter = "Ascii File (*.txt)|*.txt";
        break;
    case qzivifgen2ByteInteger:
        dialog.Filter = "2-Byte Integer Binary File (*.*)|*.*";
        break;
    case qzivifgen4ByteInteger:
        dialog.Filter = "4-Byte Integer Binary File (*.*)|*.*";
        break;
    default:
        break;
    }
    dialog.Flags = CCommonDialog::cdlOFNFileMustExist | CCommonDialog::cdlOFNReadOnly;
    if (!dialog.ShowOpen(this)) return;
    const QString before = txtFileName->text();
    txtFileName->setText(dialog.FileName);
    try {
        FieldPoints();
    } catch (...) {
        txtFileName->setText(before);
        Preview();
        throw;
    }
    Preview();
}

// Into the waveform of entry `index`. A file name that changed must give points, else nothing of
// the waveform changes.
void PArb::SaveEntry(int index) {
    const auto waveform = EntryAt(index);
    if (!waveform) return;
    const std::string file = txtFileName->text().toStdString();
    const std::int32_t format = ComboValue(*cmbWfmSource).AsInt32();
    if (!file.empty() && (file != waveform->Filename() ||
                          format != Variant(waveform->PersistedWfmSource()).AsInt32())) {
        PointsOfFields(waveform.get());
    }
    waveform->PersistedWfmSource(std::to_string(format));
    waveform->AutoNormalizeMode(ComboValue(*cmbAutoNormalize).AsInt32());
    // Without a file a waveform falls back to the file source, unless it holds points that
    // never came from a file: those would be lost.
    const bool heldFromCode = waveform->DataGotOnce() && waveform->Filename().empty();
    if (file.empty() && !heldFromCode) WhileLoading([&] { chkPersist->setChecked(false); });
    waveform->Source(chkPersist->isChecked() ? qzivifgenpersisted : format);
    waveform->Filename(file);
}

void PArb::Save() {
    if (lstWaveforms->count() > 0) SaveEntry(m_lCurrent);
}

void PArb::Apply() {
    m_oLUI.CommitRename();
    Handled([&] { Save(); });
    // A rename that the validation ended goes along: OK must not lose it.
    Link().ApplyChanges(true);
}

void PArb::ClearFields() {
    WhileLoading([&] {
        txtFileName->clear();
        ClearCombo(*cmbWfmSource);
        ClearCombo(*cmbAutoNormalize);
        chkPersist->setChecked(false);
    });
}

void PArb::EnableEntries(bool on) {
    if (!on) ClearFields();
    m_oLUI.Enabled(on);
    lstWaveforms->setEnabled(on);
    const bool fields = on && lstWaveforms->count() > 0;
    for (QWidget* field :
         {static_cast<QWidget*>(cmbWfmSource), static_cast<QWidget*>(lblWfmSrc),
          static_cast<QWidget*>(txtFileName), static_cast<QWidget*>(lblFileName),
          static_cast<QWidget*>(cmdFile), static_cast<QWidget*>(chkPersist),
          static_cast<QWidget*>(cmbAutoNormalize), static_cast<QWidget*>(lblAutoNormalize),
          static_cast<QWidget*>(qzgrphPreview)})
        field->setEnabled(fields);
    if (!fields) {
        qzgrphPreview->ClearData();
        lblPreview->clear();
    }
}

QWidget* PArb::FirstControl() {
    return lstWaveforms->count() > 0 ? static_cast<QWidget*>(lstWaveforms) : cmdAdd;
}

} // namespace qzivi
