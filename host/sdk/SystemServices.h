#pragma once
// The host's services as a module reaches them. Null when no host is running.
#include <QString>

namespace zvsdk {

class Document;
class DocumentManager;
class UserInterface;

class SystemServices {
public:
    virtual ~SystemServices() = default;
    virtual DocumentManager* documentManager() = 0;
    virtual UserInterface* userInterface() = 0;
    // The folder of the host's executable; the message files live below it.
    virtual QString executableFolder() const = 0;
};

SystemServices* systemServices();
// The active document, or null.
Document* activeDocument();

}  // namespace zvsdk
