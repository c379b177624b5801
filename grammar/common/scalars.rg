# Scalar IEs: the rules that read one value, and the rules of one value
# behind an extension bit, a size or a length. Every bigger rule is built
# from these. No rule checks a range: a value the protocol forbids is read
# and shown like any other.

# AllocationRetentionPriority and FrameHandlingPriority: the two ends of the
# scale are named, every other value is shown as its number.
values Priority { other "%u" 0 "%u (lowest)" 15 "%u (highest)" }

# ---------------------------------------------------------------- one value

rule AllocationRetentionPriority { field 2596 4 "  AllocationRetentionPriority" values Priority }
rule AllowedQueuingTime ie 4 { field 2597 6 "  AllowedQueuingTime" }
rule BurstType { field 2647 1 "  BurstType" values { 0 "type1" 1 "type2" } }
rule C_RNTI ie 7 { align; field 2744 16 "  C_RNTI" }
rule CCTrCH_ID { field 2690 4 "  CCTrCH_ID" }
rule CellIndividualOffset { field 2691 6 "  CellIndividualOffset" minus 20 }
rule CellParameterID { field 2692 7 "  CellParameterID" }
rule CFN ie 8 { align; field 2693 8 "  CFN" }
rule ChipOffset { align; field 2696 16 "  ChipOffset" }
rule ClosedLoopMode1_SupportIndicator { field 2697 1 "  ClosedLoopMode1_SupportIndicator" values { 0 "closedLoop_Mode1_Supported" 1 "closedLoop_Mode1_not_Supported" } }
rule ClosedLoopMode2_SupportIndicator { field 2698 1 "  ClosedLoopMode2_SupportIndicator" values { 0 "closedLoop_Mode2_Supported" 1 "closedLoop_Mode2_not_Supported" } }
rule CompleteRNC_ID { align; field 2714 16 "  CompleteRNC_ID" }
rule Criticality { field 3216 2 "  Criticality" values { 0 "reject" 1 "ignore" 2 "notify" } }
rule D_FieldLength { field 2811 1 "  D_FieldLength" values { 0 "v1" 1 "v2" } }
rule D_RNTI_ReleaseIndication ie 22 { field 2800 1 "  D_RNTI_ReleaseIndication" values { 0 "release_D_RNTI" 1 "not_release_D_RNTI" } }
rule DCH_CombinationInd { align; field 2746 8 "  DCH_CombinationInd" }
rule DiversityControlField { field 2793 2 "  DiversityControlField" values { 0 "may" 1 "must" 2 "must_not" } }
rule DiversityMode { field 2794 2 "  DiversityMode" values { 0 "none" 1 "sTTD" 2 "closedLoopMode1" 3 "closedLoopMode2" } }
rule DL_DPCH_SlotFormat { field 2795 5 "  DL_DPCH_SlotFormat" }
rule DL_Power ie 67 extension 1 { align; field 2796 16 "  DL_Power" minus 350 }
rule DL_ScramblingCode { field 2801 4 "  DL_ScramblingCode" }
rule DPCH_ID { field 2807 8 "  DPCH_ID" }
rule DPCHConstantValue { field 2808 6 "  DPCHConstantValue" minus 32 }
rule DRACControl { field 2809 1 "  DRACControl" values { 0 "requested" 1 "not_requested" } }
rule DRXCycleLengthCoefficient ie 70 { field 2810 4 "  DRXCycleLengthCoefficient" plus 2 }
rule FACH_InitialWindowSize { align; field 2871 8 "  FACH_InitialWindowSize" values { 255 "unlimited" } }
rule FACH_PriorityIndicator { field 2879 4 "  FACH_PriorityIndicator" values { 0 "lowest" 15 "highest" } }
rule FDD_DL_ChannelisationCodeNumber { align; field 2872 8 "  FDD_DL_ChannelisationCodeNumber" }
rule FDD_S_CCPCH_Offset { field 2873 8 "  FDD_S_CCPCH_Offset" }
rule FrameHandlingPriority { field 2881 4 "  FrameHandlingPriority" values Priority }
rule FrameOffset { align; field 2882 8 "  FrameOffset" }
rule IB_SG_POS { align; field 2911 16 "  IB_SG_POS" }
rule IB_SG_REP { field 2912 4 "  IB_SG_REP" values { 0 "rep4" 1 "rep8" 2 "rep16" 3 "rep32" 4 "rep64" 5 "rep128" 6 "rep256" 7 "rep512" 8 "rep1024" 9 "rep2048" } }
rule LimitedPowerIncrease { field 3053 1 "  LimitedPowerIncrease" values { 0 "used" 1 "not_used" } }
rule MAC_c_SDU_Length { align; field 2956 16 "  MAC_c_SDU_Length" plus 1 }
rule MaximumAllowedULTxPower { field 2957 7 "  MaximumAllowedULTxPower" minus 50 }
rule MaxNrOfUL_DPCHs { field 2955 3 "  MaxNrOfUL_DPCHs" plus 1 }
rule MidambleShift { field 2982 4 "  MidambleShift" }
rule MinUL_ChannelisationCodeLength { field 2983 3 "  MinUL_ChannelisationCodeLength" values { 0 "v4" 1 "v8" 2 "v16" 3 "v32" 4 "v64" 5 "v128" 6 "v256" } }
rule MultipleURAsIndicator ie 94 { field 2965 1 "  MultipleURAsIndicator" values { 0 "multiple_URAs_exist" 1 "single_URA_exists" } }
rule MultiplexingPosition { field 2984 1 "  MultiplexingPosition" values { 0 "fixed" 1 "flexible" } }
rule PayloadCRC_PresenceIndicator { field 3003 1 "  PayloadCRC_PresenceIndicator" values { 0 "crc_included" 1 "crc_not_included" } }
rule PCCPCH_Power { field 3004 16 "  PCCPCH_Power" minus 150 }
rule PCP_LENGTH ie 193 { field 3005 1 "  PCP_LENGTH" values { 0 "v0" 1 "v8" } }
rule PowerAdjustmentType ie 107 { field 3013 2 "  PowerAdjustmentType" values { 0 "none" 1 "common" 2 "individual" } }
rule PowerOffset { field 3014 5 "  PowerOffset" }
rule PrimaryCCPCH_RSCP { field 3018 7 "  PrimaryCCPCH_RSCP" }
rule PrimaryCPICH_EcNo { field 3017 6 "  PrimaryCPICH_EcNo" minus 30 }
rule PrimaryCPICH_Power extension 18 { align; field 3016 16 "  PrimaryCPICH_Power" minus 100 }
rule PrimaryScramblingCode { align; field 3019 16 "  PrimaryScramblingCode" }
rule PrivateIE_ID_local { align; field 3275 16 "  PrivateIE_ID_local" }
rule PropagationDelay extension 21 { align; field 3020 8 "  PropagationDelay" }
rule QE_Selector { field 3026 1 "  QE_Selector" values { 0 "selected_DCH" 1 "non_selected_DCH" } }
rule RepetitionLength { field 3039 6 "  RepetitionLength" plus 1 }
rule RepetitionPeriod { field 3040 3 "  RepetitionPeriod" values { 0 "v1" 1 "v2" 2 "v4" 3 "v8" 4 "v16" 5 "v32" 6 "v64" } }
rule ReportType { field 3052 1 "  ReportType" values { 0 "node_b" 1 "drnc" } }
rule RL_Set_ID { field 3055 5 "  RL_Set_ID" key }
rule S_FieldLength { field 3074 1 "  S_FieldLength" values { 0 "v1" 1 "v2" } }
rule ScaledMaxAdjustmentPeriod ie 90 { field 2966 6 "  ScaledMaxAdjustmentPeriod" plus 1 }
rule ScaledMaxAdjustmentStep ie 91 { field 2967 4 "  ScaledMaxAdjustmentStep" plus 1 }
rule SCH_TimeSlot { field 3006 3 "  SCH_TimeSlot" }
rule SecondaryCCPCH_SlotFormat { field 3072 5 "  SecondaryCCPCH_SlotFormat" }
rule SSDT_CellID { field 3078 3 "  SSDT_CellID" values { 0 "a" 1 "b" 2 "c" 3 "d" 4 "e" 5 "f" 6 "g" 7 "h" } }
rule SSDT_CellID_Length { field 3079 2 "  SSDT_CellID_Length" values { 0 "short" 1 "medium" 2 "long" } }
rule SSDT_Indication { field 3080 1 "  SSDT_Indication" values { 0 "sSDT_active_in_the_UE" 1 "sSDT_not_active_in_the_UE" } }
rule SSDT_SupportIndicator { field 3081 1 "  SSDT_SupportIndicator" values { 0 "sSDT_supported" 1 "sSDT_not_supported" } }
rule STTD_Indicator { field 3082 1 "  STTD_Indicator" values { 0 "active" 1 "inactive" } }
rule STTD_SupportIndicator { field 3083 1 "  STTD_SupportIndicator" values { 0 "sTTD_Supported" 1 "sTTD_not_Supported" } }
rule SyncCase { field 3021 1 "  SyncCase" values { 0 "case1" 1 "case2" } }
rule TDD_PhysicalChannelOffset { field 3094 6 "  TDD_PhysicalChannelOffset" }
rule TimeSlot { field 3104 4 "  TimeSlot" }
rule ToAWE { align; field 3105 16 "  ToAWE" }
rule ToAWS { align; field 3106 16 "  ToAWS" }
rule TransmitDiversityIndicator { field 3110 1 "  TransmitDiversityIndicator" values { 0 "active" 1 "inactive" } }
rule TransportBearerID ie 163 { align; field 3111 16 "  TransportBearerID" }
rule TransportBearerRequestIndicator ie 164 { field 3112 1 "  TransportBearerRequestIndicator" values { 0 "bearer_requested" 1 "bearer_not_requested" } }
rule TxDiversityIndicator { field 3177 1 "  TxDiversityIndicator" values { 0 "true" 1 "false" } }
rule UL_DPCCH_SlotFormat { field 3200 3 "  UL_DPCCH_SlotFormat" }
rule UL_FP_Mode { field 3201 1 "  UL_FP_Mode" values { 0 "normal" 1 "silent" } }
rule UL_InterferenceLevel { align; field 3202 16 "  UL_InterferenceLevel" minus 1280 }
rule UL_ScramblingCodeLength { field 3207 1 "  UL_ScramblingCodeLength" values { 0 "short" 1 "long" } }
rule UL_SIR ie 184 { align; field 3193 8 "  UL_SIR" minus 82 }
rule URA_ID ie 185 { align; field 3211 16 "  URA_ID" }

