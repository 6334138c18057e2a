// The television's own display above all applications: a line of text for some seconds.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_ONSCREENDISPLAY_H
#define TELIX_DESKTOP_WINDOW_NPAPI_ONSCREENDISPLAY_H

#include <QString>
#include <QTimer>
#include <QWidget>

namespace desktop {

// Has the size of the page, and takes no input.
class OnScreenDisplay : public QWidget {
    Q_OBJECT

public:
    explicit OnScreenDisplay(QWidget* parent);

    void show(const QString& text);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    QString m_text;
    QTimer m_timer;
};

} // namespace desktop

#endif
