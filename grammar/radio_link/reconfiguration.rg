# Radio link reconfiguration, what the serving RNC asks for: the prepare
# message of the synchronised reconfiguration and the request of the
# unsynchronised one, for FDD and TDD. A message names only what changes:
# the DCHs to add, modify or delete, new DPCH parameters, the radio links
# and the TDD CCTrCHs concerned.
#
# The DCH lists count in 8 bits as read: a count of 0 is an empty list.

# ---------------------------------------------------------------- DCHs to add

family DCH_AddList_{M} {
  member RL_ReconfPrepFDD 1694 ie 26
  member RL_ReconfPrepTDD 1784 ie 27
  member RL_ReconfRqstFDD 2051 ie 28
  member RL_ReconfRqstTDD 2112 ie 29
} {
  field ~1694 8 "  DCH_AddList_{M} Count" keep Items
  repeat Items { call DCH_AddItem_{M} }
}

# The items of the DCHs to add have the shapes of the setup request's DCH
# items (setup_request.rg); only the TDD request places the CCTrCHs and the
# power increase otherwise and reads no payload CRC indicator.
rule DCH_AddItem_RL_ReconfRqstTDD {
  field 2114 1 "  Extension Ext" values ExtensionFlag
  field 2116 1 "  dCH_CombinationInd OPTIONAL" presence
  field 2118 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID
  call LimitedPowerIncrease
  call TrCH_SrcStatisticsDescr
  call CCTrCH_ID
  call CCTrCH_ID
  when "  dCH_CombinationInd OPTIONAL" call DCH_CombinationInd
  call TransportFormatSet
  call TransportFormatSet
  call BLER
  call BLER
  call AllocationRetentionPriority
  call FrameHandlingPriority
  call UL_FP_Mode
  call ToAWS
  call ToAWE
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------- DCHs to delete

family DCH_DeleteList_{M} {
  member RL_ReconfPrepFDD 1704 ie 30
  member RL_ReconfPrepTDD 1794 ie 31
  member RL_ReconfRqstFDD 2061 ie 32
  member RL_ReconfRqstTDD 2122 ie 33
} {
  field ~1704 8 "  DCH_DeleteList_{M} Count" keep Items
  repeat Items { call DCH_DeleteItem_{M} }
}

family DCH_DeleteItem_{M} {
  member RL_ReconfPrepFDD 1706
  member RL_ReconfRqstFDD 2063
  member RL_ReconfPrepTDD 1796
  member RL_ReconfRqstTDD 2124
} {
  field ~1706 1 "  Extension Ext" values ExtensionFlag
  field ~1708 1 "  iE_Extensions OPTIONAL" presence
  only RL_ReconfPrepFDD RL_ReconfRqstFDD { call DCH_ID_Numbered }
  only RL_ReconfPrepTDD RL_ReconfRqstTDD { call DCH_ID }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------- DCHs to modify

family DCH_ModifyList_{M} {
  member RL_ReconfPrepFDD 1663 ie 39
  member RL_ReconfPrepTDD 1750 ie 40
  member RL_ReconfRqstFDD 2020 ie 41
  member RL_ReconfRqstTDD 2078 ie 42
} {
  field ~1663 8 "  DCH_ModifyList_{M} Count" keep Items
  repeat Items { call DCH_ModifyItem_{M} }
}

# Everything but the DCH_ID is optional: an item changes what it names.
family DCH_ModifyItem_{M} {
  member RL_ReconfPrepFDD 1665
  member RL_ReconfRqstFDD 2022
} {
  field ~1665 1 "  Extension Ext" values ExtensionFlag
  field ~1667 1 "  ul_TransportformatSet OPTIONAL" presence
  field ~1669 1 "  dl_TransportformatSet OPTIONAL" presence
  field ~1671 1 "  allocationRetentionPriority OPTIONAL" presence
  field ~1673 1 "  frameHandlingPriority OPTIONAL" presence
  field ~1675 1 "  ul_FP_Mode OPTIONAL" presence
  field ~1677 1 "  toAWS OPTIONAL" presence
  field ~1679 1 "  toAWE OPTIONAL" presence
  field ~1681 1 "  dRACControl OPTIONAL" presence
  field ~1683 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID_Numbered
  when "  ul_TransportformatSet OPTIONAL" call TransportFormatSet
  when "  dl_TransportformatSet OPTIONAL" call TransportFormatSet
  when "  allocationRetentionPriority OPTIONAL" call AllocationRetentionPriority
  when "  frameHandlingPriority OPTIONAL" call FrameHandlingPriority
  when "  ul_FP_Mode OPTIONAL" call UL_FP_Mode
  when "  toAWS OPTIONAL" call ToAWS
  when "  toAWE OPTIONAL" call ToAWE
  when "  dRACControl OPTIONAL" call DRACControl
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family DCH_ModifyItem_{M} {
  member RL_ReconfPrepTDD 1752
  member RL_ReconfRqstTDD 2080
} {
  field ~1752 1 "  Extension Ext" values ExtensionFlag
  field ~1754 1 "  ul_CCTrCH_ID OPTIONAL" presence
  field ~1756 1 "  dl_CCTrCH_ID OPTIONAL" presence
  field ~1758 1 "  ul_TransportformatSet OPTIONAL" presence
  field ~1760 1 "  dl_TransportformatSet OPTIONAL" presence
  field ~1762 1 "  allocationRetentionPriority OPTIONAL" presence
  field ~1764 1 "  frameHandlingPriority OPTIONAL" presence
  field ~1766 1 "  ul_FP_Mode OPTIONAL" presence
  field ~1768 1 "  toAWS OPTIONAL" presence
  field ~1770 1 "  toAWE OPTIONAL" presence
  field ~1772 1 "  iE_Extensions OPTIONAL" presence
  call DCH_ID
  when "  ul_CCTrCH_ID OPTIONAL" call CCTrCH_ID
  when "  dl_CCTrCH_ID OPTIONAL" call CCTrCH_ID
  when "  ul_TransportformatSet OPTIONAL" call TransportFormatSet
  when "  dl_TransportformatSet OPTIONAL" call TransportFormatSet
  when "  allocationRetentionPriority OPTIONAL" call AllocationRetentionPriority
  when "  frameHandlingPriority OPTIONAL" call FrameHandlingPriority
  when "  ul_FP_Mode OPTIONAL" call UL_FP_Mode
  when "  toAWS OPTIONAL" call ToAWS
  when "  toAWE OPTIONAL" call ToAWE
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# -------------------------------------------------------- FDD DPCH parameters

rule DL_DPCH_Information_RL_ReconfPrepFDD ie 59 {
  field 1637 1 "  Extension Ext" values ExtensionFlag
  field 1639 1 "  tFCS OPTIONAL" presence
  field 1641 1 "  dl_DPCH_SlotFormat OPTIONAL" presence
  field 1643 1 "  nrOfDLchannelisationcodes OPTIONAL" presence
  field 1645 1 "  tFCI_SignallingMode OPTIONAL" presence
  field 1647 1 "  tFCI_Presence OPTIONAL" presence
  field 1649 1 "  multiplexingPosition OPTIONAL" presence
  field 1651 1 "  limitedPowerIncrease OPTIONAL" presence
  field 1653 1 "  iE_Extensions OPTIONAL" presence
  when "  tFCS OPTIONAL" call TFCS
  when "  dl_DPCH_SlotFormat OPTIONAL" call DL_DPCH_SlotFormat
  when "  nrOfDLchannelisationcodes OPTIONAL" call NrOfDLchannelisationcodes
  when "  tFCI_SignallingMode OPTIONAL" call TFCI_SignallingMode
  when "  tFCI_Presence OPTIONAL" call TFCI_Presence
  when "  multiplexingPosition OPTIONAL" call MultiplexingPosition
  when "  limitedPowerIncrease OPTIONAL" call LimitedPowerIncrease
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule DL_DPCH_Information_RL_ReconfRqstFDD ie 61 {
  field 2009 1 "  Extension Ext" values ExtensionFlag
  field 2011 1 "  tFCS OPTIONAL" presence
  field 2013 1 "  tFCI_SignallingMode OPTIONAL" presence
  field 2015 1 "  iE_Extensions OPTIONAL" presence
  when "  tFCS OPTIONAL" call TFCS
  when "  tFCI_SignallingMode OPTIONAL" call TFCI_SignallingMode
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_DPCH_Information_RL_ReconfPrepFDD ie 177 {
  field 1605 1 "  Extension Ext" values ExtensionFlag
  field 1607 1 "  ul_ScramblingCode OPTIONAL" presence
  field 1609 1 "  ul_SIRTarget OPTIONAL" presence
  field 1611 1 "  minUL_ChannelisationCodeLength OPTIONAL" presence
  field 1613 1 "  maxNrOfUL_DPDCHs OPTIONAL" presence
  field 1615 1 "  ul_PunctureLimit OPTIONAL" presence
  field 1617 1 "  tFCS OPTIONAL" presence
  field 1619 1 "  ul_DPCCH_SlotFormat OPTIONAL" presence
  field 1621 1 "  sSDT_CellIDLength OPTIONAL" presence
  field 1623 1 "  s_FieldLength OPTIONAL" presence
  field 1625 1 "  iE_Extensions OPTIONAL" presence
  when "  ul_ScramblingCode OPTIONAL" call UL_ScramblingCode
  when "  ul_SIRTarget OPTIONAL" call UL_SIR
  when "  minUL_ChannelisationCodeLength OPTIONAL" call MinUL_ChannelisationCodeLength
  when "  maxNrOfUL_DPDCHs OPTIONAL" call MaxNrOfUL_DPCHs
  when "  ul_PunctureLimit OPTIONAL" call PunctureLimit
  when "  tFCS OPTIONAL" call TFCS
  when "  ul_DPCCH_SlotFormat OPTIONAL" call UL_DPCCH_SlotFormat
  when "  sSDT_CellIDLength OPTIONAL" call SSDT_CellID_Length
  when "  s_FieldLength OPTIONAL" call S_FieldLength
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_DPCH_Information_RL_ReconfRqstFDD ie 178 {
  field 2001 1 "  Extension Ext" values ExtensionFlag
  field 2003 1 "  tFCS OPTIONAL" presence
  field 2005 1 "  iE_Extensions OPTIONAL" presence
  when "  tFCS OPTIONAL" call TFCS
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ----------------------------------------------------------- FDD radio links

# The radio links to prepare: a container list of five bits, counted as read.
rule RL_InformationList_RL_ReconfPrepFDD ie 126 {
  call ContainerList3379
}

rule RL_Information_RL_ReconfPrepFDD ie 116 {
  field 1711 1 "  Extension Ext" values ExtensionFlag
  field 1713 1 "  sSDT_Indication OPTIONAL" presence
  field 1715 1 "  sSDT_CellIdentity OPTIONAL" presence
  field 1717 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  sSDT_Indication OPTIONAL" call SSDT_Indication
  when "  sSDT_CellIdentity OPTIONAL" call SSDT_CellID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# --------------------------------------------------------------- TDD CCTrCHs

# Container lists of four bits, counted as read; they load no position
# counter.
rule DL_CCTrCH_InformationList_RL_ReconfPrepTDD ie 51 { call ContainerList3382 }
rule UL_CCTrCH_InformationList_RL_ReconfPrepTDD ie 169 { call ContainerList3382 }
rule DL_CCTrCH_InformationList_RL_ReconfRqstTDD ie 52 { call ContainerList3382 }
rule UL_CCTrCH_InformationList_RL_ReconfRqstTDD ie 170 { call ContainerList3382 }

# In the prepare message a CCTrCH may change its combination set, its TFCI
# coding and its puncture limit; in the request only its combination set.
# The downlink and uplink rules have one shape.
family {M} {
  member DL_CCTrCH_InformationItem_RL_ReconfPrepTDD 1736 ie 44
  member UL_CCTrCH_Information_RL_ReconfPrepTDD 1722 ie 167
} {
  field ~1736 1 "  Extension Ext" values ExtensionFlag
  field ~1738 1 "  tFCS OPTIONAL" presence
  field ~1740 1 "  tFCI_Coding OPTIONAL" presence
  field ~1742 1 "  punctureLimit OPTIONAL" presence
  field ~1744 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  when "  tFCS OPTIONAL" call TFCS
  when "  tFCI_Coding OPTIONAL" call TFCI_Coding
  when "  punctureLimit OPTIONAL" call PunctureLimit
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family {M}_CCTrCH_InformationItem_RL_ReconfRqstTDD {
  member DL 2073 ie 46
  member UL 2068 ie 168
} {
  field ~2073 1 "  Extension Ext" values ExtensionFlag
  field ~2075 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call TFCS
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