# ------------------------------------------- one value behind an extension bit

rule UARFCN extension 5 extension 25 {
  field 3185 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    align
    field 3188 16 "  UARFCN"
  }
}

rule Closedlooptimingadjustmentmode {
  field 2699 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2702 1 "  Closedlooptimingadjustmentmode" values { 0 "slot1" 1 "slot2" }
  }
}

rule FDD_TPC_DownlinkStepSize {
  field 2874 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2877 1 "  FDD_TPC_DownlinkStepSize" values { 0 "step_size0_5" 1 "step_size1" }
  }
}

rule TDD_TPC_DownlinkStepSize {
  field 3095 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3098 2 "  TDD_TPC_DownlinkStepSize" values { 0 "step_size1" 1 "step_size2" 2 "step_size3" }
  }
}

rule NrOfDLchannelisationcodes {
  field 2991 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2994 3 "  NrOfDLchannelisationcodes" plus 1
  }
}

rule TDD_ChannelisationCode {
  field 3089 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3092 5 "  TDD_ChannelisationCode" values {
      0 "chCode1div1" 1 "chCode2div1" 2 "chCode2div2" 3 "chCode4div1"
      4 "chCode4div2" 5 "chCode4div3" 6 "chCode4div4" 7 "chCode8div1"
      8 "chCode8div2" 9 "chCode8div3" 10 "chCode8div4" 11 "chCode8div5"
      12 "chCode8div6" 13 "chCode8div7" 14 "chCode8div8" 15 "chCode16div1"
      16 "chCode16div2" 17 "chCode16div3" 18 "chCode16div4" 19 "chCode16div5"
      20 "chCode16div6" 21 "chCode16div7" 22 "chCode16div8" 23 "chCode16div9"
      24 "chCode16div10" 25 "chCode16div11" 26 "chCode16div12" 27 "chCode16div13"
      28 "chCode16div14" 29 "chCode16div15" 30 "chCode16div16"
    }
  }
}

