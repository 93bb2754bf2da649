// PGeneral, "General": the output mode, the reference clock and the arbitrary sample rate of the
// instrument as a whole. Its load saves at once, so a mode whose extension was taken away on the
// extensions page gives way to the first mode that remains.
#pragma once

#include "qzivi/pages/PropertyPage.h"

class QComboBox;
class QLineEdit;

namespace qzivi {

class PGeneral : public PropertyPage {
    Q_OBJECT

public:
    explicit PGeneral(QWidget* parent = nullptr);

    QComboBox* cmbGeneral[2];
    QLineEdit* txtGeneral;

protected:
    void Load() override;
    void Save() override;
    QWidget* FirstControl() override;
};

} // namespace qzivi
