#pragma once
// The host's command line as a device: what the application writes on it (the module's
// messages, LISP output) goes to a listener, the LISP console of the main window.
#include <QIODevice>

#include <functional>

namespace zvdesk {

class CommandLineDevice : public QIODevice {
public:
    CommandLineDevice();
    void setListener(std::function<void(const QString&)> listener);
    // What was written while nobody listened.
    QString takePending();

protected:
    qint64 readData(char* data, qint64 maxSize) override;
    qint64 writeData(const char* data, qint64 maxSize) override;

private:
    std::function<void(const QString&)> listener_;
    QByteArray partial_;  // a character cut in two by a write
    QString pending_;
};

}  // namespace zvdesk
