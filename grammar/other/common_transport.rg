# Common transport channel resources: the FACH information of a response,
# for the secondary CCPCH coupled to the random access channel and for an
# optional further secondary CCPCH, in FDD and TDD forms.
#
# Every level is an IE of its own in a protocolIEs container: an item holds
# only a wrapper whose body is the container, and the list IE inside it holds
# the count and the items. Each list counts its items less 1.

# ------------------------------------------------------------ top level

# The coupled channel carries its priority list and nothing else.
rule FACH_InfoForS_CCPCH_CoupledToPRACHorPCPCH_CTCH_ResourceRspFDD ie 82 {
  field 2452 1 "  Extension Ext" values ExtensionFlag
  field 2454 1 "  iE_Extensions OPTIONAL" presence
  call PriorityIndicatorAndInitialWindowSizeList_CTCH_ResourceRspFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule FACH_InfoForS_CCPCH_CoupledToPRACH_CTCH_ResourceRspTDD ie 83 {
  field 2490 1 "  Extension Ext" values ExtensionFlag
  field 2492 1 "  iE_Extensions OPTIONAL" presence
  call PriorityIndicatorAndInitialWindowSizeList_CTCH_ResourceRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The optional channel describes its physical channel too.
rule FACH_InfoForOptionalS_CCPCH_CTCH_ResourceRspFDD ie 80 {
  field 2471 1 "  Extension Ext" values ExtensionFlag
  field 2473 1 "  iE_Extensions OPTIONAL" presence
  call FDD_S_CCPCH_Offset
  call DL_ScramblingCode
  call FDD_DL_ChannelisationCodeNumber
  call TFCS
  call SecondaryCCPCH_SlotFormat
  call MultiplexingPosition
  call STTD_Indicator
  call PriorityIndicatorAndInitialWindowSizeList_option_CTCH_ResourceRspFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# In TDD the physical channels are a list of their own, one level deeper.
rule FACH_InfoForOptionalS_CCPCH_CTCH_ResourceRspTDD ie 81 {
  field 2509 1 "  Extension Ext" values ExtensionFlag
  field 2511 1 "  iE_Extensions OPTIONAL" presence
  call TFCS
  call SecondaryCCPCHList_CTCH_ResourceRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule SecondaryCCPCHList_CTCH_ResourceRspTDD { call protocolIEs }

rule SecondaryCCPCHListIE_CTCH_ResourceRspTDD ie 158 {
  field 2514 4 "  SecondaryCCPCHListIE_CTCH_ResourceRspTDD Count" count Items
  repeat Items { call SecondaryCCPCHItem_CTCH_ResourceRspTDD }
}

rule SecondaryCCPCHItem_CTCH_ResourceRspTDD {
  field 2516 1 "  Extension Ext" values ExtensionFlag
  field 2518 1 "  iE_Extensions OPTIONAL" presence
  call TDD_ChannelisationCode
  call TimeSlot
  call BurstType
  call MidambleShift
  call TDD_PhysicalChannelOffset
  call RepetitionPeriod
  call RepetitionLength
  call PriorityIndicatorAndInitialWindowSizeList_option_CTCH_ResourceRspTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ priority list

rule PriorityIndicatorAndInitialWindowSizeList_CTCH_ResourceRspFDD { call protocolIEs }
rule PriorityIndicatorAndInitialWindowSizeList_option_CTCH_ResourceRspFDD { call protocolIEs }
rule PriorityIndicatorAndInitialWindowSizeList_CTCH_ResourceRspTDD { call protocolIEs }
rule PriorityIndicatorAndInitialWindowSizeList_option_CTCH_ResourceRspTDD { call protocolIEs }

family PriorityIndicatorAndInitialWindowSizeListIE_{M} {
  member CTCH_ResourceRspFDD 2457 ie 103
  member option_CTCH_ResourceRspFDD 2476 ie 105
  member CTCH_ResourceRspTDD 2495 ie 104
  member option_CTCH_ResourceRspTDD 2521 ie 106
} {
  field ~2457 4 "  PriorityIndicatorAndInitialWindowSizeListIE_{M} Count" count Items
  repeat Items { call PriorityIndicatorAndInitialWindowSizeItem_{M} }
}

# A FACH priority, the SDU lengths allowed at it, and the initial window.
family PriorityIndicatorAndInitialWindowSizeItem_{M} {
  member CTCH_ResourceRspFDD 2459
  member option_CTCH_ResourceRspFDD 2478
  member CTCH_ResourceRspTDD 2497
  member option_CTCH_ResourceRspTDD 2523
} {
  field ~2459 1 "  Extension Ext" values ExtensionFlag
  field ~2461 1 "  iE_Extensions OPTIONAL" presence
  call FACH_PriorityIndicator
  call MAC_c_SDU_LengthList_{M}
  call FACH_InitialWindowSize
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ SDU length list

rule MAC_c_SDU_LengthList_CTCH_ResourceRspFDD { call protocolIEs }
rule MAC_c_SDU_LengthList_option_CTCH_ResourceRspFDD { call protocolIEs }
rule MAC_c_SDU_LengthList_CTCH_ResourceRspTDD { call protocolIEs }
rule MAC_c_SDU_LengthList_option_CTCH_ResourceRspTDD { call protocolIEs }

family MAC_c_SDU_LengthListIE_{M} {
  member CTCH_ResourceRspFDD 2464 ie 86
  member option_CTCH_ResourceRspFDD 2483 ie 88
  member CTCH_ResourceRspTDD 2502 ie 87
  member option_CTCH_ResourceRspTDD 2528 ie 89
} {
  field ~2464 3 "  MAC_c_SDU_LengthListIE_{M} Count" count Items
  repeat Items { call MAC_c_SDU_LengthItem_{M} }
}

family MAC_c_SDU_LengthItem_{M} {
  member CTCH_ResourceRspFDD 2466
  member option_CTCH_ResourceRspFDD 2485
  member CTCH_ResourceRspTDD 2504
  member option_CTCH_ResourceRspTDD 2530
} {
  field ~2466 1 "  Extension Ext" values ExtensionFlag
  field ~2468 1 "  iE_Extensions OPTIONAL" presence
  call MAC_c_SDU_Length
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