# ------------------------------------------------- one value behind a size

# The size counts octets less one; the value is a bit string of that many
# octets, on an octet boundary.
rule D_RNTI ie 21 {
  field 2797 2 "  D_RNTI SIZE" length Octets
  align
  field 2799 bits(Octets*8) "  D_RNTI" key
}

rule UL_ScramblingCodeNumber {
  field 3208 2 "  UL_ScramblingCodeNumber SIZE" length Octets
  align
  field 3210 bits(Octets*8) "  UL_ScramblingCodeNumber" key
}

rule UL_ScramblingCode {
  field 3204 1 "  iE_Extensions OPTIONAL" presence
  call UL_ScramblingCodeNumber
  call UL_ScramblingCodeLength
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The DL SIR target is carried as an UL_SIR; it has no field of its own.
rule DL_SIRTarget ie 66 {
  call UL_SIR
}

rule powerOffsetInformation {
  field 3284 1 "  Extension Ext" values ExtensionFlag
  call PowerOffset
  call PowerOffset
  call PowerOffset
}

# ----------------------------------------------- one value behind a length

# A bit string behind a length determinant: 7 bits of length after the form
# bit 0, 14 bits after the form bits 1 and Type2. The length counts bits.
rule L3_Information ie 85 {
  align
  field 2946 1 "  BitString Length Type" keep Form
  if Form == 0 {
    field 2949 7 "  Length" keep Length
    field 2950 bits(Length) "  L3_Information" show "%b"
  } else {
    field 2952 1 "  BitString Length Type2"
    field 2953 14 "  Length" keep Length
    field 2954 bits(Length) "  L3_Information" show "%b"
  }
}

rule RANAP_RelocationInformation ie 109 {
  align
  field 3028 1 "  BitString Length Type" keep Form
  if Form == 0 {
    field 3031 7 "  Length" keep Length
    field 3032 bits(Length) "  RANAP_RelocationInformation" show "%b"
  } else {
    field 3034 1 "  BitString Length Type2"
    field 3035 14 "  Length" keep Length
    field 3036 bits(Length) "  RANAP_RelocationInformation" show "%b"
  }
}
