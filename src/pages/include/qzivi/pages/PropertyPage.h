// A design-time property page of the control. The page host gives it five notices in the order of
// the page cycle: created, selection changed, painted (whenever it comes to the front), apply and
// ended. Between them the page reads and writes the control's shared working copy through its
// link; a change by the user only marks the page changed until the apply.
#pragma once

#include "qzivi/control/PageLink.h"
#include "qzivi/support/scoped_hook.h"

#include <QWidget>

#include <memory>
#include <vector>

namespace qzivi {

class QZIviFgen;

class PropertyPage : public QWidget {
    Q_OBJECT

public:
    explicit PropertyPage(const QString& caption, QWidget* parent = nullptr);
    ~PropertyPage() override;

    QString Caption() const { return m_sCaption; }
    // Set true, it lets the host offer its apply button.
    bool Changed() const { return m_bChanged; }
    void Changed(bool changed);

    // ---- The host's notices; none lets a failure out ----
    void NoticeCreated();
    void NoticeSelectionChanged(const std::vector<QZIviFgen*>& selected);
    void NoticePaint();
    void NoticeApply();
    void NoticeEnded();

signals:
    void ChangedChanged(bool changed);

protected:
    // One-time set-up, after the link is made.
    virtual void Created() {}
    // Fills the controls from Props(); the loading flag is set around it.
    virtual void Load() = 0;
    // Writes the controls to Props(), in the page's order; a failure stops it there.
    virtual void Save() = 0;
    // Save, then ApplyChanges with the page's alert. The default alerts.
    virtual void Apply();
    // Where the focus goes when the page comes to the front.
    virtual QWidget* FirstControl() = 0;
    // The page comes to the front, before it looks for changes of the other pages.
    virtual void Painting() {}

    // An event handler of the page: a failure shows as the critical box, and the page stays open.
    template <typename F>
    void Handled(F&& action) {
        try {
            action();
        } catch (...) {
            ReportFailure();
        }
    }

    // A control changed by the user: the page is changed, unless it is loading.
    void UserChanged();
    bool Loading() const { return m_bLoading; }
    // Runs `fill` with the loading flag set, so that the controls it fills count as no change.
    template <typename F>
    void WhileLoading(F&& fill) {
        const FlagHold loading(m_bLoading);
        fill();
    }
    void LoadControls();
    // Save with its failure ignored, as an apply does.
    void SaveQuietly();
    CIviFgenPropImp& Props();
    CPPObjWrapper& Link();
    const std::vector<QZIviFgen*>& SelectedControls() const { return m_vSelected; }

private:
    static void ReportFailure();

    QString m_sCaption;
    std::unique_ptr<CPPObjWrapper> m_oLink;
    std::vector<QZIviFgen*> m_vSelected;
    bool m_bLoading = false;
    bool m_bChanged = false;
};

} // namespace qzivi
