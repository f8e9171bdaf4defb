//===- model/DatapathPart.cpp - VMs, their ports, and ENS contexts ----------===//
//
// The datapath part owns the fast-path (ENS) contexts of the host.
//
// Host description:
//   "ens": {"maxLcores": 4, "lcoreLimit": 16, "numaNodes": 2,
//           "lcores": [{"id": 0, "switch": "vSwitch1", "affinity": 1}]}
// "lcoreLimit" is the number of logical cores the host can dedicate to the
// fast path (context ids lie below it), "numaNodes" the NUMA nodes of the
// host.
//
//===----------------------------------------------------------------------===//
#include "model/CoreModel.h"
#include "model/DatapathModel.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <set>

namespace Model {

using nlohmann::ordered_json;

namespace {

const char* const kDatapathSchema = R"sql(
-- ENS contexts: the switch they serve (none when NULL) and their NUMA node.
CREATE TABLE ens_lcore(
  id INTEGER PRIMARY KEY,
  portset_id INTEGER REFERENCES portset(id) ON DELETE SET NULL,
  affinity INTEGER NOT NULL DEFAULT 0
);
CREATE INDEX ens_lcore_by_portset ON ens_lcore(portset_id);
)sql";

void ImportEns(const JsonObject& root, Store& store) {
  std::optional<JsonObject> ens = root.Object("ens");
  if (!ens)
    return;
  for (const auto& [key, value] : ens->Json().items())
    if (key != "maxLcores" && key != "lcoreLimit" && key != "numaNodes" && key != "lcores")
      ens->Fail(key.c_str(), "unknown field");
  int64_t limit = ens->Int("lcoreLimit", 1, 1024, kEnsDefaultLcoreLimit);
  int64_t max = ens->Int("maxLcores", 0, limit, kEnsDefaultMaxLcores);
  int64_t nodes = ens->Int("numaNodes", 1, 64, kEnsDefaultNumaNodes);
  PutSetting(store, kEnsLcoreLimitKey, std::to_string(limit));
  PutSetting(store, kEnsMaxLcoresKey, std::to_string(max));
  PutSetting(store, kEnsNumaNodesKey, std::to_string(nodes));
  std::vector<JsonObject> lcores = ens->Objects("lcores");
  if (static_cast<int64_t>(lcores.size()) > max)
    ens->Fail("lcores", "more contexts than maxLcores allows");
  std::set<int64_t> seen;
  for (const JsonObject& lcore : lcores) {
    for (const auto& [key, value] : lcore.Json().items())
      if (key != "id" && key != "switch" && key != "affinity")
        lcore.Fail(key.c_str(), "unknown field");
    int64_t id = lcore.Int("id", 0, limit - 1);
    if (!seen.insert(id).second)
      lcore.Fail("id", std::to_string(id) + " is used by another context");
    Statement insert =
        store.Prepare("INSERT INTO ens_lcore(id, portset_id, affinity) VALUES(?, ?, ?)");
    insert.BindAll(id).BindNull(2).Bind(3, lcore.Int("affinity", 0, nodes - 1, 0));
    if (lcore.Has("switch")) {
      std::string name = lcore.String("switch");
      Statement portset = store.Prepare("SELECT id FROM portset WHERE name = ?");
      portset.Bind(1, name);
      if (!portset.Step())
        lcore.Fail("switch", "there is no switch named \"" + name + "\"");
      insert.Bind(2, portset.Int(0));
    }
    insert.Run();
  }
}

void ExportEns(ordered_json& host, Store& store) {
  std::optional<std::string> limit = GetSetting(store, kEnsLcoreLimitKey);
  if (!limit)
    return;
  ordered_json ens = {{"maxLcores", std::stoll(GetSetting(store, kEnsMaxLcoresKey).value())},
                      {"lcoreLimit", std::stoll(*limit)},
                      {"numaNodes", std::stoll(GetSetting(store, kEnsNumaNodesKey).value())}};
  ordered_json lcores = ordered_json::array();
  Statement rows = store.Prepare("SELECT l.id, p.name, l.affinity FROM ens_lcore l "
                                 "LEFT JOIN portset p ON p.id = l.portset_id ORDER BY l.id");
  while (rows.Step()) {
    ordered_json lcore = {{"id", rows.Int(0)}};
    if (!rows.IsNull(1))
      lcore["switch"] = rows.Text(1);
    lcore["affinity"] = rows.Int(2);
    lcores.push_back(std::move(lcore));
  }
  ens["lcores"] = std::move(lcores);
  host["ens"] = std::move(ens);
}

void ImportDatapath(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  ImportEns(root, store);
}

void ExportDatapath(ordered_json& host, Store& store) {
  ExportEns(host, store);
}

} // namespace

extern const Part kDatapathPart;
const Part kDatapathPart = {
    "datapath", kDatapathSchema, {{"", {"ens"}}}, ImportDatapath, ExportDatapath,
};

} // namespace Model
