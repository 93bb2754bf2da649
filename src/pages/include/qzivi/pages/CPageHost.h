// The page host: one dialog with a tab per page, and OK, Cancel and Apply. It gives each page its
// notices in the order of the page cycle, offers Apply while a page is changed, and is worked from
// the keyboard alone (Ctrl+Tab between pages, Enter for OK, Esc for Cancel).
#pragma once

#include <QDialog>

#include <vector>

class QDialogButtonBox;
class QPushButton;
class QTabWidget;

namespace qzivi {

class PropertyPage;
class QZIviFgen;

class CPageHost : public QDialog {
    Q_OBJECT

public:
    // The pages edit the first of `selected`.
    explicit CPageHost(std::vector<QZIviFgen*> selected, QWidget* parent = nullptr);
    ~CPageHost() override;

    // Takes the page: created, then selection changed.
    void AddPage(PropertyPage* page);
    // The control's pages, in the order a designer works through them.
    void AddStandardPages();
    // Each changed page applies, in tab order; then the page in front is painted.
    void Apply();

    QTabWidget& Tabs() const { return *m_oTabs; }
    QPushButton& ApplyButton() const;
    PropertyPage* Page(int index) const;

    void done(int result) override;

protected:
    void showEvent(QShowEvent* event) override;

private:
    void PaintFront();
    void EndPages();
    void ShowApply();

    std::vector<QZIviFgen*> m_vSelected;
    std::vector<PropertyPage*> m_vPages;
    QTabWidget* m_oTabs;
    QDialogButtonBox* m_oButtons;
    bool m_bEnded = false;
};

} // namespace qzivi
