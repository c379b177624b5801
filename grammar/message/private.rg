# The private message (procedure 15): the private form of the IE frame, the
# private identifier, and the nine message bodies of the Vorel dialect.
#
# Each entry of the private list is one dialect message. Its identifier is a
# local number or an object identifier; only the object identifier's last
# sub-identifier, "  IE", names the body. A local identifier leaves $IeId as
# it was, so the entry takes the body of the entry before it, or of id 0 for
# the first entry of a message.

# ------------------------------------------------------------ the IE frame

# One private IE: identifier, criticality, length determinant, the body
# chosen by $IeId, and a closing alignment. As in the public frame the length
# is kept but never bounds or skips the body.
rule RNSAP_IE_Private "RNSAP_IE" {
  align
  call PrivateIE_ID
  call Criticality
  align
  field 3390 1 "  IE LENGTH Type" keep $LengthForm
  field 3393 7 "  IE LENGTH" keep $IeLength if $LengthForm == 0
  if $LengthForm != 0 {
    field 3395 1 "  IE LENGTH Type2"
    field 3396 14 "  IE LENGTH" keep $IeLength
  }
  dispatch $IeId private
  align
}

# ------------------------------------------------------------ the identifier

# The private identifier: local number or object identifier.
rule PrivateIE_ID {
  field 3218 1 "  PrivateIE_ID Index" values { 0 "local" 1 "global" } keep Index
  call PrivateIE_ID_local if Index == 0
  call global if Index == 1
}

# The object identifier of the dialect: five sub-identifiers at fixed places,
# 1st, nation, company, protocol and IE. Nation and company are one to three
# octets long; each octet's first bit says that another octet follows, and
# those bits are looked at before the value is read:
#   A = first bit of the first octet,
#   B = first bit of the second octet (only looked at if A is 1, else 0),
#   C = first bit of the third octet (only looked at if B is 1, else 0).
# A-B-C 1-1-0 gives three octets, 1-0-0 two, anything else one (so 1-1-1,
# a fourth octet announced, also reads one). Each octet gives its last seven
# bits to the value; its first bit is consumed with it. The identifier's own
# size is read and shown, nothing depends on it. The first sub-identifier's
# extension indicator shares the length-form variable with the size type; the
# looked-at bits are kept apart, per sub-identifier.
rule global {
  align
  field 3220 1 "  Private IE ID SIZE Type" keep $LengthForm
  field 3223 7 "  Private IE ID SIZE" if $LengthForm == 0
  if $LengthForm != 0 {
    field 3225 1 "  Private IE ID SIZE Type2"
    field 3226 14 "  Private IE ID SIZE " altname "Private IE ID SIZE"
  }
  field 3227 1 "  SubIdentifier Extention Indicator" keep $LengthForm
  field 3230 7 "  1st SubIdentifier" if $LengthForm == 0

  # The nation.
  field 3231 peek(0, 1) "  SubIdentifier 2 Extention Indicator" keep NationA
  if NationA == 1 {
    field 3234 peek(8, 1) "  SubIdentifier 2 Extention Indicator" keep NationB
  } else {
    set NationB = 0
  }
  if NationB == 1 {
    field 3239 peek(16, 1) "  SubIdentifier 2 Extention Indicator" keep NationC
  } else {
    set NationC = 0
  }
  if NationA == 1 && NationB == 1 && NationC == 0 {
    field 3244 groups(1-7, 9-15, 17-23) "  Nation"
  } else if NationA == 1 && NationB == 0 {
    field 3248 groups(1-7, 9-15) "  Nation" values { 440 "Japan" } format '    Nation=%-S (%u)' display '%-S'
  } else {
    field 3250 groups(1-7) "  Nation"
  }

  # The company.
  field 3251 peek(0, 1) "  SubIdentifier 3 Extention Indicator" keep CompanyA
  if CompanyA == 1 {
    field 3254 peek(8, 1) "  SubIdentifier 3 Extention Indicator" keep CompanyB
  } else {
    set CompanyB = 0
  }
  if CompanyB == 1 {
    field 3259 peek(16, 1) "  SubIdentifier 3 Extention Indicator" keep CompanyC
  } else {
    set CompanyC = 0
  }
  if CompanyA == 1 && CompanyB == 1 && CompanyC == 0 {
    field 3264 groups(1-7, 9-15, 17-23) "  Company" values { 200043 "vorel" } format '    Company=%-S (%u)' display '%-S'
  } else if CompanyA == 1 && CompanyB == 0 {
    field 3268 groups(1-7, 9-15) "  Company"
  } else {
    field 3270 groups(1-7) "  Company"
  }

  # Protocol and IE: one octet each, their extension indicators not tested.
  field 3271 1 "  SubIdentifier 4 Extention Indicator"
  field 3272 7 "  Protocol" values { other "not defined" 1 "nbap" 2 "ranap" 3 "rnsap" } format '    Protocol=%-S (%u)' display '%-S'
  field 3273 1 "  SubIdentifier 5 Extention Indicator"
  field 3274 7 "  IE" values PrivateIeNames keep $IeId key
}

