# The protocol extension container: the iE_Extensions closing of every rule,
# the frame of one extension, the dispatch on the extension id, and the
# values of the extensions that no other rule reads.
#
# Like the IE length, the extension length is kept but never bounds or skips
# the value; an id without a branch reads nothing, and the next frame starts
# behind its length field. Any extension id is accepted in any container.
# $ExtensionCount is one variable for all containers: a container nested in
# an extension's value changes the count that the outer loop is testing.

values ExtensionIds {
  0 "id_NeighbouringCellInformationValueTag"
  1 "id_MaximumDLPower"
  2 "id_FirstRLSIndicator"
  3 "id_ScramblingCodeControlIndicator"
  4 "id_IgnoreRestriction"
  5 "id_UARFCN"
  6 "id_PowerOffsetInformation25"
  7 "id_GeographicalAreaCell"
  8 "id_IntraFrequencyCellEdgeIndicator"
  9 "id_CompressedModeProhibitCellIndicator"
  10 "id_NeighbouringCellInformationValueTag2"
  11 "id_VersionNumber"
  12 "id_ServiceCombination"
  13 "id_U_RNTI"
  14 "id_WorkingProcedure"
  15 "id_UE_Version"
  16 "id_BTS_Version"
  17 "id_BTS_Type"
  18 "id_PrimaryCPICH_Power"
  19 "id_SRNC_Version"
  20 "id_DCCH_Property"
  21 "id_PropagationDelay"
  22 "id_PSCN_Transition"
  23 "id_BTS_Type2"
  24 "id_CPICH_PowerOffset"
  25 "id_UARFCNnu"
  26 "id_GA_AltitudeWithUncertaintyAltitude"
  27 "id_DRNC_Version"
  28 "id_BitRateSet"
  30 "id_ExtensionIndicator"
  31 "id_ExtensionGroupIdentity"
  32 "id_ExtensionSAC"
  33 "id_TransportChannelType"
  34 "id_IPAddressSet"
  35 "id_IPBTS_ExtensionGroupCheck"
  37 "id_ServiceType"
  38 "id_SupportedBandList"
  39 "id_Per_Cell_InformationList"
  40 "id_BandSelectionFactor"
}

# ------------------------------------------------------------ the container

# The container that closes a rule whose "  iE_Extensions OPTIONAL" bit is 1.
# The count is stored less 1: a count field of 0 means one extension.
rule iE_Extensions {
  align
  field 3388 16 "  ProtocolExtensionContainer COUNT" length $ExtensionCount
  repeat $ExtensionCount { call RNSAP_EXTENSIONS }
}

# One extension: id, criticality, length determinant, and the value chosen
# by the id. No alignment closes the frame.
rule RNSAP_EXTENSIONS {
  align
  field 724 16 "Extension ID" values ExtensionIds keep $ExtensionId
  field 725 2 "Criticality" values Criticality
  align
  field 726 1 "Extension LENGTH Type" keep $LengthForm
  field 729 7 "Extension LENGTH" keep $IeLength if $LengthForm == 0
  if $LengthForm != 0 {
    field 731 1 "Extension LENGTH Type2"
    field 732 14 "Extension LENGTH" keep $IeLength
  }
  dispatch $ExtensionId extension
}

# The extension indicator is known and carries nothing.
branch extension 30 empty

# ------------------------------------------------------------ single values

rule NeighbouringCellInformationValueTag extension 0 {
  align
  field 3214 8 "  NeighbouringCellInformationValueTag"
}

# The first-RLS indicator has no rule name of its own.
rule FirstRLSIndicator "" extension 2 {
  field 3389 1 " FirstRLSIndicator" values { 0 "first-RLS" 1 "not-first-RLS" }
}

rule ScramblingCodeControlIndicator extension 3 {
  field 3066 1 "  ScramblingCodeControlIndicator" values { 0 "primary_scrambling_code" 1 "prymary_or_secondary_scrambling_code" }
}

rule IgnoreRestriction extension 4 {
  field 2913 1 "  IgnoreRestriction" values { 0 "ignore" 1 "notIgnore" }
}

rule IntraFrequencyCellEdgeIndicator extension 8 {
  field 2926 1 "  IntraFrequencyCellEdgeIndicator" values { 0 "on" 1 "off" }
}

