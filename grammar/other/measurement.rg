# Dedicated measurements: what is measured, on which radio links or radio
# link sets, how reporting is triggered, and the values that come back.
#
# The object of a measurement is three levels of containers: the object
# choice holds a protocolIEs container with one item IE, the item holds a
# container list, and each container holds the information item IEs of the
# radio links or sets. Nothing but the IE id ties an item to its object.

values MeasurementObjectKind { 0 "rLs" 1 "rLS" 2 "allRL" 3 "allRLS" }
values MeasurementQuantity { 0 "sir" 1 "sir_error" 2 "transmitted_code_power" 3 "rscp" }

# ------------------------------------------------------------ what is measured

rule DedicatedMeasurementType ie 74 {
  field 2782 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2785 2 "  DedicatedMeasurementType" values { 0 "sir" 1 "sir_error" 2 "transmitted_code_power" 3 "rSCP" }
  }
}

# The filter coefficients run k0 to k9, then in odd steps to k19.
rule MeasurementFilterCoefficient ie 92 {
  field 2958 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2961 4 "  MeasurementFilterCoefficient" values {
      0 "k0" 1 "k1" 2 "k2" 3 "k3" 4 "k4" 5 "k5" 6 "k6" 7 "k7" 8 "k8" 9 "k9"
      10 "k11" 11 "k13" 12 "k15" 13 "k17" 14 "k19"
    }
  }
}

# One to four octets; the Length counts them less 1.
rule MeasurementID ie 93 {
  field 2963 2 "  Length" length $Length
  align
  field 2964 octets($Length) "  MeasurementID"
}

# ------------------------------------------------------------ the object

# A request names single radio links or sets only: allRL and allRLS read
# nothing.
rule DedicatedMeasurementObjectType_DM_Rqst ie 72 {
  field 2345 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2348 2 "  DedicatedMeasurementObjectType_DM_Rqst Index" values { 0 "rL" 1 "rLS" 2 "allRL" 3 "allRLS" } keep Index
    if Index == 0 {
      call RL_DM_Rqst
    }
    if Index == 1 {
      call RL_Set_DM_Rqst
    }
  }
}

family DedicatedMeasurementObjectType_DM_{M} {
  member Rsp 2374 ie 73
  member Rprt 2413 ie 71
} {
  field ~2374 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field ~2377 2 "  DedicatedMeasurementObjectType_DM_{M} Index" values MeasurementObjectKind keep Index
    if Index == 0 {
      call RL_DM_{M}
    }
    if Index == 1 {
      call RL_Set_DM_{M}
    }
    if Index == 2 {
      call AllRL_DM_{M}
    }
    if Index == 3 {
      call AllRL_Set_DM_{M}
    }
  }
}

# Each object kind is an IE container that holds its item IE.
rule RL_DM_Rqst { call protocolIEs }
rule RL_Set_DM_Rqst { call protocolIEs }
rule RL_DM_Rsp { call protocolIEs }
rule RL_Set_DM_Rsp { call protocolIEs }
rule AllRL_DM_Rsp { call protocolIEs }
rule AllRL_Set_DM_Rsp { call protocolIEs }
rule RL_DM_Rprt { call protocolIEs }
rule RL_Set_DM_Rprt { call protocolIEs }
rule AllRL_DM_Rprt { call protocolIEs }
rule AllRL_Set_DM_Rprt { call protocolIEs }

