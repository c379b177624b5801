#include "boundary/identity.h"

namespace rnsap {
namespace {

constexpr char kVersion[] = "NJ1.02.01";
constexpr char kProtocolDescription[] = "vorel_rnsap_04B.csf";
constexpr char kGeneratorRelease[] = "Release VEXTOOLS_A.02.20";
constexpr char kProtocol[] = "RNSAP";
constexpr char kEmpty[] = "";

constexpr IdentityWord Text(const char* text) { return {.text = text}; }
constexpr IdentityWord Number(uintptr_t number) { return {.number = number}; }

constexpr ModuleIdentity kIdentity = {
    .header = {7, 0, 0, 0},
    .words = {
        Text("Vorel"),                               // 0: operator whose dialect is decoded
        Text(kProtocol),                             // 1: protocol
        Text("Vorel RNSAP 04B V3.0.0(IP)"),          // 2: title of this decoder
        Text("Version 3.0.0 (IP) (Feb 2005)"),       // 3: its version
        Text("UMTS"),                                // 4: protocol family
        Text(kEmpty),                                // 5
        Text(kEmpty),                                // 6
        Text(kProtocolDescription),                  // 7: protocol description file
        Text(kEmpty),                                // 8
        Text(kGeneratorRelease),                     // 9: generator release
        Text(kGeneratorRelease),                     // 10: generator release, again
        Text("143"),                                 // 11: value of the selector in word 12
        Text("SSN"),                                 // 12: selector: the SCCP subsystem number
        Text("Vorel UTRAN Iu Interface TS_RID007"),  // 13: further descriptive text
        Text(kEmpty),                                // 14
        Text(kEmpty),                                // 15
        Number(0),                                   // 16
        Number(6),                                   // 17
        Number(4),                                   // 18
        Text(kProtocol),                             // 19
        Text(kProtocolDescription),                  // 20
        Number(0),                                   // 21
        Number(0xfffe),                              // 22
        Number(0),                                   // 23
        Number(0),                                   // 24
    }};

}  // namespace

const char* VersionString() { return kVersion; }

const ModuleIdentity& Identity() { return kIdentity; }

}  // namespace rnsap
