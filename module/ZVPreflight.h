#pragma once
// The checks before a command and the bracket around its run.
namespace ZVPreflight {

// May the list commands run now? `diagrama` for the topographic diagram's own message.
bool PreflightListas(bool diagrama);
// May the export commands run now?
bool PreflightExportacao();
// 1 opens the bracket (all pages hidden), 0 closes it (the user's page shown again).
void Bracket(int abrir);
inline void AbrirBracket() {
    Bracket(1);
}
inline void FecharBracket() {
    Bracket(0);
}

}  // namespace ZVPreflight
