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

# One DCH to set up, or to add by a reconfiguration. The uplink transport
# format set and BLER come first, then the downlink ones. The FDD item reads
# the long DCH_ID, whose counter no list of these messages loads; only the
# request of the unsynchronised reconfiguration limits the power increase.
family {M} {
  member DCH_InformationItem_RL_SetupRqstFDD 783
  member DCH_AddItem_RL_ReconfPrepFDD 1696
  member DCH_AddItem_RL_ReconfRqstFDD 2053
} {
  field ~783 1 "  Extension Ext" values ExtensionFlag
  field ~785 1 "  dCH_CombinationInd OPTIONAL" presence
  field ~787 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID_Numbered
  when "  dCH_CombinationInd OPTIONAL" call DCH_CombinationInd
  only DCH_AddItem_RL_ReconfRqstFDD { call LimitedPowerIncrease }
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
family {M} {
  member DCH_InformationItem_RL_SetupRqstTDD 839
  member DCH_AddItem_RL_ReconfPrepTDD 1786
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
family {M}_CCTrCH_InformationItem_RL_SetupRqstTDD {
  member DL 832 ie 47
  member UL 827 ie 171
} {
  field ~832 1 "  Extension Ext" values ExtensionFlag
  field ~834 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call TFCS
  call TFCI_Coding
  call PunctureLimit
  only DL { call TDD_TPC_DownlinkStepSize }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ container lists

# The lists of radio links and CCTrCHs hold one container per item. Their
# counts are the number of containers less 1; they load the position
# counters, so the FDD radio links are numbered by place.
rule DL_CCTrCH_InformationList_RL_SetupRqstTDD ie 53 { call ContainerList3364 }
rule RL_InformationList_RL_SetupRqstFDD ie 118 { call ContainerList3358 }
rule UL_CCTrCH_InformationList_RL_SetupRqstTDD ie 172 { call ContainerList3364 }

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
