# Addresses and identities: cells, RNCs, mobiles, location and service areas,
# transport bearers and IP endpoints.
#
# Most identities are a 16-bit number behind an alignment. The variable forms
# differ in how their length is stored (octets or bits, less 1 or less 3) and
# in how their value is cut into segments (bits, half-octets, octets, forward
# or backward); the segments are what the element-list formats and the key
# store work on.
#
# BindingID, TransportLayerAddress and DCH_ID each come in two forms. The
# short forms are plain rules. The numbered forms choose field id and label
# by a position counter ($BindingIdPosition, $TransportLayerAddressPosition,
# $DchIdPosition: signed, 0 at the start of a pass), which the lists of DCH
# items load with their count; each read counts its counter down by 1, so the
# first item of a list of three is the "3rd", the last the "1st". A counter
# outside the numbered range gives the plain field.

# ------------------------------------------------------------------ cells

rule C_ID ie 6 {
  align
  field 2689 16 "  C_ID" key
}

rule UC_ID ie 166 {
  field 3194 1 "  Extension Ext" values ExtensionFlag
  field 3196 1 "  iE_Extensions OPTIONAL" presence
  call RNC_ID
  call C_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule CompleteUC_ID {
  field 2709 1 "  Extension Ext" values ExtensionFlag
  field 2711 1 "  iE_Extensions OPTIONAL" presence
  call CompleteRNC_ID
  call C_ID
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ RNCs

# IE 157 is shown as id_SRNC_ID; its value is the RNC_ID.
rule RNC_ID ie 157 {
  align
  field 3056 16 "  RNC_ID" key
}

rule SRNC_Identity {
  align
  field 3073 16 "  SRNC_ID" key
}

# ------------------------------------------------------------------ mobiles

# SIZE is the number of octets less 1; the value is read bit by bit.
rule S_RNTI ie 155 {
  field 3075 2 "  S_RNTI SIZE" length Octets
  align
  field 3077 bits(Octets*8) "  S_RNTI" key
}

# The U-RNTI has no field of its own: the serving RNC, then the S-RNTI.
rule U_RNTI extension 13 {
  call SRNC_Identity
  call S_RNTI
}

# SIZE is the number of octets less 3. Eight octets are the usual 15-digit
# IMSI: its digits are swapped within each octet, and the high half of the
# last octet is looked at first: a filler of 15 leaves 15 digits, any other
# value makes it a 16th digit. Every other length is read digit by digit in
# wire order.
rule IMSI ie 84 {
  field 2914 3 "  IMSI SIZE" plus 3 keep Octets
  align
  if Octets != 8 {
    field 2918 nibbles(Octets*2) "  IMSI" show '%-["%x"]' key
  }
  if Octets == 8 {
    field 2920 peek(56, 4) "  Filler" keep Filler format '' display '%u'
    if Filler == 15 {
      field 2923 digitpairs(8, 15) "IMSI" format '  IMSI=%-["%x"]' key
    }
    if Filler != 15 {
      field 2925 digitpairs(8) "IMSI" format '  IMSI=%-["%x"]' key
    }
  }
}

# ------------------------------------------------------------------ areas

# Three octets, the last one on the wire the most significant.
rule PLMN_ID {
  align
  field 3012 octetsback(3) "  PLMN_ID" show '%x'
}

# LAC and SAC are shown digit by digit; the short display gives the number.
rule LAC {
  field 2945 nibbles(4) "  LAC" show '%-["%x"]' display '%x' key
}

rule SAC {
  field 3060 nibbles(4) "  SAC" show '%-["%x"]' display '%x' key
}

rule RAC {
  field 3027 8 "  RAC" show '%x' key
}

rule SAI ie 156 {
  field 3062 1 "  iE_Extensions OPTIONAL" presence
  call PLMN_ID
  call LAC
  call SAC
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule CN_CS_DomainIdentifier ie 9 {
  field 2737 1 "  iE_Extensions OPTIONAL" presence
  call PLMN_ID
  call LAC
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule CN_PS_DomainIdentifier ie 10 {
  field 2741 1 "  iE_Extensions OPTIONAL" presence
  call PLMN_ID
  call LAC
  call RAC
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------------ IP endpoints

rule IPAddressSet ie 205 extension 34 {
  field 2935 1 "  Extension Ext" values ExtensionFlag
  field 2937 1 "  iE_Extensions OPTIONAL" presence
  call IPAddress
  call UDPPortNumber
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The Extension Bit is read and not tested: the length always follows. The
# length counts bits less 1. Below 8 bits the address is read bit by bit,
# backward; from 8 bits on in whole octets (the remainder bits stay in the
# stream), each octet with its first wire bit least significant, shown as a
# dotted address.
rule IPAddress {
  field 2927 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 2928 8 "  IPAddress Length" length Bits
  align
  if Bits < 8 {
    field 2932 bitsback(Bits) "  IPAddress" show '%b'
  }
  if Bits >= 8 {
    field 2934 octetsmirrored(Bits/8) "IPAddress" show '%-["%u":"."]' key
  }
}

rule UDPPortNumber {
  align
  field 3212 16 "  UDPPortNumber"
}

# ------------------------------------------------------------------ binding ids

# Short form. The length counts octets less 1; with the Extension Bit set it
# is not read and the length of the last binding id of this form stands
# (0 at the start of a pass). The value is read in any case, last octet on the
# wire first.
rule BindingID ie 5 {
  field 2599 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 2602 2 "  BindingID Length" count Octets if Ext == 0
  align if Octets > 2
  field 2606 octetsback(Octets) "  BindingID" show '%-["%x"]' display '%x' key
}

# Numbered form: SIZE counts octets less 1, the value is read as 2 x octets
# digits.
rule BindingID_Numbered "BindingID" {
  field 2607 1 "  BindingID EXTENSION" show '%x'
  field 2608 2 "  BindingID SIZE" length Octets
  align
  select $BindingIdPosition (id label) {
    1: 2612 "1st BindingID"
    2: 2616 "2nd BindingID"
    3: 2620 "3rd BindingID"
    4: 2624 "4th BindingID"
    5: 2628 "5th BindingID"
    6: 2632 "6th BindingID"
    7: 2636 "7th BindingID"
    8: 2640 "8th BindingID"
    else: 2642 "BindingID"
  } {
    field id nibbles(Octets*2) label key
  }
  set $BindingIdPosition = $BindingIdPosition - 1
}

# ------------------------------------------------------------------ transport layer addresses

# Short form. The length counts bits less 1; with the Extension Bit set it is
# not read and the last length of this form stands. Every counted bit is read,
# backward; the alignment only comes before addresses of more than 16 bits.
rule TransportLayerAddress ie 165 {
  field 3164 1 "  Extension Bit" values ExtensionFlag keep Ext
  field 3167 8 "  TransportLayerAddress Length" count Bits if Ext == 0
  align if Bits > 16
  field 3171 bitsback(Bits) "  TransportLayerAddress" show '%s'
}

# Numbered form: all three fields are numbered by the counter as it stands at
# the start. SIZE counts bits less 1, but only whole octets are read (the
# remainder bits stay in the stream), each octet as its two half-octets in
# wire order.
rule TransportLayerAddress_Numbered "TransportLayerAddress" {
  select $TransportLayerAddressPosition (ext size id label) {
    1: 3730 3731 3733 "TransportLayerAddress_1"
    2: 3737 3738 3740 "TransportLayerAddress_2"
    3: 3744 3745 3747 "TransportLayerAddress_3"
    4: 3751 3752 3754 "TransportLayerAddress_4"
    5: 3758 3759 3761 "TransportLayerAddress_5"
    6: 3765 3766 3768 "TransportLayerAddress_6"
    7: 3772 3773 3775 "TransportLayerAddress_7"
    8: 3779 3780 3782 "TransportLayerAddress_8"
    9: 3786 3787 3789 "TransportLayerAddress_9"
    10: 3793 3794 3796 "TransportLayerAddress_10"
    else: 3798 3799 3801 "TransportLayerAddress"
  } {
    field ext 1 "  TransportLayerAddress EXTENSION" show '%x'
    field size 8 "  TransportLayerAddress SIZE" length Bits
    align
    field id octetnibbles(Bits/8) label show '%-["%X":"-"]' key
  }
  set $TransportLayerAddressPosition = $TransportLayerAddressPosition - 1
}

# ------------------------------------------------------------------ DCH ids

# Short form, in the TDD items.
rule DCH_ID {
  align
  field 2747 8 "  DCH_ID" key
}

# Numbered form, in the FDD items.
rule DCH_ID_Numbered "DCH_ID" {
  align
  select $DchIdPosition (id label) {
    1: 2750 "1st DCH_ID"
    2: 2754 "2nd DCH_ID"
    3: 2758 "3rd DCH_ID"
    4: 2762 "4th DCH_ID"
    5: 2766 "5th DCH_ID"
    6: 2770 "6th DCH_ID"
    7: 2774 "7th DCH_ID"
    8: 2778 "8th DCH_ID"
    else: 2780 "DCH_ID"
  } {
    field id 8 label key
  }
  set $DchIdPosition = $DchIdPosition - 1
}

# ------------------------------------------------------------------ geographical coordinates

rule GeographicalCoordinates {
  field 2889 1 "  Extension Ext" values ExtensionFlag
  field 2891 1 "  iE_Extensions OPTIONAL" presence
  call latitudeSign
  call latitude
  call longitude
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

rule latitudeSign {
  field 3296 1 "  latitudeSign" values { 0 "north" 1 "south" }
}

# Each Length counts octets less 1.
rule latitude {
  field 3297 2 "  Length" length Octets
  align
  field 3298 octets(Octets) "  latitude"
}

# The longitude is stored offset by 2^23.
rule longitude {
  field 3299 2 "  Length" length Octets show '%u octets'
  align
  field 3300 octets(Octets) "  longitude" plus 8388608
}
