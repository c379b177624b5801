// The constant tables the host reads through vex_DLLGetTable/vex_DLLGetPtr.
#pragma once

namespace rnsap::tables {

const void* FieldDictionary();        // table 4
const void* ValueTable();             // table 6
const void* ValuePool();              // table 7
const void* StringTable();            // table 8
const void* LayoutTable();            // table 9
const void* FirstPrototypeRecord();   // pointer 4
const void* SecondPrototypeRecord();  // pointer 5; table 5 is its body, from byte 16

}  // namespace rnsap::tables