rule CompressedModeProhibitCellIndicator extension 9 {
  field 2708 1 "  CompressedModeProhibitCellIndicator" values { 0 "notprohibit" 1 "prohibit" }
}

rule VersionNumber extension 11 {
  align
  field 3213 8 "  VersionNumber"
}

rule ServiceCombination extension 12 {
  align
  field 3067 8 "  ServiceCombination"
}

rule WorkingProcedure extension 14 {
  align
  field 3215 8 "  WorkingProcedure"
}

rule UE_Version extension 15 {
  align
  field 3199 8 "  UE_Version"
}

rule BTS_Version extension 16 {
  align
  field 2646 8 "  BTS_Version"
}

rule BTS_Type extension 17 {
  align
  field 2645 8 "  BTS_Type"
}

rule SRNC_Version extension 19 {
  align
  field 3084 8 "  SRNC_Version"
}

rule DCCH_Property extension 20 {
  field 2812 1 "  DCCH_Property" values { 0 "normal" 1 "unreserved" }
}

rule PSCN_Transition extension 22 {
  field 3023 1 "  PSCN_Transition" values { 0 "off" 1 "on" }
}

rule BTS_Type2 extension 23 {
  align
  field 2648 8 "  BTS_Type2"
}

# Unlike its neighbours the CPICH power offset is not aligned.
rule CPICH_PowerOffset extension 24 {
  field 2745 8 "  CPICH_PowerOffset"
}

rule DRNC_Version extension 27 {
  align
  field 2813 8 "  DRNC_Version"
}

# The extension SAC: three octets, the last one on the wire the most
# significant.
rule ExtensionSAC extension 32 {
  align
  field 2868 octetsback(3) " ExtensionSAC" show '%x'
}

# The service type: eight single bits, not aligned.
rule ServiceType extension 37 {
  field 3085 bits(8) " ServiceType" show '%b'
}

# ------------------------------------------------------------ power offsets

# Three power offsets in a row, each read by the same rule.
rule PowerOffsetInformation25 extension 6 {
  field 780 1 "  Extension Ext" values ExtensionFlag
  call PowerOffset25
  call PowerOffset25
  call PowerOffset25
}

rule PowerOffset25 {
  field 3015 6 "  PowerOffset25"
}

# ------------------------------------------------------------ neighbouring cell tag

rule NeighbouringCellInformationValueTag2 extension 10 {
  field 2986 1 "  iE_Extensions OPTIONAL" presence
  call NC_Tag2_rnc_version
  call NC_Tag2_rnc_revision
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule NC_Tag2_rnc_version {
  align
  field 2989 16 "  NC_Tag2_rnc_version"
}

rule NC_Tag2_rnc_revision {
  align
  field 2990 16 "  NC_Tag2_rnc_revision"
}

# ------------------------------------------------------------ geographical area

# The cell's area: a point, a point with an uncertainty code, or a polygon.
rule GeographicalAreaCell extension 7 {
  field 2883 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2886 2 "  GeographicalAreaCell Index" values { 0 "point" 1 "pointWithUnCertainty" 2 "polygon" } keep Index
    call GA_Point if Index == 0
    call GA_PointWithUnCertainty if Index == 1
    call GA_Polygon if Index == 2
  }
}

