#pragma once
// The host's own services on a new document: its LISP environment and the product's LISP
// functions. Run for every document before any module hears of it.
namespace zvhost {

class HostDocument;

void setUpDocument(HostDocument& document);

}  // namespace zvhost
