// The two queries by which a host learns what the module is and where its
// descriptor tables lie. Both only hand out addresses of constant data.
#include "boundary/export.h"
#include "boundary/identity.h"
#include "boundary/module_api.h"
#include "tables/descriptor_tables.h"

namespace rnsap {
namespace {

// The host sees the second prototype record without its four-word head.
constexpr uint32_t kPrototypeHeadBytes = 16;

const void* SecondPrototypeBody() {
  return static_cast<const uint8_t*>(tables::SecondPrototypeRecord()) + kPrototypeHeadBytes;
}

const void* PointerEntry(int32_t index) {
  switch (index) {
    case 1:
      return VersionString();
    case 2:
      return Identity().header;
    case 4:
      return tables::FirstPrototypeRecord();
    case 5:
      return tables::SecondPrototypeRecord();
    default:
      return nullptr;
  }
}

const void* TableEntry(int32_t index) {
  switch (index) {
    case 1:
      return VersionString();
    case 2:
      return Identity().words;
    case 4:
      return tables::FieldDictionary();
    case 5:
      return SecondPrototypeBody();
    case 6:
      return tables::ValueTable();
    case 7:
      return tables::ValuePool();
    case 8:
      return tables::StringTable();
    case 9:
      return tables::LayoutTable();
    default:
      return nullptr;
  }
}

uint32_t Answer(const void* entry, const void** out) {
  *out = entry;
  return entry != nullptr ? 0 : kQueryNoEntry;
}

}  // namespace
}  // namespace rnsap

extern "C" {

RNSAP_EXPORT uint32_t vex_DLLGetPtr(int32_t index, const void** out) {
  return rnsap::Answer(rnsap::PointerEntry(index), out);
}

RNSAP_EXPORT uint32_t vex_DLLGetTable(int32_t index, const void** out) {
  return rnsap::Answer(rnsap::TableEntry(index), out);
}

}  // extern "C"
