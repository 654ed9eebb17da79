#include "ResultBuffer.h"

namespace zvsdk {

ResultBuffer* newNode(short type) {
    auto* node = new ResultBuffer;
    node->restype = type;
    return node;
}

ResultBuffer* newString(const QString& text) {
    ResultBuffer* node = newNode(RTSTR);
    node->rstring = text;
    return node;
}

ResultBuffer* newShort(short value) {
    ResultBuffer* node = newNode(RTSHORT);
    node->rint = value;
    return node;
}

ResultBuffer* newLong(std::int32_t value) {
    ResultBuffer* node = newNode(RTLONG);
    node->rlong = value;
    return node;
}

ResultBuffer* newReal(double value) {
    ResultBuffer* node = newNode(RTREAL);
    node->rreal = value;
    return node;
}

ResultBuffer* newEntity(EntityName name) {
    ResultBuffer* node = newNode(RTENAME);
    node->rlname = name;
    return node;
}

ResultBuffer* newPoint(double x, double y, double z, bool threeD) {
    ResultBuffer* node = newNode(threeD ? RT3DPOINT : RTPOINT);
    node->rpoint[0] = x;
    node->rpoint[1] = y;
    node->rpoint[2] = z;
    return node;
}

void releaseChain(ResultBuffer* chain) {
    while (chain) {
        ResultBuffer* next = chain->rbnext;
        delete chain;
        chain = next;
    }
}

ResultBuffer* copyChain(const ResultBuffer* chain) {
    ResultBuffer* head = nullptr;
    ResultBuffer** tail = &head;
    for (; chain; chain = chain->rbnext) {
        *tail = new ResultBuffer(*chain);
        (*tail)->rbnext = nullptr;
        tail = &(*tail)->rbnext;
    }
    return head;
}

}  // namespace zvsdk
