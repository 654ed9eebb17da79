#include "DeskTexts.h"

#include "product/ProductSettings.h"

#include <array>

namespace zvdesk {

namespace {

int current = 2;

struct Words {
    const char* pt;
    const char* en;
    const char* es;
};

// One row per Text, in its order.
const std::array<Words, std::size_t(Text::Count)> kWords = {{
    {"&Arquivo", "&File", "&Archivo"},
    {"&Abrir...", "&Open...", "&Abrir..."},
    {"&Salvar", "&Save", "&Guardar"},
    {"Salvar &como...", "Save &as...", "Guardar &como..."},
    {"Sai&r", "&Quit", "&Salir"},
    {"&Editar", "&Edit", "&Editar"},
    {"&Desfazer", "&Undo", "&Deshacer"},
    {"&Refazer", "&Redo", "&Rehacer"},
    {"E&xibir", "&View", "&Ver"},
    {"&Ajustar à janela", "&Fit", "&Ajustar a la ventana"},
    {"&Aproximar", "Zoom &in", "&Acercar"},
    {"A&fastar", "Zoom &out", "A&lejar"},
    {"&Comandos", "&Commands", "&Comandos"},
    {"Outros comandos", "Other commands", "Otros comandos"},
    {"Aj&uda", "&Help", "Ay&uda"},
    {"&Sobre", "&About", "&Acerca de"},
    {"Páginas", "Pages", "Páginas"},
    {"Console LISP", "LISP console", "Consola LISP"},
    {"Avaliar", "Evaluate", "Evaluar"},
    {"capa", "cover", "portada"},
    {"índice", "index", "índice"},
    {"Sim", "Yes", "Sí"},
    {"Não", "No", "No"},
    {"OK", "OK", "Aceptar"},
    {"Cancelar", "Cancel", "Cancelar"},
    {"Marcar todas", "Select all", "Marcar todas"},
    {"Desmarcar todas", "Select none", "Desmarcar todas"},
    {"Selecionar páginas", "Choose pages", "Seleccionar páginas"},
    {"Selecionar réguas", "Choose terminal strips", "Seleccionar regletas"},
    {"Entrada", "Input", "Entrada"},
    {"Progresso", "Progress", "Progreso"},
    {"Desenhos DXF (*.dxf *.DXF)", "DXF drawings (*.dxf *.DXF)", "Dibujos DXF (*.dxf *.DXF)"},
    {"Todos os arquivos (*)", "All files (*)", "Todos los archivos (*)"},
    {"sem nome", "untitled", "sin nombre"},
    {"Alterações não salvas", "Unsaved changes", "Cambios sin guardar"},
    {"O desenho %1 tem alterações não salvas. Salvar antes?",
     "The drawing %1 has unsaved changes. Save them first?",
     "El dibujo %1 tiene cambios sin guardar. ¿Guardarlos antes?"},
    {"&Descartar", "&Discard", "&Descartar"},
    {"Não foi possível abrir o desenho", "The drawing could not be opened",
     "No se pudo abrir el dibujo"},
    {"Não foi possível salvar o desenho; ele continua aberto, sem perdas",
     "The drawing could not be saved; it stays open, nothing is lost",
     "No se pudo guardar el dibujo; sigue abierto, sin pérdidas"},
    {"Salvo: %1", "Saved: %1", "Guardado: %1"},
    {"Um comando está em andamento. Fechar quando ele terminar? (Ele para onde puder.)",
     "A command is running. Close when it has ended? (It stops where it can.)",
     "Un comando está en curso. ¿Cerrar cuando termine? (Se detiene donde pueda.)"},
    {"%1 falhou", "%1 failed", "%1 falló"},
    {"%1 foi cancelado", "%1 was cancelled", "%1 fue cancelado"},
    {"%1 ficou sem memória", "%1 ran out of memory", "%1 se quedó sin memoria"},
    {"%1 concluído", "%1 done", "%1 terminado"},
    {"Módulo não carregado: %1", "No module loaded: %1", "Módulo no cargado: %1"},
    {"Pronto", "Ready", "Listo"},
    {"Lista de bornes", "Terminal list", "Lista de bornes"},
    {"Desenho de réguas", "Terminal-strip drawing", "Dibujo de regletas"},
    {"Lista de fios", "Wire list", "Lista de cables"},
    {"Lista de materiais", "Material list", "Lista de materiales"},
    {"Lista de cabos", "Cable list", "Lista de mangueras"},
    {"Exportação...", "Export...", "Exportación..."},
    {"Exportar fios...", "Export wires...", "Exportar cables..."},
    {"Exportar anilhas...", "Export ferrules...", "Exportar marcadores..."},
    {"Exportar bornes...", "Export terminals...", "Exportar bornes..."},
    {"Exportar materiais...", "Export materials...", "Exportar materiales..."},
    {"Exportar cabos...", "Export cables...", "Exportar mangueras..."},
    {"Diagrama topográfico", "Topographic diagram", "Diagrama topográfico"},
}};

}  // namespace

int DeskTexts::settingsLanguage() {
    bool ok = false;
    const int language =
        zvproduct::ProductSettings().value(QStringLiteral("IdiomaMenuSel")).trimmed().toInt(&ok);
    return ok ? language : 0;
}

void DeskTexts::setLanguage(int language) {
    current = language >= 1 && language <= 3 ? language : 2;
}

int DeskTexts::language() {
    return current;
}

QString DeskTexts::text(Text which) {
    const Words& words = kWords[std::size_t(which)];
    return QString::fromUtf8(current == 1 ? words.pt : current == 3 ? words.es : words.en);
}

}  // namespace zvdesk
