# The radio link addition request, response and failure, FDD and TDD, and
# the radio link deletion request. Most of their IEs share the shapes of the
# setup response and failure; the rules here are those of the addition's
# own shape, and its container lists.

# ------------------------------------------------------------------ diversity indication

# A radio link of the TDD addition response that combines with an existing
# one: the plain RL_ID.
rule CombiningItem_RL_AdditionRspTDD ie 17 {
  field 1394 1 "  Extension Ext" values ExtensionFlag
  field 1396 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Whether the new radio link is combined with an existing one: each choice
# is an IE container.
family DiversityIndicationItem_RL_{M} {
  member AdditionFailureFDD 1500 ie 75
  member AdditionRspFDD 1250 ie 76
  member AdditionRspTDD 1388 ie 77
} {
  field ~1500 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field ~1503 1 "  DiversityIndicationItem_RL_{M} Index" values { 0 "combining" 1 "nonCombining" } keep Index
    call Combining_RL_{M} if Index == 0
    call NonCombining_RL_{M} if Index == 1
  }
}

# ------------------------------------------------------------------ request

# The FDD radio link to add, its RL_ID numbered by place in the list.
rule RL_Information_RL_AdditionRqstFDD ie 112 {
  field 1177 1 "  Extension Ext" values ExtensionFlag
  field 1179 1 "  initialDL_TransmissionPower OPTIONAL" presence
  field 1181 1 "  primaryCPICH_EcNo OPTIONAL" presence
  field 1183 1 "  sSDT_CellID OPTIONAL" presence
  field 1185 1 "  transmitDiversityIndicator OPTIONAL" presence
  field 1187 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call C_ID
  call FrameOffset
  call ChipOffset
  call DiversityControlField
  when "  initialDL_TransmissionPower OPTIONAL" call DL_Power
  when "  primaryCPICH_EcNo OPTIONAL" call PrimaryCPICH_EcNo
  when "  sSDT_CellID OPTIONAL" call SSDT_CellID
  when "  transmitDiversityIndicator OPTIONAL" call TransmitDiversityIndicator
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The TDD radio link to add, with the plain RL_ID.
rule RL_Information_RL_AdditionRqstTDD ie 113 {
  field 1194 1 "  Extension Ext" values ExtensionFlag
  field 1196 1 "  primaryCCPCH_RSCP OPTIONAL" presence
  field 1198 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call C_ID
  call FrameOffset
  call DiversityControlField
  when "  primaryCCPCH_RSCP OPTIONAL" call PrimaryCCPCH_RSCP
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ response

rule RL_InformationResponse_RL_AdditionRspTDD ie 127 {
  field 1349 1 "  Extension Ext" values ExtensionFlag
  field 1351 1 "  neighbouring_CellInformationList OPTIONAL" presence
  field 1353 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call SAI
  call UL_InterferenceList_RL_AdditionRspTDD
  call UL_CCTrCHInformationList_RL_AdditionRspTDD
  call DL_CCTrCHInformationList_RL_AdditionRspTDD
  call DiversityIndication_RL_AdditionRspTDD
  call UL_SIR
  call UL_SIR
  call MaximumAllowedULTxPower
  when "  neighbouring_CellInformationList OPTIONAL" call Neighbouring_CellInformationList_RL_AdditionRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The neighbouring RNCs of the new radio link; the count is the number of
# items as read.
family Neighbouring_CellInformationList_RL_{M} {
  member AdditionRspTDD 1411
  member AdditionRsp 1276
  member AdditionFailureFDD 1526
} {
  field ~1411 4 "  Neighbouring_CellInformationList_RL_{M} Count" keep Items
  repeat Items { call Neighbouring_CellInformationItem_RL_{M} }
}

# One FDD radio link added: its RL_ID and RL set id numbered by place.
rule RL_InformationResponseItem_RL_AdditionRspFDD ie 130 {
  field 1202 1 "  Extension Ext" values ExtensionFlag
  field 1204 1 "  secondary_CCPCH_Info OPTIONAL" presence
  field 1206 1 "  closedlooptimingadjustmentmode OPTIONAL" presence
  field 1208 1 "  neighbouring_CellInformation OPTIONAL" presence
  field 1210 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call rlCount
  call SAI
  call UL_InterferenceLevel
  when "  secondary_CCPCH_Info OPTIONAL" call Secondary_CCPCH_Info_RL_AdditionRspFDD
  call DL_CodeInformationList_RL_AdditionRspFDD
  call DiversityIndication_RL_AdditionRspFDD
  call SSDT_SupportIndicator
  call UL_SIR
  call UL_SIR
  when "  closedlooptimingadjustmentmode OPTIONAL" call Closedlooptimingadjustmentmode
  call MaximumAllowedULTxPower
  when "  neighbouring_CellInformation OPTIONAL" call Neighbouring_CellInformationList_RL_AdditionRsp
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ container lists

# Lists of containers; all of these count the containers less 1 and load
# the position counters. The list of successful radio links of the failure
# stands with its setup twin.
rule DL_DPCH_InformationList_RL_AdditionRspTDD { call ContainerList3367 }
rule RL_InformationList_RL_AdditionRqstFDD ie 124 { call ContainerList3373 }
rule RL_InformationList_RL_DeletionRqst ie 125 { call ContainerList3358 }
rule RL_InformationResponseList_RL_AdditionRspFDD ie 134 { call ContainerList3373 }
rule UL_DPCH_InformationList_RL_AdditionRspTDD { call ContainerList3367 }
rule UnsuccessfulRL_InformationResponseList_RL_AdditionFailureFDD ie 191 { call ContainerList3373 }
