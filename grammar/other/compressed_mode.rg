# Compressed mode: the transmission gap patterns that a radio link setup or a
# compressed mode preparation brings, and the IEs that commit or cancel them.
# The failure cause of these procedures lives with the other causes.

# ------------------------------------------------------------------ patterns

# One to four protocol IE containers, read in place: each has its own IE
# count, loads the RL position counters and holds a pattern item.
family CM_PatternInformationList_{M} {
  member CompressedModePrep 2535 ie 14
  member RL_SetupRqstFDD 814 ie 194
} {
  field ~2535 2 "  CM_PatternInformationList_{M} Count" count Count
  repeat Count {
    align
    field 3354 16 "  ProtocolIEContainer COUNT" keep $ProtocolIeCount
    set $RlIdPosition = $ProtocolIeCount
    set $RlSetIdPosition = $ProtocolIeCount
    repeat $ProtocolIeCount { call RNSAP_IE }
  }
}

# A pattern: a transmission gap length and a gap pattern length, each with an
# optional second one read by the same rule, the gap distance between the
# two lengths, and the compressed mode methods.
family CM_PatternInformationItem_{M} {
  member CompressedModePrep 2537 ie 13
  member RL_SetupRqstFDD 816 ie 195
} {
  field ~2537 1 "  Extension Ext" values ExtensionFlag
  field ~2539 1 "  tGL2 OPTIONAL" presence
  field ~2541 1 "  tGPL2 OPTIONAL" presence
  field ~2543 1 "  iE_Extensions OPTIONAL" presence
  call CFNOffset
  call TGPRC
  call TGSN
  call TGL
  when "  tGL2 OPTIONAL" call TGL
  call TGD
  call TGPL
  when "  tGPL2 OPTIONAL" call TGPL
  call UL_DL_CompressedModeSelection
  call DL_CompressedModeMethod
  call UL_CompressedModeMethod
  call DL_FrameType
  call UL_DeltaSIR
  call UL_DeltaSIRAfter
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule CFNOffset { align; field 2694 8 "  CFNOffset" }
rule TGPRC { align; field 3002 16 "  TGPRC" }
rule TGSN { field 3103 4 "  TGSN" }
rule TGL { field 3108 4 "  TGL" plus 1 }
rule TGD { align; field 3107 16 "  TGD" }
rule TGPL { field 2905 8 "  TGPL" plus 1 }
rule UL_DL_CompressedModeSelection { field 3190 2 "  UL_DL_CompressedModeSelection" values { 0 "ul_only" 1 "dl_only" 2 "both_ul_and_dl" } }
rule DL_CompressedModeMethod { field 2706 2 "  DL_CompressedModeMethod" values { 0 "none" 1 "puncturing" 2 "half_SF" 3 "higher_Layer_Schduling" } }
rule UL_CompressedModeMethod { field 2707 2 "  UL_CompressedModeMethod" values { 0 "none" 1 "half_SF" 2 "higher_Layer_Schduling" } }
rule UL_DeltaSIR { field 3191 5 "  UL_DeltaSIR" }
rule UL_DeltaSIRAfter { field 3192 5 "  UL_DeltaSIRAfter" }

rule DL_FrameType {
  field 2802 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 2805 1 "  DL_FrameType" values { 0 "typeA" 1 "typeB" } if Ext == 0
}

# ------------------------------------------------------ beside the patterns

rule ScramblingCodeChange ie 196 {
  field 3065 1 "  ScramblingCodeChange" values { 0 "code_change" 1 "no_code_change" }
}

rule CompressedModeIndicator ie 197 {
  field 2705 1 "  CompressedModeIndicator" values { 0 "keepCompressedMode" 1 "stopCompressedMode" }
}
