#pragma once
// How the running command ended, told to the host: a handler returns 1 whatever happened,
// and a host that runs commands from a script decides by this whether to go on and save.
namespace ZVResultado {

// An error the user was told of ended the command.
void Falhou();
// The user cancelled a question the command needed.
void Cancelado();
// Memory ran out; nothing the command made is to be kept.
void SemMemoria();

}  // namespace ZVResultado