rule GA_Point {
  field 2894 1 "  Extension Ext" values ExtensionFlag
  field 2896 1 "  iE_Extensions OPTIONAL" presence
  call GeographicalCoordinates
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The uncertainty code follows the extension container.
rule GA_PointWithUnCertainty {
  field 2900 1 "  iE_Extensions OPTIONAL" presence
  call GeographicalCoordinates
  when "  iE_Extensions OPTIONAL" call iE_Extensions
  call uncertaintyCode
}

rule uncertaintyCode {
  field 3301 7 "  uncertaintyCode"
}

# The polygon: count + 1 corners.
rule GA_Polygon {
  field 2903 4 "  GA_Polygon Count" count Count
  repeat Count { call GA_Polygon_list }
}

rule GA_Polygon_list {
  field 3302 1 "  Extension Ext" values ExtensionFlag
  field 3304 1 "  iE_Extensions OPTIONAL" presence
  call GeographicalCoordinates
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule GA_AltitudeWithUncertaintyAltitude extension 26 {
  field 2906 1 "  Extension Ext" values ExtensionFlag
  field 2908 1 "  iE_Extensions OPTIONAL" presence
  call directionOfAltitude
  call altitude
  call uncertaintyAltitude
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule directionOfAltitude {
  field 3307 1 "  directionOfAltitude" values { 0 "height" 1 "depth" }
}

rule altitude {
  align
  field 3308 16 "  altitude"
}

rule uncertaintyAltitude {
  field 3309 7 "  uncertaintyAltitude"
}

# ------------------------------------------------------------ bit rates and groups

# Four bit rates in a row, each with its own length.
rule BitRateSet extension 28 {
  field 2651 1 "  Extension Ext" values ExtensionFlag
  field 2653 1 "  iE_Extensions OPTIONAL" presence
  call BitRate
  call BitRate
  call BitRate
  call BitRate
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Each Length counts octets less 1; the octets follow aligned, the first one
# on the wire the most significant.
rule BitRate {
  field 2649 2 "  Length" length $Length
  align
  field 2650 octets($Length) "  BitRate"
}

rule ExtensionGroupIdentity extension 31 {
  field 2869 2 "  Length" length $Length
  align
  field 2870 octets($Length) "  ExtensionGroupIdentity"
}

rule IPBTS_ExtensionGroupCheck extension 35 {
  field 2940 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 2943 1 "  IPBTS_ExtensionGroupCheck" values { 0 "available" 1 "unavailable_extension_group_id" } if Ext == 0
}

# ------------------------------------------------------------ transport channels

rule TransportChannelType extension 33 {
  field 3178 1 "  Extension Ext" values ExtensionFlag
  field 3180 1 "  iE_Extensions OPTIONAL" presence
  call ULTransportChannelType
  call DLTransportChannelType
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule ULTransportChannelType {
  field 3183 7 "  ULTransportChannelType"
}

rule DLTransportChannelType {
  field 3184 7 "  DLTransportChannelType"
}

# ------------------------------------------------------------ bands and cells

# The supported bands: count + 1 entries.
rule SupportedBandList extension 38 {
  field 3086 2 "  SupportedBandList Count" count Count
  repeat Count { call SupportedBandList_list }
}

rule SupportedBandList_list {
  field 3327 1 "  Extension Ext" values ExtensionFlag
  field 3329 1 "  iE_Extensions OPTIONAL" presence
  call SupportedBand
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule SupportedBand {
  field 3088 2 "  SupportedBand" values { 0 "band2100M" 1 "band800M" 2 "band1700M" 3 "spare" }
}

# Per-cell information: count + 1 cells.
rule Per_Cell_InformationList extension 39 {
  field 3024 4 "  Per_Cell_InformationList Count" count Count
  repeat Count { call Per_Cell_InformationList_list }
}

# One cell: its C_ID, and optionally its number of available downlink codes,
# its UARFCN and its two restriction states.
rule Per_Cell_InformationList_list {
  field 3310 1 "  Extension Ext" values ExtensionFlag
  field 3312 1 "  nrOfAvailableDLCode OPTIONAL" presence
  field 3314 1 "  uARFCN OPTIONAL" presence
  field 3316 1 "  nonAccessibleRestrictionState OPTIONAL" presence
  field 3318 1 "  constructionRestrictionState OPTIONAL" presence
  field 3320 1 "  iE_Extensions OPTIONAL" presence
  call C_ID
  when "  nrOfAvailableDLCode OPTIONAL" call NrOfAvailableDLCode
  when "  uARFCN OPTIONAL" call UARFCN
  when "  nonAccessibleRestrictionState OPTIONAL" call RestrictionState
  when "  constructionRestrictionState OPTIONAL" call RestrictionState
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule NrOfAvailableDLCode {
  align
  field 2997 16 "  NrOfAvailableDLCode"
}

rule RestrictionState {
  field 3059 1 "  RestrictionState" values { 0 "noRestriction" 1 "restriction" }
}

# The band selection factors of the three bands.
rule BandSelectionFactor extension 40 {
  field 2656 1 "  Extension Ext" values ExtensionFlag
  field 2658 1 "  iE_Extensions OPTIONAL" presence
  call band2100M
  call band1700M
  call band800M
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule band2100M {
  field 3285 4 "  band2100M"
}

rule band1700M {
  field 3286 4 "  band1700M"
}

rule band800M {
  field 3287 4 "  band800M"
}
