//===- main.cpp - ostrahost: create, import and export host states --------===//
int main() { return 2; }
