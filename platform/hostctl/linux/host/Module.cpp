//===- linux/host/Module.cpp - The module the session loads ----------------===//
//
// Everything lives in linuxhost (linked whole); this file only gives the
// module a source of its own.
//
//===----------------------------------------------------------------------===//
