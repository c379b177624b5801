# The radio link addition request, response and failure, FDD and TDD, and
# the radio link deletion request. Most IEs have the shapes of the setup
# response and failure and are members of those families, in
# setup_response.rg. The FDD items read the numbered RL, RL set and DCH
# fields, the TDD items the plain ones.

# ------------------------------------------------------------------ request

# The FDD radio link to add.
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

# The TDD radio link to add.
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

# ------------------------------------------------------------------ container lists

# The lists of radio links, physical channels and outcomes hold one
# container per item. All but the list of successful radio links count the
# containers less 1 and load the position counters; that one counts them as
# they are and loads nothing.
rule RL_InformationList_RL_AdditionRqstFDD ie 124 { call ContainerList3373 }
rule RL_InformationList_RL_DeletionRqst ie 125 { call ContainerList3358 }
rule RL_InformationResponseList_RL_AdditionRspFDD ie 134 { call ContainerList3373 }
rule DL_DPCH_InformationList_RL_AdditionRspTDD { call ContainerList3367 }
rule UL_DPCH_InformationList_RL_AdditionRspTDD { call ContainerList3367 }
rule UnsuccessfulRL_InformationResponseList_RL_AdditionFailureFDD ie 191 { call ContainerList3373 }

rule SuccessfulRL_InformationResponseList_RL_AdditionFailureFDD ie 161 {
  field 3376 4 " ContainerList COUNT" keep $ContainerListCount
  repeat $ContainerListCount { call Container }
}

# ------------------------------------------------------------------ FDD response

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

# ------------------------------------------------------------------ diversity indication

# Whether the new radio link is combined with an existing one (the IE names
# that one) or not (its DCHs are answered). Each choice is an IE container.
family DiversityIndicationItem_RL_{M} {
  member AdditionFailureFDD 1500 ie 75
  member AdditionRspFDD 1250 ie 76
  member AdditionRspTDD 1388 ie 77
} {
  field ~1500 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field ~1503 1 "  DiversityIndicationItem_RL_{M} Index" values { 0 "combining" 1 "nonCombining" } keep Index
    if Index == 0 {
      call Combining_RL_{M}
    }
    if Index == 1 {
      call NonCombining_RL_{M}
    }
  }
}

# The TDD combining item reads the plain RL_ID.
rule CombiningItem_RL_AdditionRspTDD ie 17 {
  field 1394 1 "  Extension Ext" values ExtensionFlag
  field 1396 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# A radio link that is not combined: the transport bearers of its DCHs. The
# shape of the setup response's NonCombiningOrIEnotPresen item.
family NonCombiningItem_RL_{M} {
  member AdditionFailureFDD 1511 ie 97
  member AdditionRspFDD 1261 ie 98
  member AdditionRspTDD 1399 ie 99
} {
  field ~1511 1 "  Extension Ext" values ExtensionFlag
  field ~1513 1 "  iE_Extensions OPTIONAL" presence
  call DCH_InformationResponseList_RL_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The IE containers behind the choices and lists above.
rule Combining_RL_AdditionFailureFDD { call protocolIEs }
rule NonCombining_RL_AdditionFailureFDD { call protocolIEs }
rule Combining_RL_AdditionRspFDD { call protocolIEs }
rule NonCombining_RL_AdditionRspFDD { call protocolIEs }
rule Combining_RL_AdditionRspTDD { call protocolIEs }
rule NonCombining_RL_AdditionRspTDD { call protocolIEs }
rule DiversityIndication_RL_AdditionFailureFDD { call protocolIEs }
rule DiversityIndication_RL_AdditionRspFDD { call protocolIEs }
rule DiversityIndication_RL_AdditionRspTDD { call protocolIEs }
rule DL_CodeInformationList_RL_AdditionFailureFDD { call protocolIEs }
rule DL_CodeInformationList_RL_AdditionRspFDD { call protocolIEs }
rule UL_CCTrCHInformationList_RL_AdditionRspTDD { call protocolIEs }
rule DL_CCTrCHInformationList_RL_AdditionRspTDD { call protocolIEs }

# ------------------------------------------------------------------ TDD response

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

# The coded composite transport channels and their dedicated physical
# channels, in the shape of the setup response's.
family {M}_CCTrCHInformationListIE_RL_AdditionRspTDD {
  member UL 1364 ie 174
  member DL 1376 ie 49
} {
  field ~1364 4 "  {M}_CCTrCHInformationListIE_RL_AdditionRspTDD Count" count Items
  repeat Items { call {M}_CCTrCHInformationItem_RL_AdditionRspTDD }
}

family {M}_CCTrCHInformationItem_RL_AdditionRspTDD {
  member UL 1366
  member DL 1378
} {
  field ~1366 1 "  Extension Ext" values ExtensionFlag
  field ~1368 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call {M}_DPCH_InformationList_RL_AdditionRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ neighbouring cells

# The neighbouring RNCs of the new radio link, counted as they are.
family Neighbouring_CellInformationList_RL_{M} {
  member AdditionRspTDD 1411
  member AdditionRsp 1276
  member AdditionFailureFDD 1526
} {
  field ~1411 4 "  Neighbouring_CellInformationList_RL_{M} Count" keep Items
  repeat Items { call Neighbouring_CellInformationItem_RL_{M} }
}
