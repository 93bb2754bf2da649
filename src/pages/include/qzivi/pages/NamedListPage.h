// What the waveforms and the sequences pages share: a list of the names of one collection of the
// working copy, kept by a list manager, and the entry shown beside it. Adding, removing, selecting
// and renaming follow the same rules on both; a page says how it shows, saves and opens its fields.
#pragma once

#include "qzivi/pages/CCollectionUIMgr.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/pages/PropertyPage.h"

#include <QListWidget>

#include <algorithm>
#include <memory>
#include <vector>

namespace qzivi {

template <typename Collection>
class NamedListPage : public PropertyPage {
protected:
    using PropertyPage::PropertyPage;

    // The collection of the working copy that the list names.
    virtual Collection& Entries() = 0;
    // The fields of the entry at list index `index` into its member.
    virtual void SaveEntry(int index) = 0;
    // The fields from the member of the selected entry.
    virtual void ShowEntry() = 0;
    // The list and the fields open or closed.
    virtual void EnableEntries(bool on) = 0;
    // Before an entry is added, once the fields are saved.
    virtual void BeforeAddEntry() {}

    // The member named by the list's entry `index`, or null.
    auto EntryAt(int index) -> decltype(std::declval<Collection&>().Item(Variant())) {
        const QListWidgetItem* entry = m_oList->item(index);
        if (!entry) return nullptr;
        auto& entries = Entries();
        const std::int32_t position = entries.IndexOfName(entry->text().toStdString());
        return position == -1 ? nullptr : entries.Item(position);
    }

    // Connects the list manager's events; call once, after Attach.
    void WireList(CCollectionUIMgr& lui, QListWidget* list) {
        m_oList = list;
        m_vEvents.push_back(lui.BeforeAdd.Connect([this](std::string&) {
            if (Loading()) return;
            Handled([&] {
                if (m_oList->count() > 0) SaveEntry(m_lCurrent);
                BeforeAddEntry();
            });
        }));
        m_vEvents.push_back(lui.ItemAdded.Connect([this](std::int32_t index) {
            if (Loading()) return;
            Handled([&] {
                Changed(true);
                Entries().Add(m_oList->item(index)->text().toStdString());
                Link().AlertChanges(); // the channels page offers it at once
                m_lCurrent = m_lRemembered = index;
                EnableEntries(true);
                ShowEntry();
            });
        }));
        m_vEvents.push_back(lui.BeforeRemove.Connect([this](std::int32_t) { m_bRemoving = true; }));
        m_vEvents.push_back(lui.ItemRemoved.Connect([this](std::int32_t index) {
            if (!Loading())
                Handled([&] {
                    Changed(true);
                    Entries().Remove(index + 1);
                    m_lCurrent = m_lRemembered = std::max(0, m_oList->currentRow());
                    EnableEntries(true);
                    if (m_oList->count() > 0) ShowEntry();
                    Link().AlertChanges();
                });
            m_bRemoving = false;
        }));
        m_vEvents.push_back(lui.ListItemSelected.Connect([this](std::int32_t& index) {
            const int left = m_lCurrent;
            m_lCurrent = index;
            if (Loading()) return;
            Handled([&] {
                if (index >= 0 && index < Entries().Count()) {
                    // The fields go into the entry left behind, not into the one selected.
                    if (!m_bRemoving && left != index) SaveEntry(left);
                    ShowEntry();
                }
                m_lRemembered = index;
            });
        }));
        m_vEvents.push_back(
            lui.Validate.Connect([this](std::int32_t& index, std::string& text, bool& cancel) {
                Handled([&] {
                    auto& entries = Entries();
                    if (cancel || RenameRefused(text, entries.IndexOfName(text))) {
                        cancel = true;
                    } else {
                        entries.Item(index + 1)->Name(text);
                        Link().AlertChanges();
                    }
                    Changed(true);
                });
            }));
    }

    // The entry to show again after a reload, within the list.
    int RememberedEntry() const { return std::clamp(m_lRemembered, 0, m_oList->count() - 1); }

    int m_lCurrent = 0;
    int m_lRemembered = 0;
    bool m_bRemoving = false;

private:
    QListWidget* m_oList = nullptr;
    std::vector<Connection> m_vEvents;
};

} // namespace qzivi
