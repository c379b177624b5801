# Paging, signalling transfer, downlink power control, SRNS relocation commit
# and error indication. Beyond the rules here these procedures carry scalar
# IEs, identities, Cause and CriticalityDiagnostics; the two transparent
# containers, L3_Information and RANAP_RelocationInformation, are bit strings
# read among the scalar IEs.

# ------------------------------------------------------------ paging

# The paging area is a URA or a cell; either arm is an IE container whose
# item IE, not the Index, decides what is read.
rule PagingArea_PagingRqst ie 102 {
  field 2329 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2332 1 "  PagingArea_PagingRqst Index" values { 0 "uRA" 1 "cell" } keep Index
    if Index == 0 {
      call URA_PagingRqst
    }
    if Index == 1 {
      call Cell_PagingRqst
    }
  }
}

rule URA_PagingRqst { call protocolIEs }
rule Cell_PagingRqst { call protocolIEs }

rule URAItem_PagingRqst ie 186 {
  field 2335 1 "  Extension Ext" values ExtensionFlag
  field 2337 1 "  iE_Extensions OPTIONAL" presence
  call URA_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule CellItem_PagingRqst ie 12 {
  field 2340 1 "  Extension Ext" values ExtensionFlag
  field 2342 1 "  iE_Extensions OPTIONAL" presence
  call C_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ uplink signalling transfer

# The RNCs that have cells in the accessed URA; the count is the number of
# items as read, so 0 means none.
rule RNCsWithCellsInTheAccessedURA_List_UL_ST_Ind ie 151 {
  field 2322 5 "  RNCsWithCellsInTheAccessedURA_List_UL_ST_Ind Count" keep Items
  repeat Items { call RNCsWithCellsInTheAccessedURA_Item_UL_ST_Ind }
}

rule RNCsWithCellsInTheAccessedURA_Item_UL_ST_Ind {
  field 2324 1 "  Extension Ext" values ExtensionFlag
  field 2326 1 "  iE_Extensions OPTIONAL" presence
  call RNC_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ downlink power control

# The reference power per radio link: a container list whose items take their
# RL_ID number from their place in the list.
rule DL_ReferencePowerInformationList_DL_PC_Rqst ie 68 { call ContainerList3358 }

rule DL_ReferencePowerInformation_DL_PC_Rqst ie 69 {
  field 2228 1 "  Extension Ext" values ExtensionFlag
  field 2230 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call DL_Power
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The procedure scope of a power control request is known by its id and
# carries nothing.
branch ie 108 empty
