#include "CommandLineDevice.h"

namespace zvdesk {

CommandLineDevice::CommandLineDevice() {
    open(QIODevice::WriteOnly | QIODevice::Unbuffered);
}

void CommandLineDevice::setListener(std::function<void(const QString&)> listener) {
    listener_ = std::move(listener);
    if (listener_ && !pending_.isEmpty()) listener_(takePending());
}

QString CommandLineDevice::takePending() {
    QString text;
    text.swap(pending_);
    return text;
}

qint64 CommandLineDevice::readData(char*, qint64) {
    return -1;
}

qint64 CommandLineDevice::writeData(const char* data, qint64 maxSize) {
    partial_.append(data, int(maxSize));
    // Keep back the bytes of a UTF-8 sequence that is not complete yet.
    int end = partial_.size();
    int back = 0;
    while (back < 4 && back < end && (uchar(partial_[end - 1 - back]) & 0xC0) == 0x80)
        ++back;
    if (back < end) {
        const uchar lead = uchar(partial_[end - 1 - back]);
        const int length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : lead >= 0xC0 ? 2 : 1;
        if (length > back + 1) end -= back + 1;
    }
    const QString text = QString::fromUtf8(partial_.constData(), end);
    partial_.remove(0, end);
    if (text.isEmpty()) return maxSize;
    if (listener_)
        listener_(text);
    else
        pending_ += text;
    return maxSize;
}

}  // namespace zvdesk
