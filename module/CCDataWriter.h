#pragma once
// A writer turns the items of a run into pages or files, as the template says.
class VetorItens;
class CETemplate;

class CCDataWriter {
public:
    virtual ~CCDataWriter() = default;
    // May throw a ZVString to stop the run; the pipeline shows it in a message box.
    virtual void EscreverItens(VetorItens& itens, CETemplate& modelo) = 0;
};
