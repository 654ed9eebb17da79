#pragma once
// The drivers of the list commands: each picks a template, composes its reader and writer
// and runs the pipeline.
#include <QString>

enum class TipoLista { Bornes, BornesDesenho, Fios, Materiais, Cabos, DiagramaTopografico };

class CCDriverLista {
public:
    // The template path of a list: the default when its flag is set, else the user's pick;
    // empty when there is none.
    static QString EscolherModelo(TipoLista tipo);
    static void Executar(TipoLista tipo);
    // The export driver, by its type word.
    static void Exporta(const QString& tipo);
    // Whether this edition has the list or export yet; a command without it prints
    // AvisaIndisponivel's message and does nothing else.
    static bool Disponivel(TipoLista tipo);
    static bool ExportacaoDisponivel(const QString& tipo);
    static void AvisaIndisponivel();

private:
    static void ExecutarMateriais(const QString& caminho);
    static void ExecutarDiagrama();
};
