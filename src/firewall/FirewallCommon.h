//===- FirewallCommon.h - What the firewall ruleset lists share -----------===//
//
// The ruleset, rule and allowed-IP lists each show rows for the rulesets the
// optional "ruleset-id" parameter selects; ListRulesets holds that loop, and
// each list gives only the rows of one ruleset.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "HostCtl/Lib.h"
#include "HostCtl/System/FirewallRuleset.h"
#include "TvkCtl/System/SystemInfoImpl.h"
#include "common/FieldTable.h"

#include <memory>
#include <vector>

namespace CorvexCli::NetworkNamespace {

/// The rulesets a firewall list command works on: all of them, or the one
/// named by its optional "ruleset-id" parameter. Adds "Ruleset Not Found: " or
/// "Failed to check loaded status: " followed by the id and answers false when
/// the named ruleset cannot be selected; other host failures pass as
/// HostCtlException.
bool SelectFirewallRulesets(
    HostCtl::System::SystemInfo& system, const Fabrik::CallSpec::Input& input,
    Fabrik::CallSpec::Output& output,
    std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>>& selection);

/// Runs a ruleset list: a list of \p rowShape holding the rows
/// \p addRows(list, ruleset) adds for each selected ruleset, or the error of
/// the selection or of the host and no result.
template <typename AddRows>
void ListRulesets(const Fabrik::CallSpec::Input& input, Fabrik::CallSpec::Output& output,
                  const std::shared_ptr<Fabrik::MetaObj::MetaStruct>& rowShape, AddRows addRows) {
  try {
    TvkCtl::System::SystemInfoImpl system;
    auto list = Fabrik::MetaObj::MetaList::New(Fabrik::MetaObj::Struct, rowShape);
    std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>> rulesets;
    if (!SelectFirewallRulesets(system, input, output, rulesets))
      return;
    for (const auto& ruleset : rulesets)
      addRows(*list, *ruleset);
    output.SetRootObject(list);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
