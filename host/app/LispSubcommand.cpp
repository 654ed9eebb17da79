#include "HostCli.h"

namespace zvhost {

int runLispSubcommand(CliContext& context) {
    context.err << "zvhost: LISP is not available in this build\n";
    return kExitFailure;
}

}  // namespace zvhost
