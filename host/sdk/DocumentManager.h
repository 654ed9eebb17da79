#pragma once
// Open documents in order, the active one, and the reactors told of their lives.
namespace zvsdk {

class Document;

class DocumentManagerReactor {
public:
    virtual ~DocumentManagerReactor() = default;
    virtual void documentCreated(Document*) {}
    virtual void documentToBeDestroyed(Document*) {}
    virtual void documentActivated(Document*) {}
};

class DocumentManager {
public:
    virtual ~DocumentManager() = default;
    virtual int documentCount() const = 0;
    virtual Document* document(int index) const = 0;
    virtual Document* activeDocument() const = 0;
    virtual void addReactor(DocumentManagerReactor* reactor) = 0;
    virtual void removeReactor(DocumentManagerReactor* reactor) = 0;
};

}  // namespace zvsdk
