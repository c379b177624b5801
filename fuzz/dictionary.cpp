// Prints a libFuzzer dictionary of the ids the grammar dispatches on, read
// from the compiled tables: IE and extension ids as the two octets of their
// aligned 16-bit fields, procedure codes behind the first octet of each PDU
// type, and the private identifier's nation, company and protocol octets
// followed by each private IE id.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>
#include <vector>

#include "engine/grammar_tables.h"

namespace {

namespace grammar = rnsap::grammar;

using Octets = std::vector<uint8_t>;

void PrintEntry(const char* name, uint32_t id, const Octets& octets) {
  std::printf("%s_%u=\"", name, id);
  for (uint8_t octet : octets) std::printf("\\x%02x", octet);
  std::printf("\"\n");
}

void PrintDispatchIds(const char* name, grammar::DispatchKind kind) {
  const grammar::DispatchTable& table = grammar::kDispatchTables[kind];
  for (uint32_t id = 0; id < table.size; ++id) {
    if (table.branches[id] == grammar::kNoBranch) continue;
    PrintEntry(name, id, {static_cast<uint8_t>(id >> 8), static_cast<uint8_t>(id)});
  }
}

// The value names of the field with id `fieldId`.
std::vector<grammar::ValueName> ValueNamesOf(uint32_t fieldId) {
  for (uint32_t i = 0; i < grammar::kFieldCount; ++i) {
    const grammar::FieldInfo& field = grammar::kFields[i];
    if (field.fieldId != fieldId || field.names == grammar::kNoNames) continue;
    const grammar::ValueNames& list = grammar::kValueLists[field.names];
    return {grammar::kValueNames + list.first, grammar::kValueNames + list.first + list.count};
  }
  return {};
}

uint32_t NamedValue(uint32_t fieldId, std::string_view name) {
  for (const grammar::ValueName& entry : ValueNamesOf(fieldId)) {
    if (entry.text == name) return entry.value;
  }
  std::fprintf(stderr, "field %u has no value named %s\n", fieldId, name.data());
  std::exit(1);
}

// A sub-identifier as `groups` octets of 7 bits, all but the last with the
// top bit set.
void AppendSubIdentifier(Octets& octets, uint32_t value, int groups) {
  for (int group = groups - 1; group >= 0; --group) {
    octets.push_back(static_cast<uint8_t>(((value >> (7 * group)) & 0x7f) | (group ? 0x80 : 0)));
  }
}

constexpr uint32_t kProcedureCodeField = 688;
constexpr uint32_t kTwoOctetNationField = 3248;
constexpr uint32_t kThreeOctetCompanyField = 3264;
constexpr uint32_t kProtocolField = 3272;

void PrintProcedureCodes() {
  for (const grammar::ValueName& procedure : ValueNamesOf(kProcedureCodeField)) {
    for (uint32_t pduType = 0; pduType < 3; ++pduType) {
      PrintEntry("procedure", procedure.value,
                 {static_cast<uint8_t>(pduType << 5), static_cast<uint8_t>(procedure.value)});
    }
  }
}

void PrintPrivateIdentifiers() {
  Octets prefix;
  AppendSubIdentifier(prefix, NamedValue(kTwoOctetNationField, "Japan"), 2);
  AppendSubIdentifier(prefix, NamedValue(kThreeOctetCompanyField, "vorel"), 3);
  prefix.push_back(static_cast<uint8_t>(NamedValue(kProtocolField, "rnsap")));
  const grammar::DispatchTable& table = grammar::kDispatchTables[grammar::kDispatchPrivate];
  for (uint32_t id = 0; id < table.size; ++id) {
    if (table.branches[id] == grammar::kNoBranch) continue;
    Octets identifier = prefix;
    identifier.push_back(static_cast<uint8_t>(id));
    PrintEntry("private", id, identifier);
  }
}

}  // namespace

int main() {
  PrintDispatchIds("ie", grammar::kDispatchIe);
  PrintDispatchIds("extension", grammar::kDispatchExtension);
  PrintProcedureCodes();
  PrintPrivateIdentifiers();
  return 0;
}