# The names of "  IE" are those of the dialect's message bodies.
values PrivateIeNames {
  0 "SCCP_ConnectionSetupRequest"
  1 "SCCP_ConnectionSetupResponse"
  2 "OAM_InformationRequest"
  3 "OAM_InformationResponse"
  4 "TRAFFIC_CongestionIndication"
  5 "ResetResourceRequest"
  6 "ResetResourceResponse"
  7 "ExtensionInformationRequest"
  8 "ExtensionInformationResponse"
}

# ------------------------------------------------------------ the bodies

rule SCCP_ConnectionSetupRequest private 0 {
  field 2551 1 "  Extension Ext" values ExtensionFlag
  call C_ID
}

rule SCCP_ConnectionSetupResponse private 1 {
  field 2552 1 "  Extension Ext" values ExtensionFlag
  field 2554 1 "  iE_Extensions OPTIONAL" presence
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule OAM_InformationRequest private 2 {
  field 2557 1 "  Extension Ext" values ExtensionFlag
  call ReportType
}

rule OAM_InformationResponse private 3 {
  field 2558 1 "  Extension Ext" values ExtensionFlag
  call OAM_Information
}

# The O&M information: a count of octets less 1, then the octets, the last
# octet on the wire the most significant. Aligned again only from 3 octets.
rule OAM_Information {
  align
  field 2998 8 "  OAM_Information Length" count Octets
  align if Octets > 2
  field 3001 octetsback(Octets) "  OAM_Information"
}

rule TRAFFIC_CongestionIndication private 4 {
  field 2559 1 "  Extension Ext" values ExtensionFlag
  call S_RNTI
  call CompleteUC_ID
}

# The reset messages carry public IEs (ResetType, IPAddressSet) in a private
# IE container.
rule ResetResourceRequest private 5 {
  field 2560 1 "  Extension Ext" values ExtensionFlag
  field 2562 1 "  protocolExtensions OPTIONAL" presence
  call PrivateIEContainer
  when "  protocolExtensions OPTIONAL" call iE_Extensions
}

rule ResetResourceResponse private 6 {
  field 2578 1 "  Extension Ext" values ExtensionFlag
  field 2580 1 "  protocolExtensions OPTIONAL" presence
  call PrivateIEContainer
  when "  protocolExtensions OPTIONAL" call iE_Extensions
}

# The extension messages run the extension loop with the count as read: a
# count of 0 reads no extension.
rule ExtensionInformationRequest private 7 {
  field 2583 1 "  Extension Ext" values ExtensionFlag
  field 2585 1 "  protocolExtensions OPTIONAL" presence
  align
  field 2587 16 "  ProtocolExtensionContainer COUNT" keep $ExtensionCount
  repeat $ExtensionCount { call RNSAP_EXTENSIONS }
  when "  protocolExtensions OPTIONAL" call iE_Extensions
}

rule ExtensionInformationResponse private 8 {
  field 2590 1 "  Extension Ext" values ExtensionFlag
  field 2592 1 "  protocolExtensions OPTIONAL" presence
  align
  field 2594 16 "  ProtocolExtensionContainer COUNT" keep $ExtensionCount
  repeat $ExtensionCount { call RNSAP_EXTENSIONS }
  when "  protocolExtensions OPTIONAL" call iE_Extensions
}

# The private IE container: a count as read, then that many public IEs.
rule PrivateIEContainer "" {
  align
  field 3386 16 "  PrivateIEContainer COUNT" keep $PrivateIeCount
  repeat $PrivateIeCount { call RNSAP_IE }
}

# ------------------------------------------------------------ public IEs of the reset messages

# The reset type: a node reset carries nothing more, a call reset the list of
# IP address sets whose calls are reset.
rule ResetType ie 204 {
  field 2565 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2568 1 "  ResetType Index" values { 0 "nodeReset" 1 "callReset" } keep Index
    call CallReset_ResetResourceRqst if Index == 1
  }
}

rule CallReset_ResetResourceRqst {
  field 2571 1 "  Extension Ext" values ExtensionFlag
  field 2573 1 "  iE_Extensions OPTIONAL" presence
  call IPAddressSetList_ResetResourceRqst
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The list holds count + 1 protocol IE containers. The reads of each
# container stand here in place, as in the rule protocolIEs: alignment, its
# IE count (which also loads the RL position counters), and its IEs.
rule IPAddressSetList_ResetResourceRqst {
  field 2576 7 "  IPAddressSetList_ResetResourceRqst Count" length Count
  repeat Count {
    align
    field 3354 16 "  ProtocolIEContainer COUNT" keep $ProtocolIeCount
    set $RlIdPosition = $ProtocolIeCount
    set $RlSetIdPosition = $ProtocolIeCount
    repeat $ProtocolIeCount { call RNSAP_IE }
  }
}
