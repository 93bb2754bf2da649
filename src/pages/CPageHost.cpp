#include "qzivi/pages/CPageHost.h"

#include "qzivi/pages/PArb.h"
#include "qzivi/pages/PChannels.h"
#include "qzivi/pages/PExtensions.h"
#include "qzivi/pages/PGeneral.h"
#include "qzivi/pages/PInternal.h"
#include "qzivi/pages/PIviConfigurations.h"
#include "qzivi/pages/PIviX.h"
#include "qzivi/pages/PSequence.h"

#include "qzivi/pages/PropertyPage.h"
#include "qzivi/panels/MessageBoxes.h"

#include <QDialogButtonBox>
#include <QPushButton>
#include <QTabWidget>
#include <QVBoxLayout>

namespace qzivi {

CPageHost::CPageHost(std::vector<QZIviFgen*> selected, QWidget* parent)
    : QDialog(parent), m_vSelected(std::move(selected)) {
    setWindowTitle(tr("Property Pages"));
    InstallQtMessageBoxes();
    m_oTabs = new QTabWidget(this);
    m_oTabs->setUsesScrollButtons(false); // every page caption in view
    m_oButtons = new QDialogButtonBox(
        QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Apply, this);
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(m_oTabs);
    layout->addWidget(m_oButtons);
    connect(m_oButtons, &QDialogButtonBox::accepted, this, [this] {
        Apply();
        accept();
    });
    connect(m_oButtons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    connect(&ApplyButton(), &QPushButton::clicked, this, [this] { Apply(); });
    connect(m_oTabs, &QTabWidget::currentChanged, this, [this] { PaintFront(); });
    ShowApply();
}

CPageHost::~CPageHost() {
    EndPages();
}

QPushButton& CPageHost::ApplyButton() const {
    return *m_oButtons->button(QDialogButtonBox::Apply);
}

PropertyPage* CPageHost::Page(int index) const {
    return index >= 0 && index < static_cast<int>(m_vPages.size())
               ? m_vPages[static_cast<std::size_t>(index)]
               : nullptr;
}

void CPageHost::AddPage(PropertyPage* page) {
    m_vPages.push_back(page);
    const QSignalBlocker quiet(m_oTabs); // a first tab is painted when the host shows
    m_oTabs->addTab(page, page->Caption());
    connect(page, &PropertyPage::ChangedChanged, this, [this] { ShowApply(); });
    page->NoticeCreated();
    page->NoticeSelectionChanged(m_vSelected);
}

void CPageHost::AddStandardPages() {
    for (PropertyPage* page : std::initializer_list<PropertyPage*>{
             new PIviX, new PGeneral, new PExtensions, new PChannels, new PArb, new PSequence,
             new PInternal, new PIviConfigurations})
        AddPage(page);
}

void CPageHost::Apply() {
    for (PropertyPage* page : m_vPages)
        if (page->Changed()) {
            page->NoticeApply();
            page->Changed(false);
        }
    PaintFront();
}

void CPageHost::done(int result) {
    EndPages();
    QDialog::done(result);
}

void CPageHost::showEvent(QShowEvent* event) {
    QDialog::showEvent(event);
    PaintFront();
}

void CPageHost::PaintFront() {
    if (auto* page = Page(m_oTabs->currentIndex()); page && !m_bEnded) page->NoticePaint();
}

void CPageHost::EndPages() {
    if (m_bEnded) return;
    m_bEnded = true;
    for (PropertyPage* page : m_vPages)
        page->NoticeEnded();
}

void CPageHost::ShowApply() {
    bool changed = false;
    for (PropertyPage* page : m_vPages)
        changed = changed || page->Changed();
    ApplyButton().setEnabled(changed);
}

} // namespace qzivi
