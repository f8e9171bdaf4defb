//===- Globals.cpp - The global options of ostracli, as users see them -----===//
#include "Globals.h"

namespace Ostra {

namespace {

const GlobalOption kGlobalOptions[] = {
    {"--formatter", nullptr, "NAME",
     "Output formatter: simple, table, json, xml, csv or\n"
     "keyvalue (the command's default when not given)."},
    {"--format-param", nullptr, "KEY=VALUE",
     "Formatter parameter, repeatable: fields=Name,MTU,\n"
     "fields:S, table-columns, header:S, units:S.F,\n"
     "show-header=false, wrap-last=true."},
    {"--host", nullptr, "PATH",
     "The host state database to work on (else\n"
     "$OSTRACLI_HOST, else the default host)."},
    {"--lock-timeout", nullptr, "MS",
     "How long a change waits for another process's\n"
     "lock (else $OSTRACLI_LOCK_TIMEOUT_MS, else 10000)."},
    {"--atomic", nullptr, nullptr,
     "A command (or batch) that ends with an error\n"
     "changes nothing."},
    {"--batch", nullptr, "FILE",
     "Run one command line per line of FILE (- for\n"
     "standard input) in one process."},
    {"--keep-going", nullptr, nullptr, "With --batch: run every line even after one fails."},
    {"--help", "-h", nullptr, "Help of the namespace or command named before it."},
    {"--version", nullptr, nullptr, "Versions of ostracli and its plug-ins."},
    {"--reference", nullptr, nullptr, "The command reference, in Markdown."},
    {"--man", nullptr, nullptr, "The manual page ostracli(1), in roff."},
    {"--complete", nullptr, "WORD...",
     "Completion candidates for the last of the words\n"
     "after it (what the bash completion asks)."},
};

} // namespace

std::span<const GlobalOption> GlobalOptionTable() {
  return kGlobalOptions;
}

const GlobalOption* FindGlobalOption(const std::string& name) {
  for (const GlobalOption& option : kGlobalOptions)
    if (name == option.name || (option.alias && name == option.alias))
      return &option;
  return nullptr;
}

} // namespace Ostra
