// QZButton: a toggle that shows one picture when on and another when off, on a lit or unlit key.
// A click of the operator (mouse, Space or Enter) turns it over and fires Click; a put of Value
// fires nothing.
#pragma once

#include <QIcon>
#include <QWidget>

namespace qzivi {

class QZButton : public QWidget {
    Q_OBJECT
    Q_PROPERTY(bool value READ Value WRITE Value)
    Q_PROPERTY(int index READ Index WRITE Index)

public:
    explicit QZButton(QWidget* parent = nullptr);

    bool Value() const { return m_bValue; }
    void Value(bool value);
    const QIcon& OnPicture() const { return m_oOnPicture; }
    void OnPicture(QIcon picture);
    const QIcon& OffPicture() const { return m_oOffPicture; }
    void OffPicture(QIcon picture);
    int Index() const { return m_lIndex; }
    void Index(int value) { m_lIndex = value; }

    QSize sizeHint() const override { return {51, 31}; }

signals:
    void Click(int index);

protected:
    void paintEvent(QPaintEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void enterEvent(QEnterEvent* event) override;
    void leaveEvent(QEvent* event) override;

private:
    void OperatorClick();

    bool m_bValue = false;
    bool m_bDown = false;
    bool m_bHover = false;
    int m_lIndex = -1;
    QIcon m_oOnPicture;
    QIcon m_oOffPicture;
};

} // namespace qzivi
