# Physical channel reconfiguration and radio link status: the new downlink
# codes (FDD) or CCTrCHs with their DPCHs (TDD) of a radio link, and the
# radio links or RL sets that failed or were restored.

# --------------------------------------------- physical channel reconfiguration

# The FDD radio link: its RL and the IE container of its downlink codes.
rule RL_Information_PhyChReconfRqstFDD ie 110 {
  field 2233 1 "  Extension Ext" values ExtensionFlag
  field 2235 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call DL_CodeInformationList_PhyChReconfRqstFDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule DL_CodeInformationList_PhyChReconfRqstFDD {
  call protocolIEs
}

# The downlink code list and items are members of the setup failure's
# families, in setup_response.rg.

# The TDD radio link: its RL and an IE container for each direction's CCTrCHs.
rule RL_Information_PhyChReconfRqstTDD ie 111 {
  field 2245 1 "  Extension Ext" values ExtensionFlag
  field 2247 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID
  call UL_CCTrCH_InformationList_PhyChReconfRqstTDD
  call DL_CCTrCH_InformationList_PhyChReconfRqstTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule UL_CCTrCH_InformationList_PhyChReconfRqstTDD {
  call protocolIEs
}

rule DL_CCTrCH_InformationList_PhyChReconfRqstTDD {
  call protocolIEs
}

# One to sixteen CCTrCHs of a direction, each with a container list of DPCHs:
# the shapes of the setup response's CCTrCH list and item.
family {M}_CCTrCH_InformationListIE_PhyChReconfRqstTDD {
  member DL 2286 ie 48
  member UL 2250 ie 173
} {
  field ~2286 4 "  {M}_CCTrCH_InformationListIE_PhyChReconfRqstTDD Count" count Count
  repeat Count { call {M}_CCTrCH_InformationItem_PhyChReconfRqstTDD }
}

family {M}_CCTrCH_InformationItem_PhyChReconfRqstTDD {
  member DL 2288
  member UL 2252
} {
  field ~2288 1 "  Extension Ext" values ExtensionFlag
  field ~2290 1 "  iE_Extensions OPTIONAL" presence
  call CCTrCH_ID
  call {M}_DPCH_InformationList_PhyChReconfRqstTDD
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule DL_DPCH_InformationList_PhyChReconfRqstTDD {
  call ContainerList3367
}

rule UL_DPCH_InformationList_PhyChReconfRqstTDD {
  call ContainerList3367
}

# A DPCH names only what changes, in the shape of the reconfiguration ready
# message's DPCH (reconfiguration_response.rg).

# ------------------------------------------------ radio link failure and restore

# The reporting object behind an extension bit: a container list of radio
# links or one of RL sets.
family Reporting_Object_RL_{M} {
  member FailureInd 2196 ie 153
  member RestoreInd 2212 ie 154
} {
  field ~2196 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field ~2199 1 "  Reporting_Object_RL_{M} Index" values { 0 "rL" 1 "rL_Set" } keep Index
    if Index == 0 {
      call RL_InformationList_RL_{M}
    }
    if Index == 1 {
      call RL_Set_InformationList_RL_{M}
    }
  }
}

rule RL_InformationList_RL_FailureInd {
  call ContainerList3358
}

rule RL_InformationList_RL_RestoreInd {
  call ContainerList3358
}

rule RL_Set_InformationList_RL_FailureInd {
  call ContainerList3383
}

rule RL_Set_InformationList_RL_RestoreInd {
  call ContainerList3383
}

# The IEs of those containers: a numbered RL or RL set, with the cause of a
# failure. The restored RL has the shape of a combining item
# (setup_response.rg).
rule RL_Information_RL_FailureInd ie 115 {
  field 2202 1 "  Extension Ext" values ExtensionFlag
  field 2204 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  call Cause
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

family RL_Set_Information_RL_{M} {
  member FailureInd 2207 ie 146
  member RestoreInd 2223 ie 147
} {
  field ~2207 1 "  Extension Ext" values ExtensionFlag
  field ~2209 1 "  iE_Extensions OPTIONAL" presence
  call rlCount
  only FailureInd { call Cause }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}
