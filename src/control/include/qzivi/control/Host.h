// What the control needs of the host that places it on a form. The Qt host widget implements it;
// a control with no host behaves as at run time with no panel.
#pragma once

#include <memory>
#include <string>

namespace qzivi {

class IQZIviFgenPanel;

class IQZIviFgenHost {
public:
    virtual ~IQZIviFgenHost() = default;

    // Ambient values; the host calls QZIviFgen::AmbientChanged when one changes.
    virtual bool UserMode() const = 0;
    virtual std::string DisplayName() const = 0;

    // The control's own size, in host units.
    virtual float Width() const = 0;
    virtual float Height() const = 0;
    virtual void SetSize(float width, float height) = 0;

    // The child collection: a panel made by its class name under a key, and its removal.
    virtual std::shared_ptr<IQZIviFgenPanel> AddChild(const std::string& className,
                                                      const std::string& key) = 0;
    virtual void RemoveChild(const std::string& key) = 0;

    // `Visible` of the control's entry in the parent form's control list.
    virtual bool FormEntryVisible() const = 0;
    virtual void SetFormEntryVisible(bool visible) = 0;

    // A property of the control changed; an empty name for "some".
    virtual void PropertyChanged(const std::string& name) = 0;

    // Moves the focus on, as one Tab keystroke does.
    virtual void SendTab() = 0;

    virtual void ShowAboutBox() = 0;
};

} // namespace qzivi
