#include "qzivi/pages/PropertyPage.h"

#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/support/failure.h"

namespace qzivi {

namespace {

// The loading flag for the length of a load, cleared on every way out.
struct LoadingScope {
    explicit LoadingScope(bool& flag) : flag(flag) { flag = true; }
    ~LoadingScope() { flag = false; }
    bool& flag;
};

} // namespace

PropertyPage::PropertyPage(const QString& caption, QWidget* parent)
    : QWidget(parent), m_sCaption(caption) {
    setAccessibleName(caption);
}

PropertyPage::~PropertyPage() = default;

void PropertyPage::Changed(bool changed) {
    if (changed == m_bChanged) return;
    m_bChanged = changed;
    emit ChangedChanged(changed);
}

void PropertyPage::NoticeCreated() {
    m_oLink = std::make_unique<CPPObjWrapper>();
    // Filling lists once is no change of the user's either.
    const LoadingScope loading(m_bLoading);
    Quietly([&] { Created(); });
}

void PropertyPage::NoticeSelectionChanged(const std::vector<QZIviFgen*>& selected) {
    m_oLink.reset(); // the old link lets go first
    m_oLink = std::make_unique<CPPObjWrapper>();
    m_vSelected = selected;
    Quietly([&] {
        if (m_vSelected.empty() || !m_vSelected[0]) RaiseRuntime(91, "Object variable not set.");
        m_oLink->SelectionChanged(*m_vSelected[0]);
        LoadControls();
    });
}

void PropertyPage::NoticePaint() {
    Quietly([&] { Painting(); });
    Quietly([&] {
        if (Link().CheckForChanges()) {
            LoadControls();
            ForceRedrawControls(*this);
        }
    });
    Quietly([&] {
        if (QWidget* first = FirstControl()) first->setFocus();
    });
}

void PropertyPage::NoticeApply() {
    Quietly([&] { Apply(); });
}

void PropertyPage::NoticeEnded() {
    m_oLink.reset();
    m_vSelected.clear();
}

void PropertyPage::Apply() {
    SaveQuietly();
    Link().ApplyChanges(true);
}

void PropertyPage::ReportFailure() {
    HandleError("", 1, nullptr);
}

void PropertyPage::UserChanged() {
    if (!m_bLoading) Changed(true);
}

void PropertyPage::LoadControls() {
    const LoadingScope loading(m_bLoading);
    Load();
}

void PropertyPage::SaveQuietly() {
    Quietly([&] { Save(); });
}

CIviFgenPropImp& PropertyPage::Props() {
    const auto props = Link().Props();
    if (!props) RaiseRuntime(91, "Object variable not set.");
    return *props;
}

CPPObjWrapper& PropertyPage::Link() {
    if (!m_oLink) RaiseRuntime(91, "Object variable not set.");
    return *m_oLink;
}

} // namespace qzivi
