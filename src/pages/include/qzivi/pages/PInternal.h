// PInternal, "Internal": the instrument's internal trigger rate and its internal AM and FM
// sources. A field is open only under its extension; a closed field is blank and keeps its value.
#pragma once

#include "qzivi/pages/PropertyPage.h"

class QComboBox;
class QGroupBox;
class QLabel;
class QLineEdit;

namespace qzivi {

class PInternal : public PropertyPage {
    Q_OBJECT

public:
    explicit PInternal(QWidget* parent = nullptr);

    // One index a row across the three arrays; txtInternal 2 and 5 and cmbWaveform 0, 1, 3, 4 and
    // 6 do not exist.
    QLabel* lblInternal[7] = {};
    QLineEdit* txtInternal[7] = {};
    QComboBox* cmbWaveform[7] = {};
    QGroupBox* fraInternal[2] = {};

protected:
    void Load() override;
    void Save() override;
    QWidget* FirstControl() override;

private:
    void FieldChanged();
};

} // namespace qzivi
