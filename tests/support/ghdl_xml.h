// Reads the entity headers out of the tree that `ghdl --file-to-xml` dumps: for each entity of
// one source file its generics (and whether they have a default) and its ports with GHDL's
// own idea of their name, mode, line and type mark. Just enough XML for that dump.
#pragma once

#include <cstdlib>
#include <string>
#include <string_view>
#include <utility>
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

namespace ghdlxml {

struct Tag {
  std::string_view name;
  bool closing = false;
  bool selfClosing = false;
  std::vector<std::pair<std::string_view, std::string>> attributes;

  const std::string* attribute(std::string_view key) const {
    for (const auto& [name, value] : attributes)
      if (name == key) return &value;
    return nullptr;
  }
  std::string text(std::string_view key) const {
    const std::string* value = attribute(key);
    return value != nullptr ? *value : std::string();
  }
  int number(std::string_view key) const {
    const std::string* value = attribute(key);
    return value != nullptr ? std::atoi(value->c_str()) : 0;
  }
};

/// Decodes the character references GHDL writes (&#xNN; and the five named ones).
inline std::string decode(std::string_view raw) {
  std::string out;
  for (size_t i = 0; i < raw.size(); ++i) {
    const size_t end = raw[i] == '&' ? raw.find(';', i) : std::string_view::npos;
    if (end == std::string_view::npos) {
      out += raw[i];
      continue;
    }
    const std::string_view entity = raw.substr(i + 1, end - i - 1);
    if (entity == "lt") out += '<';
    else if (entity == "gt") out += '>';
    else if (entity == "amp") out += '&';
    else if (entity == "quot") out += '"';
    else if (entity == "apos") out += '\'';
    else if (entity.size() > 2 && entity[0] == '#' && entity[1] == 'x')
      out += static_cast<char>(std::strtol(std::string(entity.substr(2)).c_str(), nullptr, 16));
    else if (entity.size() > 1 && entity[0] == '#')
      out += static_cast<char>(std::strtol(std::string(entity.substr(1)).c_str(), nullptr, 10));
    else
      out.append(raw.substr(i, end - i + 1));
    i = end;
  }
  return out;
}

/// Reads the tag that starts at `pos` (just after '<'); false at malformed input.
inline bool readTag(std::string_view xml, size_t& pos, Tag& tag) {
  tag = Tag{};
  if (pos < xml.size() && xml[pos] == '/') {
    tag.closing = true;
    ++pos;
  }
  const size_t nameEnd = xml.find_first_of(" \t\r\n/>", pos);
  if (nameEnd == std::string_view::npos) return false;
  tag.name = xml.substr(pos, nameEnd - pos);
  pos = nameEnd;
  while (pos < xml.size()) {
    const char c = xml[pos];
    if (c == '>') {
      ++pos;
      return true;
    }
    if (c == '/') {
      tag.selfClosing = true;
      ++pos;
      continue;
    }
    if (c == ' ' || c == '\t' || c == '\r' || c == '\n') {
      ++pos;
      continue;
    }
    const size_t equals = xml.find('=', pos);
    if (equals == std::string_view::npos || equals + 1 >= xml.size() || xml[equals + 1] != '"')
      return false;
    const size_t valueEnd = xml.find('"', equals + 2);
    if (valueEnd == std::string_view::npos) return false;
    tag.attributes.emplace_back(xml.substr(pos, equals - pos),
                                decode(xml.substr(equals + 2, valueEnd - equals - 2)));
    pos = valueEnd + 1;
  }
  return false;
}

}  // namespace ghdlxml

/// The entities that `file` (exactly as it was named to GHDL) declares, in source order.
/// False when the dump cannot be read.
inline bool readGhdlEntities(std::string_view xml, const std::string& file,
                             std::vector<GhdlEntity>& entities) {
  // Each open element gets a role; only the ones on the path entity > chain > el > subtype
  // matter, everything else is walked through.
  enum class Role { Other, Entity, Generics, Generic, Ports, Port, PortSubtype };
  std::vector<Role> open;
  std::string listTypeMark;
  bool listConstrained = false;
  int listFirstLine = 0;
  bool listContinues = false;
  size_t pos = 0;
  ghdlxml::Tag tag;
  while ((pos = xml.find('<', pos)) != std::string_view::npos) {
    ++pos;
    if (pos < xml.size() && (xml[pos] == '?' || xml[pos] == '!')) {
      pos = xml.find('>', pos);
      if (pos == std::string_view::npos) return false;
      continue;
    }
    if (!ghdlxml::readTag(xml, pos, tag)) return false;
    if (tag.closing) {
      if (open.empty()) return false;
      open.pop_back();
      continue;
    }
    const Role parent = open.empty() ? Role::Other : open.back();
    Role role = Role::Other;
    if (tag.name == "library_unit" && tag.text("kind") == "entity_declaration" &&
        tag.text("file") == file) {
      role = Role::Entity;
      entities.push_back({tag.text("identifier"), tag.number("line"), {}, {}});
    } else if (parent == Role::Entity && tag.name == "generic_chain") {
      role = Role::Generics;
    } else if (parent == Role::Entity && tag.name == "port_chain") {
      role = Role::Ports;
    } else if (parent == Role::Generics && tag.name == "el") {
      role = Role::Generic;
      entities.back().genericsWithoutDefault.push_back(tag.text("identifier"));
    } else if (parent == Role::Generic && tag.name == "default_value") {
      entities.back().genericsWithoutDefault.pop_back();
    } else if (parent == Role::Ports && tag.name == "el") {
      role = Role::Port;
      GhdlPort port{tag.text("identifier"), tag.text("mode"), tag.number("line"), 0, {}};
      if (!listContinues) listFirstLine = port.line;
      port.firstLineOfList = listFirstLine;
      listContinues = tag.text("has_identifier_list") == "true";
      entities.back().ports.push_back(std::move(port));
    } else if (parent == Role::Port && tag.name == "subtype_indication") {
      // Later names of an identifier list only refer back to the first one's subtype.
      const std::string kind = tag.text("kind");
      if (tag.attribute("ref") == nullptr) {
        listTypeMark.clear();
        listConstrained = kind != "simple_name" && kind != "selected_name";
        if (listConstrained) role = Role::PortSubtype;
        else listTypeMark = tag.text("identifier");
      }
      entities.back().ports.back().typeMark = listTypeMark;
      entities.back().ports.back().constrained = listConstrained;
    } else if (parent == Role::PortSubtype && tag.name == "subtype_type_mark") {
      listTypeMark = tag.text("identifier");
      entities.back().ports.back().typeMark = listTypeMark;
    }
    if (!tag.selfClosing) open.push_back(role);
  }
  return open.empty();
}

}  // namespace difftest
