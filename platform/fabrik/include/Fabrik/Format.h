//===- Fabrik/Format.h - Output formatters ----------------------------------===//
//
// The formatters turn a command's result (a typed value of MetaObj.h) into
// text. The command host picks one by name and passes it the formatter
// parameters: the command's default output parameters with the user's
// --format-param values applied over them (for machine formats such as "json",
// only the user's own values).
//
// Parameters
// ----------
// Keys and values are plain text. Names of structures (S) and fields (F) are
// those the result uses; a key naming a structure that the result does not
// contain is ignored, as is an unknown field name in a list. Field lists are
// comma-separated, and blanks around each name are ignored ("A, B" = "A,B").
//
//   fields:S         The fields of structure S to show, in this order.
//   fields           The same for the structure at the root, or the element
//                    structure of a list at the root; wins over fields:S there.
//                    This is the key a user gives: --format-param fields=A,B.
//   table-columns:S  The columns when a list of S is shown as a table.
//   table-columns    The same for the root (element) structure.
//   header:S         "simple": a line shown before each block of S, in which
//                    %Field Name% stands for that field's value as text (an
//                    unknown name between two "%" is left as it stands).
//                    "<NONE>", an empty value or no key: no header line.
//   units:S.F        A unit appended, after one blank, to each non-empty value
//                    of field F of S ("simple" and "table").
//   wrap-last        "true": "table" wraps its last column (below).
//   show-header      "false": "table" shows no column names and no dashes.
//
// Boolean values accept true/false, 1/0, yes/no and on/off in any case; other
// texts leave the default (wrap-last false, show-header true).
//
// Which fields of a structure S are shown, first match wins:
//   "simple": fields (root only), fields:S, table-columns:S, table-columns
//             (root only), else all fields in their order.
//   "table":  fields (root only), table-columns:S, table-columns (root only),
//             fields:S, else all fields in their order.
//   "json":   fields (root only), fields:S, else all fields in their order.
// A field that is unset (a template scalar never given a value) is left out
// everywhere; in a table its cell is empty.
//
// "simple"
// --------
// A scalar root prints its value and a line break (booleans as true/false,
// integers in decimal). A list of strings prints one item per line. A
// structure prints one line per shown, set field:
//
//   Name: vSwitch0
//   Uplinks: vmnic0, vmnic1        (a list of strings, joined by ", ")
//   MTU: 1500 bytes                (with units:S.MTU = "bytes")
//   Policy:                        (a nested structure: its fields follow,
//      Enabled: true                three blanks further in)
//   Ports:                         (a list of structures: each element is a
//      Port ID: 1                   block three blanks further in, with one
//                                   blank line between blocks)
//      Port ID: 2
//
// A field whose text is empty prints as "Name:" with no trailing blank. Every
// structure block (the root structure, each element of a list of structures,
// a nested structure) starts with its header line when header:S is given; the
// block's fields are then indented by three more blanks:
//
//   vSwitch0
//      Name: vSwitch0
//      MTU: 1500
//
//   vSwitch1
//      Name: vSwitch1
//      MTU: 9000
//
// A list of structures at the root prints its blocks separated by one blank
// line. An empty list and an unset scalar print nothing.
//
// "table"
// -------
// A list of structures at the root prints one row per element; a single
// structure is a table of one row; anything else is printed as by "simple".
// The columns are the shown fields (above); with no selection, the fields of
// the list's element template, or else of its first row. A line of column
// names and a line of dashes as wide as each column come first, then the rows.
// Cells are left-aligned, columns are separated by two blanks, and lines carry
// no trailing blanks. Widths count UTF-8 characters, not bytes.
//
//   Name      MTU   Uplinks
//   --------  ----  --------------
//   vSwitch0  1500  vmnic0, vmnic1
//   vSwitch1  9000
//
// Cell text: booleans true/false, integers in decimal, strings as they stand
// (line breaks and tabs become blanks), a list of strings joined by ", ", an
// unset value empty, a nested structure as "{A: x, B: y}" (its shown, set
// fields), a list of structures as "[{A: x}, {A: y}]" and a list of strings
// inside those as "[a, b]". Units follow a non-empty cell after one blank.
//
// With wrap-last, the last column is wrapped at blanks so that lines fit the
// width given by the environment variable COLUMNS (80 when unset or not a
// positive number); continuation lines start at the last column's position.
// The last column keeps at least 10 characters, and a word longer than that is
// not broken. An empty list prints nothing.
//
// "json"
// ------
// The root as one JSON value: booleans, numbers, strings, an array for a list
// and an object for a structure, with the shown, set fields as keys in field
// order. An unset scalar at the root or inside a list is null. Each array
// item and object member is on a line of its own, indented by two blanks per
// level, with ": " after a key; an empty array or object is written "[]" or
// "{}"; a line break ends the output:
//
//   {
//     "Name": "vSwitch0",
//     "MTU": 1500,
//     "Uplinks": [
//       "vmnic0"
//     ]
//   }
//
// Strings escape the quote and the backslash; control characters are written
// as \u00XX. Valid UTF-8 passes through unchanged; each byte that is not part
// of a well-formed UTF-8 sequence becomes \ufffd.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/MetaObj.h"

#include <iosfwd>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Fabrik::Format {

/// Formatter parameters: ordered key/value pairs; a later Set of a key
/// replaces its value in place.
class Parameters {
public:
  void Set(const std::string& key, const std::string& value);
  /// The value of \p key, or null when it was never set.
  const std::string* Find(const std::string& key) const;
  /// All pairs, in the order their keys were first set.
  const std::vector<std::pair<std::string, std::string>>& All() const { return pairs_; }

private:
  std::vector<std::pair<std::string, std::string>> pairs_; ///< In order of first Set.
};

/// Turns a result into text.
class Formatter {
public:
  virtual ~Formatter();
  /// Writes \p root (which may be null: nothing is written) to \p out.
  virtual void Write(std::ostream& out, const MetaObj::MetaObjectPtr& root,
                     const Parameters& params) const = 0;
  /// True for formats meant for programs rather than people ("json"); the
  /// command host passes them only the parameters the user gave.
  virtual bool IsMachineFormat() const { return false; }
};

/// The formatter of that name, or null for an unknown name.
std::unique_ptr<Formatter> MakeFormatter(const std::string& name);

/// The names MakeFormatter knows, in a fixed order.
std::vector<std::string> FormatterNames();

} // namespace Fabrik::Format
