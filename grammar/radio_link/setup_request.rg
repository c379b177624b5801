# The radio link setup request, FDD and TDD. The message is a plain IE list:
# every rule here is reached through its IE id, and the list rules are
# containers whose items run the IE dispatch again.

# ------------------------------------------------------------------ DCHs

# Both DCH lists count their items less 1, in 7 bits.
family DCH_InformationList_RL_SetupRqst{M} {
  member FDD 781 ie 34
  member TDD 837 ie 35
} {
  field ~781 7 "  DCH_InformationList_RL_SetupRqst{M} Count" count Items
  repeat Items { call DCH_InformationItem_RL_SetupRqst{M} }
}

# One DCH to set up (or to add, in the reconfiguration preparation). The
# uplink transport format set and BLER come first, then the downlink ones.
# The FDD item numbers its DCH_ID by place.
family DCH_{M} {
  member InformationItem_RL_SetupRqstFDD 783
  member AddItem_RL_ReconfPrepFDD 1696
} {
  field ~783 1 "  Extension Ext" values ExtensionFlag
  field ~785 1 "  dCH_CombinationInd OPTIONAL" presence
  field ~787 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID_Numbered
  when "  dCH_CombinationInd OPTIONAL" call DCH_CombinationInd
  call TrCH_SrcStatisticsDescr
  call TransportFormatSet
  call TransportFormatSet
  call BLER
  call BLER
  call AllocationRetentionPriority
  call FrameHandlingPriority
  call PayloadCRC_PresenceIndicator
  call UL_FP_Mode
  call QE_Selector
  call ToAWS
  call ToAWE
  call DRACControl
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The TDD item names the uplink and the downlink CCTrCH of the DCH.
family DCH_{M} {
  member InformationItem_RL_SetupRqstTDD 839
  member AddItem_RL_ReconfPrepTDD 1786
} {
  field ~839 1 "  Extension Ext" values ExtensionFlag
  field ~841 1 "  dCH_CombinationInd OPTIONAL" presence
  field ~843 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID
  call CCTrCH_ID
  call CCTrCH_ID
  when "  dCH_CombinationInd OPTIONAL" call DCH_CombinationInd
  call LimitedPowerIncrease
  call TrCH_SrcStatisticsDescr
  call TransportFormatSet
  call TransportFormatSet
  call BLER
  call BLER
  call AllocationRetentionPriority
  call FrameHandlingPriority
  call PayloadCRC_PresenceIndicator
  call UL_FP_Mode
  call ToAWS
  call ToAWE
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ TDD CCTrCHs

# One coded composite transport channel; only the downlink one carries a
# power control step size.
rule DL_CCTrCH_InformationItem_RL_SetupRqstTDD ie 47 {
  field 832 1 "  Extension Ext" values ExtensionFlag
  field 834 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call TFCS
  call TFCI_Coding
  call PunctureLimit
  call TDD_TPC_DownlinkStepSize
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_CCTrCH_InformationItem_RL_SetupRqstTDD ie 171 {
  field 827 1 "  Extension Ext" values ExtensionFlag
  field 829 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call TFCS
  call TFCI_Coding
  call PunctureLimit
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ container lists

# Lists of containers, by the form of their count: 3358, 3364, 3367 and 3373
# count the containers less 1, 3382 as they are. Each container holds IEs of
# the list's items.
rule DL_CCTrCH_InformationList_RL_SetupRqstTDD ie 53 { call ContainerList3364 }
rule RL_InformationList_RL_SetupRqstFDD ie 118 { call ContainerList3358 }
rule UL_CCTrCH_InformationList_RL_SetupRqstTDD ie 172 { call ContainerList3364 }

# The same lists in the setup response and failure.
rule DL_DPCH_InformationList_RL_SetupRspTDD { call ContainerList3367 }
rule RL_InformationResponseList_RL_SetupRspFDD ie 137 { call ContainerList3358 }
rule UL_DPCH_InformationList_RL_SetupRspTDD { call ContainerList3367 }
rule UnsuccessfulRL_InformationResponseList_RL_SetupFailureFDD ie 192 { call ContainerList3358 }

# The same lists in the reconfiguration.
rule DL_CCTrCH_InformationList_RL_ReconfPrepTDD ie 51 { call ContainerList3382 }
rule DL_CCTrCH_InformationList_RL_ReconfRqstTDD ie 52 { call ContainerList3382 }
rule UL_CCTrCH_InformationList_RL_ReconfPrepTDD ie 169 { call ContainerList3382 }
rule UL_CCTrCH_InformationList_RL_ReconfRqstTDD ie 170 { call ContainerList3382 }

# The same lists in the physical channel reconfiguration and the RL
# failure and restore indications.
rule DL_DPCH_InformationList_PhyChReconfRqstTDD { call ContainerList3367 }
rule UL_DPCH_InformationList_PhyChReconfRqstTDD { call ContainerList3367 }
rule RL_InformationList_RL_FailureInd { call ContainerList3358 }
rule RL_Set_InformationList_RL_FailureInd { call ContainerList3383 }
rule RL_InformationList_RL_RestoreInd { call ContainerList3358 }
rule RL_Set_InformationList_RL_RestoreInd { call ContainerList3383 }

# The lists of successful radio links in the setup and addition failures
# hold their containers in place: the count as read, which loads no
# position counter, then each container.
family SuccessfulRL_InformationResponseList_RL_{M} {
  member SetupFailureFDD 3370 ie 162
  member AdditionFailureFDD 3376 ie 161
} {
  field ~3370 4 " ContainerList COUNT" keep $ContainerListCount
  repeat $ContainerListCount {
    align
    field 3362 16 "  ContainersIE COUNT" keep $ContainersIeCount
    repeat $ContainersIeCount { call RNSAP_IE }
  }
}

# ------------------------------------------------------------------ FDD downlink DPCH

rule DL_DPCH_Information_RL_SetupRqstFDD ie 60 {
  field 772 1 "  Extension Ext" values ExtensionFlag
  field 774 1 "  tFCI_Presence OPTIONAL" presence
  field 776 1 "  iE_Extensions OPTIONAL" presence
  call TFCS
  call DL_DPCH_SlotFormat
  call NrOfDLchannelisationcodes
  call TFCI_SignallingMode
  when "  tFCI_Presence OPTIONAL" call TFCI_Presence
  call MultiplexingPosition
  call powerOffsetInformation
  call FDD_TPC_DownlinkStepSize
  call LimitedPowerIncrease
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ radio links

# TDD has a single radio link, with the plain RL_ID.
rule RL_Information_RL_SetupRqstTDD ie 119 {
  field 847 1 "  Extension Ext" values ExtensionFlag
  field 849 1 "  primaryCCPCH_RSCP OPTIONAL" presence
  field 851 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call C_ID
  call FrameOffset
  when "  primaryCCPCH_RSCP OPTIONAL" call PrimaryCCPCH_RSCP
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# One radio link of the FDD list, its RL_ID numbered by place.
rule RL_InformationItem_RL_SetupRqstFDD ie 123 {
  field 791 1 "  Extension Ext" values ExtensionFlag
  field 793 1 "  propagationDelay OPTIONAL" presence
  field 795 1 "  diversityControlField OPTIONAL" presence
  field 797 1 "  dl_InitialTX_Power OPTIONAL" presence
  field 799 1 "  primaryCPICH_EcNo OPTIONAL" presence
  field 801 1 "  sSDT_CellID OPTIONAL" presence
  field 803 1 "  transmitDiversityIndicator OPTIONAL" presence
  field 805 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call C_ID
  call FrameOffset
  call ChipOffset
  when "  propagationDelay OPTIONAL" call PropagationDelay
  when "  diversityControlField OPTIONAL" call DiversityControlField
  when "  dl_InitialTX_Power OPTIONAL" call DL_Power
  when "  primaryCPICH_EcNo OPTIONAL" call PrimaryCPICH_EcNo
  when "  sSDT_CellID OPTIONAL" call SSDT_CellID
  when "  transmitDiversityIndicator OPTIONAL" call TransmitDiversityIndicator
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ FDD uplink DPCH

rule UL_DPCH_Information_RL_SetupRqstFDD ie 179 {
  field 752 1 "  Extension Ext" values ExtensionFlag
  field 754 1 "  maxNrOfUL_DPCHs OPTIONAL" presence
  field 756 1 "  ul_SIRTarget OPTIONAL" presence
  field 758 1 "  d_FieldLength OPTIONAL" presence
  field 760 1 "  sSDT_CellIdLength OPTIONAL" presence
  field 762 1 "  s_FieldLength OPTIONAL" presence
  field 764 1 "  iE_Extensions OPTIONAL" presence
  call UL_ScramblingCode
  call MinUL_ChannelisationCodeLength
  when "  maxNrOfUL_DPCHs OPTIONAL" call MaxNrOfUL_DPCHs
  call PunctureLimit
  call TFCS
  call UL_DPCCH_SlotFormat
  when "  ul_SIRTarget OPTIONAL" call UL_SIR
  call PCP_LENGTH
  call DiversityMode
  when "  d_FieldLength OPTIONAL" call D_FieldLength
  when "  sSDT_CellIdLength OPTIONAL" call SSDT_CellID_Length
  when "  s_FieldLength OPTIONAL" call S_FieldLength
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
