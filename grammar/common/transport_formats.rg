# Transport formats: the transport format set of a transport channel, the
# transport format combination set (TFCS) of a coded composite channel with
# its gain factors, and the small TFCI members that stand beside it.
#
# None of these has an IE id of its own; the radio link and common channel
# rules call them. Every list count is a bare field of the list's width that
# counts the items less 1: the loop runs count + 1 times, the field shows the
# raw count. Nothing here is range checked.

values TransportFormatSetMode { 0 "tdd" 1 "notApplicable" }

# ------------------------------------------------------------------ transport format set

rule TransportFormatSet {
  field 3124 1 "  Extension Ext" values ExtensionFlag
  field 3126 1 "  iE_Extensions OPTIONAL" presence
  call TransportFormatSet_DynamicPartList
  call TransportFormatSet_Semi_staticPart
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule TransportFormatSet_DynamicPartList {
  field 3129 5 "  TransportFormatSet_DynamicPartList Count" count Items
  repeat Items { call TransportFormatSet_DynamicPartList_list }
}

# One transport format.
rule TransportFormatSet_DynamicPartList_list {
  field 3340 1 "  Extension Ext" values ExtensionFlag
  field 3342 1 "  transportBlockSize OPTIONAL" presence
  field 3344 1 "  iE_Extensions OPTIONAL" presence
  call NrOfTransportBlocks
  when "  transportBlockSize OPTIONAL" call TransportBlockSize
  call TransportFormatSet_ModeDP
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule NrOfTransportBlocks {
  align
  field 2996 16 "  NrOfTransportBlocks"
}

rule TransportBlockSize {
  align
  field 3113 16 "  TransportBlockSize"
}

# The mode dependent part of a transport format: only the TDD branch carries
# bits.
rule TransportFormatSet_ModeDP {
  field 3131 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3134 1 "  TransportFormatSet_ModeDP Index" values TransportFormatSetMode keep Index
    call TransmissionTimeIntervalList if Index == 0
  }
}

rule TransmissionTimeIntervalList {
  field 3137 4 "  TransmissionTimeIntervalList Count" count Items
  repeat Items { call TransmissionTimeIntervalList_list }
}

rule TransmissionTimeIntervalList_list {
  field 3348 1 "  Extension Ext" values ExtensionFlag
  field 3350 1 "  iE_Extensions OPTIONAL" presence
  call TransmissionTimeInterval
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule TransmissionTimeInterval {
  field 3109 2 "  TransmissionTimeInterval" values { 0 "msec_10" 1 "msec_20" 2 "msec_40" 3 "msec_80" }
}

# The CodingRate follows its presence bit alone, whatever the coding type.
rule TransportFormatSet_Semi_staticPart {
  field 3145 1 "  Extension Ext" values ExtensionFlag
  field 3147 1 "  codingRate OPTIONAL" presence
  field 3149 1 "  iE_Extensions OPTIONAL" presence
  call TransmissionTimeInterval
  call ChannelCodingType
  when "  codingRate OPTIONAL" call CodingRate
  call RateMatchingAttribute
  call CRC_Size
  call TransportFormatSet_ModeSSP
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule ChannelCodingType {
  field 2695 2 "  ChannelCodingType" values { 0 "no_coding" 1 "convolutional_coding" 2 "turbo_coding" }
}

rule CodingRate {
  field 2704 1 "  CodingRate" values { 0 "half" 1 "third" }
}

rule RateMatchingAttribute {
  align
  field 3037 8 "  RateMatchingAttribute" plus 1
}

rule CRC_Size {
  field 2715 3 "  CRC_Size" values { 0 "v0" 1 "v8" 2 "v12" 3 "v16" 4 "v24" }
}

# The mode dependent part of the semi-static part: only the TDD branch
# carries bits.
rule TransportFormatSet_ModeSSP {
  field 3153 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3156 1 "  TransportFormatSet_ModeSSP Index" values TransportFormatSetMode keep Index
    call SecondInterleavingMode if Index == 0
  }
}

rule SecondInterleavingMode {
  field 3159 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 3162 1 "  SecondInterleavingMode" values { 0 "frame_related" 1 "timeslot_related" } if Ext == 0
}

# Read in front of the two transport format sets of a DCH item.
rule TrCH_SrcStatisticsDescr {
  field 3172 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 3175 2 "  TrCH_SrcStatisticsDescr" values { 0 "speech" 1 "rRC" 2 "unknown" } if Ext == 0
}

# ------------------------------------------------------------------ transport format combination set

# Only the list form carries bits; splitInTFCI ends the set after its index,
# and nothing is flagged.
rule TFCS {
  field 3120 1 "  TFCS Index" values { 0 "noSplitInTFCI" 1 "splitInTFCI" } keep Index
  call TFCS_NoSprit if Index == 0
}

# The Length is the number of combinations less 1.
rule TFCS_NoSprit {
  align
  field 3122 16 "  TFCS_NoSprit Length" count Items
  repeat Items { call TFCS_NoSprit_list }
}

# One transport format combination.
rule TFCS_NoSprit_list {
  field 3332 1 "  Extension Ext" values ExtensionFlag
  field 3334 1 "  tFC_Beta OPTIONAL" presence
  field 3336 1 "  iE_Extensions OPTIONAL" presence
  call CTFC
  when "  tFC_Beta OPTIONAL" call TransportFormatCombination_Beta
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The calculated transport format combination.
rule CTFC {
  align
  field 2735 16 "  CTFC"
}

rule TransportFormatCombination_Beta {
  field 3114 1 "  TransportFormatCombination_Beta Index" values { 0 "signalledGainFactors" 1 "refTFCNumber" } keep Index
  call TransportFormatCombination_Beta_signalledGainFactors if Index == 0
  call RefTFCNumber if Index == 1
}

# Two gain factors, read under one field id, and an optional reference TFC
# number. No Extension Ext here.
rule TransportFormatCombination_Beta_signalledGainFactors {
  field 3117 1 "  refTFCNumber OPTIONAL" presence
  call BetaCD
  call BetaCD
  when "  refTFCNumber OPTIONAL" call RefTFCNumber
}

rule BetaCD {
  field 2598 4 "  BetaCD"
}

rule RefTFCNumber {
  field 3038 4 "  RefTFCNumber"
}

# ------------------------------------------------------------------ members beside a combination set

rule TFCI_Coding {
  field 3100 2 "  TFCI_Coding" values { 0 "v4" 1 "v8" 2 "v16" 3 "v32" }
}

rule PunctureLimit {
  field 3022 4 "  PunctureLimit"
}

rule TFCI_Presence {
  field 3101 1 "  TFCI_Presence" values { 0 "present" 1 "not_present" }
}

rule TFCI_SignallingMode {
  field 3102 1 "  TFCI_SignallingMode" values { 0 "normal" 1 "split" }
}

# Block error rate, stored as an offset from -63: -63 to 0.
rule BLER {
  field 2644 6 "  BLER" minus 63
}
