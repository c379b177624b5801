# Radio link setup response and failure, FDD and TDD.
#
# The FDD items read the numbered RL, RL set and DCH fields, the TDD items the
# plain ones. A failure lists the radio links that were set up beside those
# that were not.
#
# The radio link addition, reconfiguration and physical channel
# reconfiguration have many of these shapes again: their rules are members
# of the families here.

# ------------------------------------------------------------ FDD response

rule RL_InformationResponseList_RL_SetupRspFDD ie 137 {
  call ContainerList3358
}

# Nothing follows the presence bit of the DSCH information response.
rule RL_InformationResponseItem_RL_SetupRspFDD ie 133 {
  field 855 1 "  Extension Ext" values ExtensionFlag
  field 857 1 "  secondary_CCPCH_Info OPTIONAL" presence
  field 859 1 "  closedlooptimingadjustmentmode OPTIONAL" presence
  field 861 1 "  dschInformationResponse OPTIONAL" presence
  field 863 1 "  neighbouring_CellInformation OPTIONAL" presence
  field 865 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call rlCount
  call SAI
  call UL_InterferenceLevel
  when "  secondary_CCPCH_Info OPTIONAL" call Secondary_CCPCH_Info_RL_SetupRspFDD
  call DL_CodeInformationList_RL_SetupRspFDD
  call DiversityIndication_RL_SetupRspFDD
  call SSDT_SupportIndicator
  call UL_SIR
  call UL_SIR
  when "  closedlooptimingadjustmentmode OPTIONAL" call Closedlooptimingadjustmentmode
  call MaximumAllowedULTxPower
  when "  neighbouring_CellInformation OPTIONAL" call Neighbouring_CellInformationList_RL_SetupRsp
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The secondary CCPCH of the cell, with its FACH/PCH transport channels and
# the scheduling of its system information segments.
family Secondary_CCPCH_Info_{M} {
  member RL_SetupRspFDD 872
  member RL_AdditionRspFDD 1216
  member RL_ReconfReadyFDD 1827
  member RL_ReconfRsp 2149
} {
  field ~872 1 "  Extension Ext" values ExtensionFlag
  field ~874 1 "  tFCI_Presence OPTIONAL" presence
  field ~876 1 "  iE_Extensions OPTIONAL" presence
  call FDD_S_CCPCH_Offset
  call DL_ScramblingCode
  call FDD_DL_ChannelisationCodeNumber
  call TFCS
  call SecondaryCCPCH_SlotFormat
  when "  tFCI_Presence OPTIONAL" call TFCI_Presence
  call MultiplexingPosition
  call STTD_Indicator
  call FACH_PCH_InformationList_{M}
  call SchedulingInformation_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# One to sixteen channels: the count keeps its raw value.
family FACH_PCH_InformationList_{M} {
  member RL_SetupRspFDD 880
  member RL_AdditionRspFDD 1224
  member RL_ReconfReadyFDD 1835
  member RL_ReconfRsp 2157
} {
  field ~880 4 "  FACH_PCH_InformationList_{M} Count" count Items
  repeat Items { call FACH_PCH_InformationItem_{M} }
}

family FACH_PCH_InformationItem_{M} {
  member RL_SetupRspFDD 882
  member RL_AdditionRspFDD 1226
  member RL_ReconfReadyFDD 1837
  member RL_ReconfRsp 2159
} {
  field ~882 1 "  Extension Ext" values ExtensionFlag
  field ~884 1 "  iE_Extensions OPTIONAL" presence
  call TransportFormatSet
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family SchedulingInformation_{M} {
  member RL_SetupRspFDD 887
  member RL_AdditionRspFDD 1231
  member RL_ReconfReadyFDD 1842
  member RL_ReconfRsp 2164
} {
  field ~887 1 "  Extension Ext" values ExtensionFlag
  field ~889 1 "  iE_Extensions OPTIONAL" presence
  call IB_SG_REP
  call SegmentInformationList_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# One to sixteen segments: the count keeps its raw value.
family SegmentInformationList_{M} {
  member RL_SetupRspFDD 892
  member RL_AdditionRspFDD 1236
  member RL_ReconfReadyFDD 1847
  member RL_ReconfRsp 2169
} {
  field ~892 4 "  SegmentInformationList_{M} Count" count Items
  repeat Items { call SegmentInformationItem_{M} }
}

family SegmentInformationItem_{M} {
  member RL_SetupRspFDD 894
  member RL_AdditionRspFDD 1238
  member RL_ReconfReadyFDD 1849
  member RL_ReconfRsp 2171
} {
  field ~894 1 "  Extension Ext" values ExtensionFlag
  field ~896 1 "  iE_Extensions OPTIONAL" presence
  call IB_SG_POS
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule DL_CodeInformationList_RL_SetupRspFDD {
  field 899 3 "  DL_CodeInformationList_RL_SetupRspFDD Count" count Items
  repeat Items { call DL_CodeInformationItem_RL_SetupRspFDD }
}

# ------------------------------------------------------------ FDD failure

rule SuccessfulRL_InformationResponseList_RL_SetupFailureFDD ie 162 {
  field 3370 4 " ContainerList COUNT" keep $ContainerListCount
  repeat $ContainerListCount { call Container }
}

# A radio link that was set up or added beside those that failed.
family SuccessfulRL_InformationResponse_{M} {
  member RL_SetupFailureFDD 1059 ie 160
  member RL_AdditionFailureFDD 1485 ie 159
} {
  field ~1059 1 "  Extension Ext" values ExtensionFlag
  field ~1061 1 "  neighbouring_CellInformationList OPTIONAL" presence
  field ~1063 1 "  iE_Extensions OPTIONAL" presence
  call rLCount_SuccSetupRL_ID
  call rLCount_SuccSetupRL_Set_ID
  call SAI
  call UL_InterferenceLevel
  call DL_CodeInformationList_{M}
  call DiversityIndication_{M}
  call SSDT_SupportIndicator
  call UL_SIR
  call UL_SIR
  call MaximumAllowedULTxPower
  when "  neighbouring_CellInformationList OPTIONAL" call Neighbouring_CellInformationList_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family DL_CodeInformationListIE_{M} {
  member RL_SetupFailureFDD 1067 ie 58
  member RL_AdditionFailureFDD 1493 ie 55
  member RL_AdditionRspFDD 1243 ie 56
  member PhyChReconfRqstFDD 2238 ie 54
} {
  field ~1067 3 "  DL_CodeInformationListIE_{M} Count" count Items
  repeat Items { call DL_CodeInformationItem_{M} }
}

rule UnsuccessfulRL_InformationResponseList_RL_SetupFailureFDD ie 192 {
  call ContainerList3358
}

family UnsuccessfulRL_InformationResponse_{M} {
  member RL_SetupFailureFDD 1054 ie 189
  member RL_AdditionFailureFDD 1480 ie 188
} {
  field ~1054 1 "  Extension Ext" values ExtensionFlag
  field ~1056 1 "  iE_Extensions OPTIONAL" presence
  call rLCount_UnSuccSetupRL_ID
  call Cause
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ FDD, both outcomes

# The downlink channelisation codes of a radio link.
family DL_CodeInformationItem_{M} {
  member RL_SetupFailureFDD 1069
  member RL_SetupRspFDD 901
  member RL_AdditionFailureFDD 1495
  member RL_AdditionRspFDD 1245
  member RL_ReconfReadyFDD 1856
  member PhyChReconfRqstFDD 2240
} {
  field ~1069 1 "  Extension Ext" values ExtensionFlag
  field ~1071 1 "  iE_Extensions OPTIONAL" presence
  call DL_ScramblingCode
  call FDD_DL_ChannelisationCodeNumber
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Diversity indication: the radio link is combined with an existing one (the
# IE names that one), or not combined and its DCHs are answered.
family DiversityIndicationItem_{M} {
  member RL_SetupFailureFDD 1074 ie 78
  member RL_SetupRspFDD 906 ie 79
} {
  field ~1074 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field ~1077 1 "  DiversityIndicationItem_{M} Index" values { 0 "combining" 1 "nonCombiningOrIEnotPresent" } keep Index
    if Index == 0 {
      call Combining_{M}
    }
    if Index == 1 {
      call NonCombiningOrIEnotPresen_{M}
    }
  }
}

rule DiversityIndication_RL_SetupFailureFDD { call protocolIEs }
rule DiversityIndication_RL_SetupRspFDD { call protocolIEs }
rule DL_CodeInformationList_RL_SetupFailureFDD { call protocolIEs }
rule Combining_RL_SetupFailureFDD { call protocolIEs }
rule Combining_RL_SetupRspFDD { call protocolIEs }
rule NonCombiningOrIEnotPresen_RL_SetupFailureFDD { call protocolIEs }
rule NonCombiningOrIEnotPresen_RL_SetupRspFDD { call protocolIEs }

# The radio link of a combining item, of a deletion request or of a restore
# indication: nothing but its numbered RL_ID.
family {M} {
  member CombiningItem_RL_SetupFailureFDD 1080 ie 18
  member CombiningItem_RL_SetupRspFDD 912 ie 19
  member CombiningItem_RL_AdditionFailureFDD 1506 ie 15
  member CombiningItem_RL_AdditionRspFDD 1256 ie 16
  member RL_Information_RL_DeletionRqst 1600 ie 114
  member RL_Information_RL_RestoreInd 2218 ie 117
} {
  field ~1080 1 "  Extension Ext" values ExtensionFlag
  field ~1082 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule NonCombiningOrIEnotPresenItem_RL_SetupFailureFDD ie 100 {
  field 1085 1 "  Extension Ext" values ExtensionFlag
  field 1087 1 "  dCH_InformationResponse_RL_SetupFailureFDD OPTIONAL" presence
  field 1089 1 "  iE_Extensions OPTIONAL" presence
  when "  dCH_InformationResponse_RL_SetupFailureFDD OPTIONAL" call DCH_InformationResponseList_RL_SetupFailureFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule NonCombiningOrIEnotPresenItem_RL_SetupRspFDD ie 101 {
  field 917 1 "  Extension Ext" values ExtensionFlag
  field 919 1 "  iE_Extensions OPTIONAL" presence
  call DCH_InformationResponseList_RL_SetupRspFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The transport bearers of the DCHs. Each list loads the position counters
# of the numbered DCH id, binding id and transport layer address with its
# count.
rule DCH_InformationResponseList_RL_SetupFailureFDD {
  field 1093 8 "  DCH_InformationResponseList_RL_SetupFailureFDD Count" keep Items
  set $DchIdPosition = Items
  set $BindingIdPosition = Items
  set $TransportLayerAddressPosition = Items
  repeat Items { call DCH_InformationResponseItem_RL_SetupFailureFDD }
}

# The TDD list of the addition loads no counter: its items read the plain
# fields.
family DCH_InformationResponseList_{M} {
  member RL_SetupRspFDD 922
  member RL_AdditionFailureFDD 1516
  member RL_AdditionRspFDD 1266
  member RL_AdditionRspTDD 1404
} {
  field ~922 7 "  DCH_InformationResponseList_{M} Count" count Items
  only RL_SetupRspFDD RL_AdditionFailureFDD RL_AdditionRspFDD {
    set $DchIdPosition = Items
    set $BindingIdPosition = Items
    set $TransportLayerAddressPosition = Items
  }
  repeat Items { call DCH_InformationResponseItem_{M} }
}

family {M} {
  member DCH_InformationResponseItem_RL_SetupFailureFDD 1098
  member DCH_InformationResponseItem_RL_SetupRspFDD 927
  member DCH_InformationResponseItem_RL_AdditionFailureFDD 1521
  member DCH_InformationResponseItem_RL_AdditionRspFDD 1271
  member DCH_AddItem_RL_ReconfReadyFDD 1866
  member DCH_ModifyItem_RL_ReconfReadyFDD 1876
  member DCH_AddItem_RL_ReconfRsp 2181
  member DCH_ModifyItem_RL_ReconfRsp 2191
} {
  field ~1098 1 "  Extension Ext" values ExtensionFlag
  field ~1100 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID_Numbered
  call BindingID_Numbered
  call TransportLayerAddress_Numbered
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ TDD response

rule RL_InformationResponse_RL_SetupRspTDD ie 129 {
  field 1008 1 "  Extension Ext" values ExtensionFlag
  field 1010 1 "  neighbouring_CellInformationList OPTIONAL" presence
  field 1012 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call SAI
  call UL_InterferenceList_RL_SetupRspTDD
  call UL_SIR
  call UL_SIR
  call MaximumAllowedULTxPower
  call UL_CCTrCHInformationList_RL_SetupRspTDD
  call DL_CCTrCHInformationList_RL_SetupRspTDD
  call DCH_InformationResponseList_RL_SetupRspTDD
  when "  neighbouring_CellInformationList OPTIONAL" call Neighbouring_CellInformationList_RL_SetupRsp
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family UL_InterferenceList_{M} {
  member RL_SetupRspTDD 1016
  member RL_AdditionRspTDD 1357
} {
  field ~1016 4 "  UL_InterferenceList_{M} Count" count Items
  repeat Items { call UL_InterferenceItem_{M} }
}

family UL_InterferenceItem_{M} {
  member RL_SetupRspTDD 1018
  member RL_AdditionRspTDD 1359
} {
  field ~1018 1 "  Extension Ext" values ExtensionFlag
  field ~1020 1 "  iE_Extensions OPTIONAL" presence
  call TimeSlot
  call UL_InterferenceLevel
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_CCTrCHInformationList_RL_SetupRspTDD { call protocolIEs }
rule DL_CCTrCHInformationList_RL_SetupRspTDD { call protocolIEs }
rule DCH_InformationResponseList_RL_SetupRspTDD { call protocolIEs }

# The coded composite transport channels and their dedicated physical
# channels.
family {M}_CCTrCHInformationListIE_RL_SetupRspTDD {
  member UL 1023 ie 176
  member DL 1035 ie 50
} {
  field ~1023 4 "  {M}_CCTrCHInformationListIE_RL_SetupRspTDD Count" count Items
  repeat Items { call {M}_CCTrCHInformationItem_RL_SetupRspTDD }
}

family {M}_CCTrCHInformationItem_RL_SetupRspTDD {
  member UL 1025
  member DL 1037
} {
  field ~1025 1 "  Extension Ext" values ExtensionFlag
  field ~1027 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call {M}_DPCH_InformationList_RL_SetupRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_DPCH_InformationList_RL_SetupRspTDD {
  call ContainerList3367
}

rule DL_DPCH_InformationList_RL_SetupRspTDD {
  call ContainerList3367
}

# The uplink and the downlink DPCH of the setup and the addition response.
family {M} {
  member DL_DPCH_InformationItem_RL_SetupRspTDD 1042 ie 64
  member UL_DPCH_InformationItem_RL_SetupRspTDD 1030 ie 182
  member DL_DPCH_InformationItem_RL_AdditionRspTDD 1383 ie 63
  member UL_DPCH_InformationItem_RL_AdditionRspTDD 1371 ie 181
} {
  field ~1042 1 "  Extension Ext" values ExtensionFlag
  field ~1044 1 "  iE_Extensions OPTIONAL" presence
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

rule DCH_InformationResponseListIE_RL_SetupRspTDD ie 43 {
  field 1047 7 "  DCH_InformationResponseListIE_RL_SetupRspTDD Count" count Items
  repeat Items { call DCH_InformationResponseItem_RL_SetupRspTDD }
}

# A TDD DCH with the binding and the transport layer address of its bearer.
family {M} {
  member DCH_InformationResponseItem_RL_SetupRspTDD 1049
  member DCH_InformationResponseItem_RL_AdditionRspTDD 1406
  member DCH_AddItem_RL_ReconfReadyTDD 1982
  member DCH_ModifyItem_RL_ReconfReadyTDD 1989
} {
  field ~1049 1 "  Extension Ext" values ExtensionFlag
  field ~1051 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID
  call BindingID
  call TransportLayerAddress
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ TDD failure

# The TDD failure and the unsuffixed IE 187 read the plain RL id.
family UnsuccessfulRL_InformationResponse{M} {
  member "" 1595 ie 187
  member _RL_SetupFailureTDD 1172 ie 190
} {
  field ~1595 1 "  Extension Ext" values ExtensionFlag
  field ~1597 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call Cause
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ neighbouring cells

# The neighbouring RNCs and their cells, one protocol IE container per RNC.
family Neighbouring_CellInformationList_{M} {
  member RL_SetupRsp 932
  member RL_SetupFailureFDD 1103
} {
  field ~932 4 "  Neighbouring_CellInformationList_{M} Count" keep Items
  repeat Items { call protocolIEs }
}

family Neighbouring_CellInformationItem_{M} {
  member RL_SetupFailureFDD 1105 ie 95
  member RL_SetupRsp 934 ie 96
  member RL_AdditionRspTDD 1413
  member RL_AdditionRsp 1278
  member RL_AdditionFailureFDD 1528
} {
  field ~1105 1 "  Extension Ext" values ExtensionFlag
  field ~1107 1 "  cN_PS_DomainIdentifier OPTIONAL" presence
  field ~1109 1 "  cN_CS_DomainIdentifier OPTIONAL" presence
  field ~1111 1 "  per_FDD_Cell_InformationList OPTIONAL" presence
  field ~1113 1 "  per_TDD_Cell_InformationList OPTIONAL" presence
  field ~1115 1 "  iE_Extensions OPTIONAL" presence
  call RNC_ID
  when "  cN_PS_DomainIdentifier OPTIONAL" call CN_PS_DomainIdentifier
  when "  cN_CS_DomainIdentifier OPTIONAL" call CN_CS_DomainIdentifier
  when "  per_FDD_Cell_InformationList OPTIONAL" call Per_FDD_Cell_InformationList_{M}
  when "  per_TDD_Cell_InformationList OPTIONAL" call Per_TDD_Cell_InformationList_{M}
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The cell lists count their cells less 1, behind an alignment; the FDD list
# of the FDD response has an extension bit in front.
family Per_FDD_Cell_InformationList_{M} {
  member RL_SetupFailureFDD 1122
  member RL_AdditionRspTDD 1430
  member RL_AdditionFailureFDD 1545
} {
  align
  field ~1122 8 "  Per_FDD_Cell_InformationList_{M} Length" count Items
  repeat Items { call Per_FDD_Cell_InformationItem_{M} }
}

family Per_FDD_Cell_InformationList_{M} {
  member RL_SetupRsp 951
  member RL_AdditionRsp 1295
} {
  field ~951 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    align
    field ~954 8 "  Per_FDD_Cell_InformationList_{M} Length" count Items
    repeat Items { call Per_FDD_Cell_InformationItem_{M} }
  }
}

family Per_TDD_Cell_InformationList_{M} {
  member RL_SetupFailureFDD 1150
  member RL_SetupRsp 983
  member RL_AdditionRspTDD 1458
  member RL_AdditionRsp 1327
  member RL_AdditionFailureFDD 1573
} {
  align
  field ~1150 8 "  Per_TDD_Cell_InformationList_{M} Length" count Items
  repeat Items { call Per_TDD_Cell_InformationItem_{M} }
}

family Per_FDD_Cell_InformationItem_{M} {
  member RL_SetupFailureFDD 1124
  member RL_SetupRsp 957
  member RL_AdditionRspTDD 1432
  member RL_AdditionRsp 1301
  member RL_AdditionFailureFDD 1547
} {
  field ~1124 1 "  Extension Ext" values ExtensionFlag
  field ~1126 1 "  frameOffset OPTIONAL" presence
  field ~1128 1 "  primaryCPICH_Power OPTIONAL" presence
  field ~1130 1 "  cellIndividualOffset OPTIONAL" presence
  field ~1132 1 "  txDiversityIndicator OPTIONAL" presence
  field ~1134 1 "  sTTD_SupportIndicator OPTIONAL" presence
  field ~1136 1 "  closedLoopMode1_SupportIndicator OPTIONAL" presence
  field ~1138 1 "  closedLoopMode2_SupportIndicator OPTIONAL" presence
  field ~1140 1 "  iE_Extensions OPTIONAL" presence
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

# The TDD cell of the setup failure and of the addition always carries its
# PCCPCH power; that of the setup response marks it optional.
family Per_TDD_Cell_InformationItem_{M} {
  member RL_SetupFailureFDD 1152
  member RL_AdditionRspTDD 1460
  member RL_AdditionRsp 1329
  member RL_AdditionFailureFDD 1575
} {
  field ~1152 1 "  Extension Ext" values ExtensionFlag
  field ~1154 1 "  frameOffset OPTIONAL" presence
  field ~1156 1 "  timeSlot OPTIONAL" presence
  field ~1158 1 "  sCH_TimeSlot OPTIONAL" presence
  field ~1160 1 "  cellIndividualOffset OPTIONAL" presence
  field ~1162 1 "  dPCHConstantValue OPTIONAL" presence
  field ~1164 1 "  iE_Extensions OPTIONAL" presence
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

rule Per_TDD_Cell_InformationItem_RL_SetupRsp {
  field 985 1 "  Extension Ext" values ExtensionFlag
  field 987 1 "  frameOffset OPTIONAL" presence
  field 989 1 "  timeSlot OPTIONAL" presence
  field 991 1 "  sCH_TimeSlot OPTIONAL" presence
  field 993 1 "  cellIndividualOffset OPTIONAL" presence
  field 995 1 "  dPCHConstantValue OPTIONAL" presence
  field 997 1 "  pCCPCH_Power OPTIONAL" presence
  field 999 1 "  iE_Extensions OPTIONAL" presence
  call C_ID
  call UARFCN
  when "  frameOffset OPTIONAL" call FrameOffset
  call CellParameterID
  call SyncCase
  when "  timeSlot OPTIONAL" call TimeSlot
  when "  sCH_TimeSlot OPTIONAL" call SCH_TimeSlot
  when "  cellIndividualOffset OPTIONAL" call CellIndividualOffset
  when "  dPCHConstantValue OPTIONAL" call DPCHConstantValue
  when "  pCCPCH_Power OPTIONAL" call PCCPCH_Power
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
