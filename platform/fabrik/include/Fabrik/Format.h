//===- Fabrik/Format.h - Output formatters ----------------------------------===//
//
// The formatters turn a command's result (a typed value of MetaObj.h) into
// text. The command host picks one by name and passes it the formatter
// parameters: the command's default output parameters with the user's
// --format-param values applied over them (for the machine formats "json",
// "xml", "csv" and "keyvalue", only the user's own values).
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
//   show-header      "false": "table" shows no column names and no dashes;
//                    "csv" writes no header record.
//
// Boolean values accept true/false, 1/0, yes/no and on/off in any case; other
// texts leave the default (wrap-last false, show-header true).
//
// Which fields of a structure S are shown, first match wins:
//   "simple": fields (root only), fields:S, table-columns:S, table-columns
//             (root only), else all fields in their order.
//   "table":  fields (root only), table-columns:S, table-columns (root only),
//             fields:S, else all fields in their order.
//   "json", "xml", "csv", "keyvalue":
//             fields (root only), fields:S, else all fields in their order.
// A field that is unset (a template scalar never given a value) is left out
// everywhere; in a table or a csv record its cell is empty. The machine
// formats read no other parameter than these and show-header ("csv").
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
// A list of structures at the root prints one row per element; anything else,
// a single structure included, is printed as by "simple".
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
// "xml"
// -----
// An XML 1.0 document in UTF-8 in which every value names its type. After the
// declaration, the element <output> holds the root value; an unset scalar at
// the root gives "<output/>". The values:
//
//   <boolean>true</boolean>         true or false
//   <integer>-5</integer>           decimal
//   <string>text</string>           the text, escaped (below)
//   <list type="T">...</list>       its items in order, each an element of
//                                   its own; T is the element type: "string",
//                                   "structure" (also "boolean", "integer" or
//                                   "list" for lists of those)
//   <structure typeName="S">        a structure named S: one <field> per
//     <field name="F">...</field>   shown, set field, in order, holding the
//   </structure>                    field's value
//
// An empty list or structure is written as one empty-element tag, e.g.
// <list type="string"/>. An unset item of a list is left out. Each element is
// on a line of its own, indented by two blanks per level, except that a
// scalar is written on the line of its <field>; blanks between elements carry
// no meaning:
//
//   <?xml version="1.0" encoding="UTF-8"?>
//   <output>
//     <list type="structure">
//       <structure typeName="Nic">
//         <field name="Name"><string>vmnic0</string></field>
//         <field name="Speed"><integer>25000</integer></field>
//         <field name="Uplinks">
//           <list type="string">
//             <string>vmnic0</string>
//           </list>
//         </field>
//       </structure>
//     </list>
//   </output>
//
// Text and attribute values write &, <, > and " as &amp; &lt; &gt; &quot;,
// and tab, line feed and carriage return as &#9; &#10; &#13;, so that a
// parser returns them unchanged. Characters that XML 1.0 does not allow (the
// other control characters below U+0020, U+FFFE and U+FFFF) and each byte that
// is not part of a well-formed UTF-8 sequence become U+FFFD.
//
// "csv"
// -----
// Comma-separated values as RFC 4180 describes them, in UTF-8, except that
// every record ends with LF alone, as text lines do for the shell and the
// tools that read it; a field holding a comma, a double quote, a CR or a LF is
// enclosed in double quotes, with each double quote in it doubled; line
// breaks inside a quoted field stay as they are. A record whose only field is
// empty is written "" so that it does not read as a blank line.
//
//   A structure       a header record of the shown field names, then one
//                     record of their values.
//   A list of         the same header, then one record per structure. The
//   structures        columns are the shown fields of the element template
//                     and then any other shown field of the rows, in order of
//                     first appearance; an empty list gives the header alone.
//   A list of         a header record "Value", then one record per item.
//   strings           (Unset items of any list are left out.)
//   A scalar          one record of one field: the value. An unset scalar at
//                     the root writes nothing.
//
// With show-header=false the header record is left out. A cell holds a
// boolean as true/false, an integer in decimal, a string as it stands, an
// unset or missing field as nothing, and a nested structure or list as
// one-line JSON without blanks, laid out as "json" lays out its values (a list
// of strings ["vmnic0","vmnic1"], a structure {"Enabled":true,"Peak":100}),
// which is unambiguous whatever the text holds. Bytes that are not
// well-formed UTF-8 become U+FFFD.
//
//   Name,Speed,Uplinks,Description
//   vmnic0,25000,"[""vmnic0"",""vmnic1""]","Dual port, ""25G"""
//   vmnic1,-1,[],
//
// "keyvalue"
// ----------
// One line "PATH.TYPE=VALUE" per scalar, in the order "json" writes them;
// lines end with LF. TYPE is "boolean", "integer" or "string". PATH names
// the value:
//
//   - the root is named after its structure: a structure at the root by its
//     own name, a list at the root by the name of its element template (or of
//     its first structure item); a scalar or a list of strings at the root has
//     an empty name, and the "." after an empty PATH is left out;
//   - a field of a structure adds "." and the field's name;
//   - an item of a list adds "[I]", I counting items from 0. Unset items are
//     left out and keep their numbers.
//
//   Nic[0].Name.string=vmnic0
//   Nic[0].Speed.integer=25000
//   Nic[0].Link Up.boolean=true
//   Nic[0].Uplinks[1].string=vmnic1
//   Nic[0].Driver.Firmware.Version.string=2.1
//   Nic[1].Uplinks.list=
//   boolean=true                     (a boolean at the root)
//   [0].string=a                     (a list of strings at the root)
//
// An empty list, or a list whose items are all unset, writes "PATH.list="; a
// structure with no shown, set field writes "PATH.structure=", so that they
// stay apart from unset fields. Names are written as they stand, blanks
// included. The key ends at the first "=" without a backslash before it.
// In names and values, a backslash is written "\\", a line feed "\n" and a
// carriage return "\r"; in names, ".", "[", "]" and "=" also take a backslash
// before them. Nothing else is escaped. Bytes that are not well-formed UTF-8
// become U+FFFD.
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

/// Formats the rows of a list at the root as the command adds them
/// (MetaObj::StreamRows) and keeps the text aside, in memory up to a few MiB
/// and then in a temporary file, until the command has ended: only then is
/// it known whether the list is the result. The text is the same as Write
/// gives for the whole list.
class ListWriter : public MetaObj::RowSink {
public:
  /// Writes the result, the list with every row handed over, to \p out.
  virtual void Finish(std::ostream& out) = 0;
};

/// Turns a result into text.
class Formatter {
public:
  virtual ~Formatter();
  /// Writes \p root (which may be null: nothing is written) to \p out.
  virtual void Write(std::ostream& out, const MetaObj::MetaObjectPtr& root,
                     const Parameters& params) const = 0;
  /// A writer for a list at the root whose elements are structures made
  /// from \p element.
  virtual std::unique_ptr<ListWriter> StreamList(const MetaObj::MetaStruct& element,
                                                 const Parameters& params) const = 0;
  /// True for formats meant for programs rather than people ("json", "xml",
  /// "csv", "keyvalue"); the command host passes them only the parameters
  /// the user gave.
  virtual bool IsMachineFormat() const { return false; }
};

/// The formatter of that name, or null for an unknown name.
std::unique_ptr<Formatter> MakeFormatter(const std::string& name);

/// The names MakeFormatter knows, in a fixed order.
std::vector<std::string> FormatterNames();

} // namespace Fabrik::Format
