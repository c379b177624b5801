# Radio link reconfiguration, what the drift RNC answers: the ready message
# of the synchronised reconfiguration and the response of the unsynchronised
# one. Per radio link they give the UL SIR range, the codes and the transport
# bearers of the DCHs added or modified, and in FDD the secondary CCPCH that
# carries the FACH and PCH. The failure's cause IEs are in common/cause.rg.
#
# The downlink code items, the DCH items and the secondary CCPCH with its
# lists have the shapes of the setup response: they are members of its
# families, in setup_response.rg.

# ----------------------------------------------------------- FDD radio links

# Container lists of five bits, counted as read.
rule RL_InformationResponseList_RL_ReconfReadyFDD ie 135 { call ContainerList3379 }
rule RL_InformationResponseList_RL_ReconfRsp ie 136 { call ContainerList3379 }

# The DSCH presence bit of the ready item has nothing behind it.
rule RL_InformationResponseItem_RL_ReconfReadyFDD ie 131 {
  field 1801 1 "  Extension Ext" values ExtensionFlag
  field 1803 1 "  max_UL_SIR OPTIONAL" presence
  field 1805 1 "  min_UL_SIR OPTIONAL" presence
  field 1807 1 "  secondary_CCPCH_Info OPTIONAL" presence
  field 1809 1 "  dl_CodeInformationList OPTIONAL" presence
  field 1811 1 "  dCHsToBeAdded OPTIONAL" presence
  field 1813 1 "  dCHsToBeModified OPTIONAL" presence
  field 1815 1 "  dSCHsToBeAddOrModified OPTIONAL" presence
  field 1817 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  max_UL_SIR OPTIONAL" call UL_SIR
  when "  min_UL_SIR OPTIONAL" call UL_SIR
  when "  secondary_CCPCH_Info OPTIONAL" call Secondary_CCPCH_Info_RL_ReconfReadyFDD
  when "  dl_CodeInformationList OPTIONAL" call DL_CodeInformationList_RL_ReconfReadyFDD
  when "  dCHsToBeAdded OPTIONAL" call DCH_AddList_RL_ReconfReadyFDD
  when "  dCHsToBeModified OPTIONAL" call DCH_ModifyList_RL_ReconfReadyFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule RL_InformationResponseItem_RL_ReconfRsp ie 132 {
  field 2129 1 "  Extension Ext" values ExtensionFlag
  field 2131 1 "  max_UL_SIR OPTIONAL" presence
  field 2133 1 "  min_UL_SIR OPTIONAL" presence
  field 2135 1 "  secondary_CCPCH_Info OPTIONAL" presence
  field 2137 1 "  dCHsToBeAdded OPTIONAL" presence
  field 2139 1 "  dCHsToBeModified OPTIONAL" presence
  field 2141 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  max_UL_SIR OPTIONAL" call UL_SIR
  when "  min_UL_SIR OPTIONAL" call UL_SIR
  when "  secondary_CCPCH_Info OPTIONAL" call Secondary_CCPCH_Info_RL_ReconfRsp
  when "  dCHsToBeAdded OPTIONAL" call DCH_AddList_RL_ReconfRsp
  when "  dCHsToBeModified OPTIONAL" call DCH_ModifyList_RL_ReconfRsp
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The sub lists of a response item, each an IE container of its own.
rule DL_CodeInformationList_RL_ReconfReadyFDD { call protocolIEs }
rule DCH_AddList_RL_ReconfReadyFDD { call protocolIEs }
rule DCH_ModifyList_RL_ReconfReadyFDD { call protocolIEs }
rule DCH_AddList_RL_ReconfRsp { call protocolIEs }
rule DCH_ModifyList_RL_ReconfRsp { call protocolIEs }

# --------------------------------------------------------- FDD downlink codes

rule DL_CodeInformationListIE_RL_ReconfReadyFDD ie 57 {
  field 1854 4 "  DL_CodeInformationListIE_RL_ReconfReadyFDD Count" keep Items
  repeat Items { call DL_CodeInformationItem_RL_ReconfReadyFDD }
}

# ---------------------------------------------- transport bearers of the DCHs

# Lists counted in 8 bits as read. The FDD lists load the position counters
# of the numbered DCH_ID, BindingID and TransportLayerAddress with their
# count, so that each item of the list reads fields of its own. The items are
# in setup_response.rg.
family DCH_AddListIE_{M} {
  member RL_ReconfReadyFDD 1861 ie 23
  member RL_ReconfReadyTDD 1980 ie 24
  member RL_ReconfRsp 2176 ie 25
} {
  field ~1861 8 "  DCH_AddListIE_{M} Count" keep Items
  only RL_ReconfReadyFDD RL_ReconfRsp {
    set $DchIdPosition = Items
    set $BindingIdPosition = Items
    set $TransportLayerAddressPosition = Items
  }
  repeat Items { call DCH_AddItem_{M} }
}

family DCH_ModifyListIE_{M} {
  member RL_ReconfReadyFDD 1871 ie 36
  member RL_ReconfReadyTDD 1987 ie 37
  member RL_ReconfRsp 2186 ie 38
} {
  field ~1871 8 "  DCH_ModifyListIE_{M} Count" keep Items
  only RL_ReconfReadyFDD RL_ReconfRsp {
    set $DchIdPosition = Items
    set $BindingIdPosition = Items
    set $TransportLayerAddressPosition = Items
  }
  repeat Items { call DCH_ModifyItem_{M} }
}

# ----------------------------------------------------------- TDD radio link

rule RL_InformationResponse_RL_ReconfReadyTDD ie 128 {
  field 1881 1 "  Extension Ext" values ExtensionFlag
  field 1883 1 "  max_UL_SIR OPTIONAL" presence
  field 1885 1 "  min_UL_SIR OPTIONAL" presence
  field 1887 1 "  ul_CCTrCH_Information OPTIONAL" presence
  field 1889 1 "  dl_CCTrCH_Information OPTIONAL" presence
  field 1891 1 "  dCHsToBeAdded OPTIONAL" presence
  field 1893 1 "  dCHsToBeModified OPTIONAL" presence
  field 1895 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  when "  max_UL_SIR OPTIONAL" call UL_SIR
  when "  min_UL_SIR OPTIONAL" call UL_SIR
  when "  ul_CCTrCH_Information OPTIONAL" call UL_CCTrCH_InformationList_RL_ReconfReadyTDD
  when "  dl_CCTrCH_Information OPTIONAL" call DL_CCTrCH_InformationList_RL_ReconfReadyTDD
  when "  dCHsToBeAdded OPTIONAL" call DCH_AddList_RL_ReconfReadyTDD
  when "  dCHsToBeModified OPTIONAL" call DCH_ModifyList_RL_ReconfReadyTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The sub lists of the TDD response, each an IE container of its own.
rule UL_CCTrCH_InformationList_RL_ReconfReadyTDD { call protocolIEs }
rule DL_CCTrCH_InformationList_RL_ReconfReadyTDD { call protocolIEs }
rule DCH_AddList_RL_ReconfReadyTDD { call protocolIEs }
rule DCH_ModifyList_RL_ReconfReadyTDD { call protocolIEs }
rule UL_DPCH_InformationList_RL_ReconfReadyTDD { call protocolIEs }
rule DL_DPCH_InformationList_RL_ReconfReadyTDD { call protocolIEs }

# ------------------------------------------------ TDD CCTrCHs and their DPCHs

# CCTrCH lists counted in 4 bits as read.
family {M}_CCTrCHInformationListIE_RL_ReconfReadyTDD {
  member UL 1904 ie 175
  member DL 1942 ie 45
} {
  field ~1904 4 "  {M}_CCTrCHInformationListIE_RL_ReconfReadyTDD Count" keep Items
  repeat Items { call {M}_CCTrCH_InformationItem_RL_ReconfReadyTDD }
}

# The shape of the setup response's CCTrCH item.
family {M}_CCTrCH_InformationItem_RL_ReconfReadyTDD {
  member UL 1906
  member DL 1944
} {
  field ~1906 1 "  Extension Ext" values ExtensionFlag
  field ~1908 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call {M}_DPCH_InformationList_RL_ReconfReadyTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# DPCH lists of one to sixteen items: the count keeps its raw value.
family {M}_DPCH_InformationListIE_RL_ReconfReadyTDD {
  member UL 1911 ie 183
  member DL 1949 ie 65
} {
  field ~1911 4 "  {M}_DPCH_InformationListIE_RL_ReconfReadyTDD Count" count Items
  repeat Items { call {M}_DPCH_InformationItem_RL_ReconfReadyTDD }
}

# A DPCH whose physical channel parameters may each change, here and in the
# physical channel reconfiguration request.
family {M} {
  member UL_DPCH_InformationItem_RL_ReconfReadyTDD 1913
  member DL_DPCH_InformationItem_RL_ReconfReadyTDD 1951
  member DL_DPCH_InformationItem_PhyChReconfRqstTDD 2293 ie 62
  member UL_DPCH_InformationItem_PhyChReconfRqstTDD 2257 ie 180
} {
  field ~1913 1 "  Extension Ext" values ExtensionFlag
  field ~1915 1 "  tDD_ChannelisationCode OPTIONAL" presence
  field ~1917 1 "  burstType OPTIONAL" presence
  field ~1919 1 "  midambleShift OPTIONAL" presence
  field ~1921 1 "  timeSlot OPTIONAL" presence
  field ~1923 1 "  tDD_PhysicalChannelOffset OPTIONAL" presence
  field ~1925 1 "  repetitionPeriod OPTIONAL" presence
  field ~1927 1 "  repetitionLength OPTIONAL" presence
  field ~1929 1 "  tFCI_Presence OPTIONAL" presence
  field ~1931 1 "  iE_Extensions OPTIONAL" presence
  call DPCH_ID
  when "  tDD_ChannelisationCode OPTIONAL" call TDD_ChannelisationCode
  when "  burstType OPTIONAL" call BurstType
  when "  midambleShift OPTIONAL" call MidambleShift
  when "  timeSlot OPTIONAL" call TimeSlot
  when "  tDD_PhysicalChannelOffset OPTIONAL" call TDD_PhysicalChannelOffset
  when "  repetitionPeriod OPTIONAL" call RepetitionPeriod
  when "  repetitionLength OPTIONAL" call RepetitionLength
  when "  tFCI_Presence OPTIONAL" call TFCI_Presence
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
