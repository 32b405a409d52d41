// Reads the entity headers out of the tree that `ghdl --file-to-xml` dumps: for each entity of
// one source file its generics (and whether they have a default) and its ports with GHDL's
// own idea of their name, mode, line and type mark.
#pragma once

#include <pugixml.hpp>

#include <string>
#include <string_view>
#include <vector>

namespace difftest {

struct GhdlPort {
  std::string name;  ///< lower case for basic identifiers, with backslashes for extended ones
  std::string mode;  ///< "in", "out", "inout", "buffer" or "linkage"
  int line = 0;
  int firstLineOfList = 0;  ///< line of the first name of its identifier list
  std::string typeMark;
  bool constrained = false;  ///< the declaration itself constrains the type mark
};

struct GhdlEntity {
  std::string name;
  int line = 0;
  std::vector<std::string> genericsWithoutDefault;
  std::vector<GhdlPort> ports;
};

/// The entities that `file` (exactly as it was named to GHDL) declares, in source order.
/// False when the dump cannot be read.
inline bool readGhdlEntities(std::string_view xml, const std::string& file,
                             std::vector<GhdlEntity>& entities) {
  pugi::xml_document document;
  if (!document.load_buffer(xml.data(), xml.size())) return false;
  for (const pugi::xpath_node& unit :
       document.select_nodes("//library_unit[@kind='entity_declaration']")) {
    const pugi::xml_node node = unit.node();
    if (file != node.attribute("file").value()) continue;
    GhdlEntity& entity = entities.emplace_back();
    entity.name = node.attribute("identifier").value();
    entity.line = node.attribute("line").as_int();
    for (const pugi::xml_node generic : node.child("generic_chain").children("el"))
      if (!generic.child("default_value"))
        entity.genericsWithoutDefault.emplace_back(generic.attribute("identifier").value());
    // Later names of an identifier list only refer back to the first one's subtype.
    GhdlPort list;
    bool listContinues = false;
    for (const pugi::xml_node el : node.child("port_chain").children("el")) {
      GhdlPort& port = entity.ports.emplace_back();
      port.name = el.attribute("identifier").value();
      port.mode = el.attribute("mode").value();
      port.line = el.attribute("line").as_int();
      if (!listContinues) list.firstLineOfList = port.line;
      port.firstLineOfList = list.firstLineOfList;
      listContinues = std::string_view(el.attribute("has_identifier_list").value()) == "true";
      const pugi::xml_node subtype = el.child("subtype_indication");
      if (!subtype) continue;
      if (!subtype.attribute("ref")) {
        const std::string_view kind = subtype.attribute("kind").value();
        list.constrained = kind != "simple_name" && kind != "selected_name";
        list.typeMark = (list.constrained ? subtype.child("subtype_type_mark") : subtype)
                            .attribute("identifier")
                            .value();
      }
      port.typeMark = list.typeMark;
      port.constrained = list.constrained;
    }
  }
  return true;
}

}  // namespace difftest
