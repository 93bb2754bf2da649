// PExtensions, "Extensions": the bit set Extensions through ten check boxes. The trigger options
// stand under the trigger box and the sequence box under the waveform box; an apply corrects
// OutputMode when its extension went, and makes the other pages reload.
#pragma once

#include "qzivi/pages/PropertyPage.h"

#include <cstdint>

class QCheckBox;

namespace qzivi {

class PExtensions : public PropertyPage {
    Q_OBJECT

public:
    explicit PExtensions(QWidget* parent = nullptr);

    QCheckBox* chkExtension[11] = {}; // 1 to 10

protected:
    void Load() override;
    void Save() override;
    QWidget* FirstControl() override;

private:
    void EnableTriggerOptions(bool on);
    void EnableArbSequence(bool on);
    void FixOutputMode();
    void Clicked();
};

// The output mode that the output-mode extensions left on (a mask of 1, 2 and 8) allow.
std::int32_t FixedOutputMode(std::int32_t mask, std::int32_t mode);

} // namespace qzivi