# The item IEs: each holds the container list of its radio links or sets;
# the items of all radio links use the lists of single ones.
family {M} {
  member RLItem_DM_Rqst 2351 ie 139
  member RL_SetItem_DM_Rqst 2364 ie 149
  member RLItem_DM_Rsp 2380 ie 140
  member RL_SetItem_DM_Rsp 2385 ie 150
  member AllRLItem_DM_Rsp 2390 ie 1
  member AllRL_SetItem_DM_Rsp 2395 ie 3
  member RLItem_DM_Rprt 2419 ie 138
  member RL_SetItem_DM_Rprt 2424 ie 148
  member AllRLItem_DM_Rprt 2429 ie 0
  member AllRL_SetItem_DM_Rprt 2434 ie 2
} {
  field ~2351 1 "  Extension Ext" values ExtensionFlag
  field ~2353 1 "  iE_Extensions OPTIONAL" presence
  only RLItem_DM_Rqst { call RL_InformationList_DM_Rqst }
  only RL_SetItem_DM_Rqst { call RL_Set_InformationList_DM_Rqst }
  only RLItem_DM_Rsp AllRLItem_DM_Rsp { call RL_InformationList_DM_Rsp }
  only RL_SetItem_DM_Rsp AllRL_SetItem_DM_Rsp { call RL_Set_InformationList_DM_Rsp }
  only RLItem_DM_Rprt AllRLItem_DM_Rprt { call RL_InformationList_DM_Rprt }
  only RL_SetItem_DM_Rprt AllRL_SetItem_DM_Rprt { call RL_Set_InformationList_DM_Rprt }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# The lists count their containers less 1 and load the position counters of
# the numbered RL fields.
rule RL_InformationList_DM_Rqst { call ContainerList3358 }
rule RL_InformationList_DM_Rsp { call ContainerList3358 }
rule RL_InformationList_DM_Rprt { call ContainerList3358 }
rule RL_Set_InformationList_DM_Rqst { call ContainerList3383 }
rule RL_Set_InformationList_DM_Rsp { call ContainerList3383 }
rule RL_Set_InformationList_DM_Rprt { call ContainerList3383 }

# The information items: a radio link, numbered by its place in the list,
# with its measured value in a response or report.
family RL_InformationItem_DM_{M} {
  member Rqst 2356 ie 121
  member Rsp 2400 ie 122
  member Rprt 2439 ie 120
} {
  field ~2356 1 "  Extension Ext" values ExtensionFlag
  field ~2358 1 "  dPCH_ID OPTIONAL" presence
  field ~2360 1 "  iE_Extensions OPTIONAL" presence
  call RL_ID_Numbered
  when "  dPCH_ID OPTIONAL" call DPCH_ID
  only Rsp Rprt { call DedicatedMeasurementValue }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# A radio link set: numbered in a request and a report, plain in a response.
family RL_Set_InformationItem_DM_{M} {
  member Rqst 2369 ie 144
  member Rsp 2408 ie 145
  member Rprt 2447 ie 143
} {
  field ~2369 1 "  Extension Ext" values ExtensionFlag
  field ~2371 1 "  iE_Extensions OPTIONAL" presence
  only Rqst Rprt { call rlCount }
  only Rsp { call RL_Set_ID }
  only Rsp Rprt { call DedicatedMeasurementValue }
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# ------------------------------------------------------------ measured values

# The values are raw steps of their scale, with no offset applied.
rule DedicatedMeasurementValue {
  field 2787 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2790 2 "  DedicatedMeasurementValue Index" values { 0 "sIR_Value" 1 "sIR_ErrorValue" 2 "transmittedCodePowerValue" 3 "rSCP" } keep Index
    if Index == 0 {
      call SIR_Value
    }
    if Index == 1 {
      call SIR_Error_Value
    }
    if Index == 2 {
      call Transmitted_Code_Power_Value
    }
    if Index == 3 {
      call RSCP_Value
    }
  }
}

rule SIR_Value { field 3070 6 "  SIR_Value" }
rule SIR_Error_Value { field 3068 7 "  SIR_Error_Value" }
rule Transmitted_Code_Power_Value { field 3139 7 "  Transmitted_Code_Power_Value" }
rule RSCP_Value { field 3057 7 "  RSCP_Value" }

# ------------------------------------------------------------ reporting

# On demand reads nothing further; every other kind has a rule of its own.
rule ReportCharacteristics ie 152 {
  field 3042 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3045 3 "  ReportCharacteristics Index" values {
      0 "onDemand" 1 "periodic" 2 "eventA" 3 "eventB" 4 "eventC" 5 "eventD" 6 "eventE" 7 "eventF"
    } keep Index
    if Index == 1 {
      call Periodic
    }
    if Index == 2 {
      call EventA
    }
    if Index == 3 {
      call EventB
    }
    if Index == 4 {
      call EventC
    }
    if Index == 5 {
      call EventD
    }
    if Index == 6 {
      call EventE
    }
    if Index == 7 {
      call EventF
    }
  }
}

rule Periodic {
  field 3007 1 "  Extension Ext" values ExtensionFlag
  field 3009 1 "  iE_Extensions OPTIONAL" presence
  call ReportPeriodicity
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# A period in tens of milliseconds or in minutes, each stored less 1.
rule ReportPeriodicity {
  field 3048 1 "  ReportPeriodicity Index" values { 0 "ten_msec" 1 "min" } keep Index
  if Index == 0 {
    call ReportPeriodicity_ten_msec
  }
  if Index == 1 {
    call ReportPeriodicity_min
  }
}

rule ReportPeriodicity_ten_msec { align; field 3050 16 "  ReportPeriodicity_ten_msec" plus 1 }
rule ReportPeriodicity_min { field 3051 6 "  ReportPeriodicity_min" plus 1 }

# Events A and B: a threshold crossed, optionally held for a hysteresis time.
family Event{M} {
  member A 2814
  member B 2822
} {
  field ~2814 1 "  Extension Ext" values ExtensionFlag
  field ~2816 1 "  measurementHysteresisTime OPTIONAL" presence
  field ~2818 1 "  iE_Extensions OPTIONAL" presence
  call MeasurementThreshold
  when "  measurementHysteresisTime OPTIONAL" call MeasurementHysteresisTime
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Events C and D: a rise or fall by more than a step within a change time.
family Event{M} {
  member C 2830
  member D 2835
} {
  field ~2830 1 "  Extension Ext" values ExtensionFlag
  field ~2832 1 "  iE_Extensions OPTIONAL" presence
  call MeasurementIncreaseDecreaseThreshold
  call MeasurementChangeTime
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Events E and F: a band between two thresholds, with optional hysteresis and
# a period for repeated reports.
family Event{M} {
  member E 2840
  member F 2854
} {
  field ~2840 1 "  Extension Ext" values ExtensionFlag
  field ~2842 1 "  measurementThreshold2 OPTIONAL" presence
  field ~2844 1 "  measurementHysteresisTime OPTIONAL" presence
  field ~2846 1 "  reportPeriodicity OPTIONAL" presence
  field ~2848 1 "  iE_Extensions OPTIONAL" presence
  call MeasurementThreshold
  when "  measurementThreshold2 OPTIONAL" call MeasurementThreshold
  when "  measurementHysteresisTime OPTIONAL" call MeasurementHysteresisTime
  when "  reportPeriodicity OPTIONAL" call ReportPeriodicity
  when "  iE_Extensions OPTIONAL" call iE_Extensions
}

# Times stored less 1.
rule MeasurementHysteresisTime { align; field 2969 16 "  MeasurementHysteresisTime" plus 1 }
rule MeasurementChangeTime { align; field 2968 16 "  MeasurementChangeTime" plus 1 }

# A threshold is a value of the measured quantity, on the same raw scale.
rule MeasurementThreshold {
  field 2976 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2979 2 "  MeasurementThreshold Index" values MeasurementQuantity keep Index
    if Index == 0 {
      call SIR_Value
    }
    if Index == 1 {
      call SIR_Error_Value
    }
    if Index == 2 {
      call Transmitted_Code_Power_Value
    }
    if Index == 3 {
      call RSCP_Value
    }
  }
}

# A step of rise or fall; only the code power step has an extension bit.
rule MeasurementIncreaseDecreaseThreshold {
  field 2970 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 2973 2 "  MeasurementIncreaseDecreaseThreshold Index" values MeasurementQuantity keep Index
    if Index == 0 {
      call SIR_Value_IncrDecrThres
    }
    if Index == 1 {
      call SIR_Error_Value_IncrDecrThres
    }
    if Index == 2 {
      call Transmitted_Code_Power_Value_IncrDecrThres
    }
    if Index == 3 {
      call RSCP_Value_IncrDecrThres
    }
  }
}

rule SIR_Value_IncrDecrThres { field 3071 6 "  SIR_Value_IncrDecrThres" }
rule SIR_Error_Value_IncrDecrThres { field 3069 7 "  SIR_Error_Value_IncrDecrThres" }
rule RSCP_Value_IncrDecrThres { field 3058 7 "  RSCP_Value_IncrDecrThres" }

rule Transmitted_Code_Power_Value_IncrDecrThres {
  field 3140 1 "  Extension Bit" values ExtensionFlag keep Ext
  if Ext == 0 {
    field 3143 7 "  Transmitted_Code_Power_Value_IncrDecrThres"
  }
}
