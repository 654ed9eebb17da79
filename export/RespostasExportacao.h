#pragma once
// The export dialog in a host that answers from a script: the settings the dialog would
// show come from the stored configuration and from the answers given, and the target file
// confirms it. Answers: "export:config" (a stored configuration), "export:type" (kind of
// list), "export:format", "export:pages" (";"-separated pages), "export:option:KEY" (one
// option) and "export:file" (the target; without it the dialog counts as cancelled).
#include <QString>

class CEExportacao;
class CEExportConfigs;

namespace zvsdk {
class UserInterface;
}

namespace RespostasExportacao {

enum class Resultado { Confirmado, Cancelado, Invalido };

// Loads the driver as the dialog does when it opens (configuration, kind, format, options,
// columns and filters of the section), applies the answers over it and takes the target
// file. `tipoPalavra` is the command's kind of list, empty for the general command;
// `idioma` picks the field names of the default columns. An answer that names no
// configuration, kind or format, or a format the kind can't have, gives Invalido with the
// reason in `erro`.
Resultado Preenche(CEExportacao& exp, CEExportConfigs& configs, const QString& tipoPalavra,
                   zvsdk::UserInterface& ui, int idioma, QString* erro);

// The section's format, options, columns and filters into the driver, as the dialog loads
// them: the section's rows override the columns by title and set every flag.
void CarregaSecao(CEExportacao& exp, CEExportConfigs& configs, const QString& config,
                  const QString& secao);

// The kind of list a dialog opens with: the command's word, else the one last exported with
// the configuration, else "BORNES".
QString PalavraInicial(const CEExportConfigs& configs, const QString& config,
                       const QString& tipoPalavra);

// The whole load of one kind of list, as the dialog shows it: the kind, its stored columns
// and filters (or the kind's default columns in the language `idioma`), then the section's
// format, options and column flags (CarregaSecao).
void CarregaTela(CEExportacao& exp, CEExportConfigs& configs, const QString& config,
                 const QString& palavra, int idioma);

}  // namespace RespostasExportacao
