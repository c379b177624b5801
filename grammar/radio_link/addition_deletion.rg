# The radio link addition request, response and failure, FDD and TDD, and
# the radio link deletion request. Most IEs have the shapes of the setup
# response and failure, with ids of their own. The FDD items read the
# numbered RL, RL set and DCH fields, the TDD items the plain ones.

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

# The radio link of a deletion request or of a combining item: nothing but
# its numbered RL_ID.
family {M} {
  member CombiningItem_RL_AdditionFailureFDD 1506 ie 15
  member CombiningItem_RL_AdditionRspFDD 1256 ie 16
  member RL_Information_RL_DeletionRqst 1600 ie 114
} {
  field ~1506 1 "  Extension Ext" values ExtensionFlag
  field ~1508 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  iE_Extensions OPTIONAL" call iE_Extensions
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

# The secondary CCPCH of the cell, with its FACH/PCH transport channels and
# the scheduling of its system information segments.
rule Secondary_CCPCH_Info_RL_AdditionRspFDD {
  field 1216 1 "  Extension Ext" values ExtensionFlag
  field 1218 1 "  tFCI_Presence OPTIONAL" presence
  field 1220 1 "  iE_Extensions OPTIONAL" presence
  call FDD_S_CCPCH_Offset
  call DL_ScramblingCode
  call FDD_DL_ChannelisationCodeNumber
  call TFCS
  call SecondaryCCPCH_SlotFormat
  when "  tFCI_Presence OPTIONAL" call TFCI_Presence
  call MultiplexingPosition
  call STTD_Indicator
  call FACH_PCH_InformationList_RL_AdditionRspFDD
  call SchedulingInformation_RL_AdditionRspFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule FACH_PCH_InformationList_RL_AdditionRspFDD {
  field 1224 4 "  FACH_PCH_InformationList_RL_AdditionRspFDD Count" count Items
  repeat Items { call FACH_PCH_InformationItem_RL_AdditionRspFDD }
}

rule FACH_PCH_InformationItem_RL_AdditionRspFDD {
  field 1226 1 "  Extension Ext" values ExtensionFlag
  field 1228 1 "  iE_Extensions OPTIONAL" presence
  call TransportFormatSet
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule SchedulingInformation_RL_AdditionRspFDD {
  field 1231 1 "  Extension Ext" values ExtensionFlag
  field 1233 1 "  iE_Extensions OPTIONAL" presence
  call IB_SG_REP
  call SegmentInformationList_RL_AdditionRspFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule SegmentInformationList_RL_AdditionRspFDD {
  field 1236 4 "  SegmentInformationList_RL_AdditionRspFDD Count" count Items
  repeat Items { call SegmentInformationItem_RL_AdditionRspFDD }
}

rule SegmentInformationItem_RL_AdditionRspFDD {
  field 1238 1 "  Extension Ext" values ExtensionFlag
  field 1240 1 "  iE_Extensions OPTIONAL" presence
  call IB_SG_POS
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ FDD failure

rule SuccessfulRL_InformationResponse_RL_AdditionFailureFDD ie 159 {
  field 1485 1 "  Extension Ext" values ExtensionFlag
  field 1487 1 "  neighbouring_CellInformationList OPTIONAL" presence
  field 1489 1 "  iE_Extensions OPTIONAL" presence
  call rLCount_SuccSetupRL_ID
  call rLCount_SuccSetupRL_Set_ID
  call SAI
  call UL_InterferenceLevel
  call DL_CodeInformationList_RL_AdditionFailureFDD
  call DiversityIndication_RL_AdditionFailureFDD
  call SSDT_SupportIndicator
  call UL_SIR
  call UL_SIR
  call MaximumAllowedULTxPower
  when "  neighbouring_CellInformationList OPTIONAL" call Neighbouring_CellInformationList_RL_AdditionFailureFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UnsuccessfulRL_InformationResponse_RL_AdditionFailureFDD ie 188 {
  field 1480 1 "  Extension Ext" values ExtensionFlag
  field 1482 1 "  iE_Extensions OPTIONAL" presence
  call rLCount_UnSuccSetupRL_ID
  call Cause
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ FDD downlink codes

family DL_CodeInformationListIE_RL_{M} {
  member AdditionFailureFDD 1493 ie 55
  member AdditionRspFDD 1243 ie 56
} {
  field ~1493 3 "  DL_CodeInformationListIE_RL_{M} Count" count Items
  repeat Items { call DL_CodeInformationItem_RL_{M} }
}

family DL_CodeInformationItem_RL_{M} {
  member AdditionFailureFDD 1495
  member AdditionRspFDD 1245
} {
  field ~1495 1 "  Extension Ext" values ExtensionFlag
  field ~1497 1 "  iE_Extensions OPTIONAL" presence
  call DL_ScramblingCode
  call FDD_DL_ChannelisationCodeNumber
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
    } else if Index == 1 {
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

# A radio link that is not combined: the transport bearers of its DCHs.
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

# The FDD lists load the position counters of the numbered DCH id, binding
# id and transport layer address with their count; the TDD list reads the
# plain fields.
family DCH_InformationResponseList_RL_{M} {
  member AdditionFailureFDD 1516
  member AdditionRspFDD 1266
  member AdditionRspTDD 1404
} {
  field ~1516 7 "  DCH_InformationResponseList_RL_{M} Count" count Items
  only AdditionFailureFDD AdditionRspFDD {
    set $DchIdPosition = Items
    set $BindingIdPosition = Items
    set $TransportLayerAddressPosition = Items
  }
  repeat Items { call DCH_InformationResponseItem_RL_{M} }
}

family DCH_InformationResponseItem_RL_{M} {
  member AdditionFailureFDD 1521
  member AdditionRspFDD 1271
} {
  field ~1521 1 "  Extension Ext" values ExtensionFlag
  field ~1523 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID_Numbered
  call BindingID_Numbered
  call TransportLayerAddress_Numbered
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule DCH_InformationResponseItem_RL_AdditionRspTDD {
  field 1406 1 "  Extension Ext" values ExtensionFlag
  field 1408 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID
  call BindingID
  call TransportLayerAddress
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

rule UL_InterferenceList_RL_AdditionRspTDD {
  field 1357 4 "  UL_InterferenceList_RL_AdditionRspTDD Count" count Items
  repeat Items { call UL_InterferenceItem_RL_AdditionRspTDD }
}

rule UL_InterferenceItem_RL_AdditionRspTDD {
  field 1359 1 "  Extension Ext" values ExtensionFlag
  field 1361 1 "  iE_Extensions OPTIONAL" presence
  call TimeSlot
  call UL_InterferenceLevel
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The coded composite transport channels and their dedicated physical
# channels.
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

family {M}_DPCH_InformationItem_RL_AdditionRspTDD {
  member UL 1371 ie 181
  member DL 1383 ie 63
} {
  field ~1371 1 "  Extension Ext" values ExtensionFlag
  field ~1373 1 "  iE_Extensions OPTIONAL" presence
  call DPCH_ID
  call TDD_ChannelisationCode
  call BurstType
  call MidambleShift
  call TimeSlot
  call TDD_PhysicalChannelOffset
  call RepetitionPeriod
  call RepetitionLength
  call TFCI_Presence
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

family Neighbouring_CellInformationItem_RL_{M} {
  member AdditionRspTDD 1413
  member AdditionRsp 1278
  member AdditionFailureFDD 1528
} {
  field ~1413 1 "  Extension Ext" values ExtensionFlag
  field ~1415 1 "  cN_PS_DomainIdentifier OPTIONAL" presence
  field ~1417 1 "  cN_CS_DomainIdentifier OPTIONAL" presence
  field ~1419 1 "  per_FDD_Cell_InformationList OPTIONAL" presence
  field ~1421 1 "  per_TDD_Cell_InformationList OPTIONAL" presence
  field ~1423 1 "  iE_Extensions OPTIONAL" presence
  call RNC_ID
  when "  cN_PS_DomainIdentifier OPTIONAL" call CN_PS_DomainIdentifier
  when "  cN_CS_DomainIdentifier OPTIONAL" call CN_CS_DomainIdentifier
  when "  per_FDD_Cell_InformationList OPTIONAL" call Per_FDD_Cell_InformationList_RL_{M}
  when "  per_TDD_Cell_InformationList OPTIONAL" call Per_TDD_Cell_InformationList_RL_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The cell lists count their cells less 1, behind an alignment; the FDD list
# of the FDD response has an extension bit in front.
family Per_FDD_Cell_InformationList_RL_{M} {
  member AdditionRspTDD 1430
  member AdditionFailureFDD 1545
} {
  align
  field ~1430 8 "  Per_FDD_Cell_InformationList_RL_{M} Length" count Items
  repeat Items { call Per_FDD_Cell_InformationItem_RL_{M} }
}

rule Per_FDD_Cell_InformationList_RL_AdditionRsp {
  field 1295 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    align
    field 1298 8 "  Per_FDD_Cell_InformationList_RL_AdditionRsp Length" count Items
    repeat Items { call Per_FDD_Cell_InformationItem_RL_AdditionRsp }
  }
}

family Per_TDD_Cell_InformationList_RL_{M} {
  member AdditionRspTDD 1458
  member AdditionRsp 1327
  member AdditionFailureFDD 1573
} {
  align
  field ~1458 8 "  Per_TDD_Cell_InformationList_RL_{M} Length" count Items
  repeat Items { call Per_TDD_Cell_InformationItem_RL_{M} }
}

family Per_FDD_Cell_InformationItem_RL_{M} {
  member AdditionRspTDD 1432
  member AdditionRsp 1301
  member AdditionFailureFDD 1547
} {
  field ~1432 1 "  Extension Ext" values ExtensionFlag
  field ~1434 1 "  frameOffset OPTIONAL" presence
  field ~1436 1 "  primaryCPICH_Power OPTIONAL" presence
  field ~1438 1 "  cellIndividualOffset OPTIONAL" presence
  field ~1440 1 "  txDiversityIndicator OPTIONAL" presence
  field ~1442 1 "  sTTD_SupportIndicator OPTIONAL" presence
  field ~1444 1 "  closedLoopMode1_SupportIndicator OPTIONAL" presence
  field ~1446 1 "  closedLoopMode2_SupportIndicator OPTIONAL" presence
  field ~1448 1 "  iE_Extensions OPTIONAL" presence
  call C_ID
  call UARFCN
  call UARFCN
  when "  frameOffset OPTIONAL" call FrameOffset
  call PrimaryScramblingCode
  when "  primaryCPICH_Power OPTIONAL" call PrimaryCPICH_Power
  when "  cellIndividualOffset OPTIONAL" call CellIndividualOffset
  when "  txDiversityIndicator OPTIONAL" call TxDiversityIndicator
  when "  sTTD_SupportIndicator OPTIONAL" call STTD_SupportIndicator
  when "  closedLoopMode1_SupportIndicator OPTIONAL" call ClosedLoopMode1_SupportIndicator
  when "  closedLoopMode2_SupportIndicator OPTIONAL" call ClosedLoopMode2_SupportIndicator
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Every TDD cell of the addition carries its PCCPCH power.
family Per_TDD_Cell_InformationItem_RL_{M} {
  member AdditionRspTDD 1460
  member AdditionRsp 1329
  member AdditionFailureFDD 1575
} {
  field ~1460 1 "  Extension Ext" values ExtensionFlag
  field ~1462 1 "  frameOffset OPTIONAL" presence
  field ~1464 1 "  timeSlot OPTIONAL" presence
  field ~1466 1 "  sCH_TimeSlot OPTIONAL" presence
  field ~1468 1 "  cellIndividualOffset OPTIONAL" presence
  field ~1470 1 "  dPCHConstantValue OPTIONAL" presence
  field ~1472 1 "  iE_Extensions OPTIONAL" presence
  call C_ID
  call UARFCN
  when "  frameOffset OPTIONAL" call FrameOffset
  call CellParameterID
  call SyncCase
  when "  timeSlot OPTIONAL" call TimeSlot
  when "  sCH_TimeSlot OPTIONAL" call SCH_TimeSlot
  when "  cellIndividualOffset OPTIONAL" call CellIndividualOffset
  when "  dPCHConstantValue OPTIONAL" call DPCHConstantValue
  call PCCPCH_Power
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
