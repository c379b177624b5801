# The rows of the key-field table, in row order, by key name. A key field
# stores into the last row of its name; the earlier rows of a repeated name
# and the closing row with the empty name stand in the table unused.

keytable {
  "PDU Type"                      # 0
  "Procedure Code"                # 1
  "Procedure Code"                # 2
  "Procedure Code"                # 3
  "ddMode"                        # 4
  "Criticality"                   # 5
  "ShortTransActionId"            # 6
  "LongTransActionId"             # 7
  "D_RNTI"                        # 8
  "IMSI"                          # 9
  "IMSI"                          # 10
  "IMSI"                          # 11
  "RL_Set_ID"                     # 12
  "SRNC_ID"                       # 13
  "IE"                            # 14
  "C_ID"                          # 15
  "SRNC_ID"                       # 16
  "S_RNTI"                        # 17
  "IPAddress"                     # 18
  "D_RNTI"                        # 19
  "IMSI"                          # 20
  "IMSI"                          # 21
  "IMSI"                          # 22
  "RL_Set_ID"                     # 23
  "D_RNTI"                        # 24
  "IMSI"                          # 25
  "IMSI"                          # 26
  "IMSI"                          # 27
  "RL_Set_ID"                     # 28
  "BindingID"                     # 29
  "LAC"                           # 30
  "RAC"                           # 31
  "Cause TYPE"                    # 32
  "CauseRadioNetwork"             # 33
  "CauseRadioNetworkExt"          # 34
  "CauseTransport"                # 35
  "CauseProtocol"                 # 36
  "CauseMisc"                     # 37
  "CauseMiscExt"                  # 38
  "D_RNTI"                        # 39
  "IMSI"                          # 40
  "IMSI"                          # 41
  "IMSI"                          # 42
  "RL_Set_ID"                     # 43
  "RL_ID1"                        # 44
  "RL_ID2"                        # 45
  "RL_ID3"                        # 46
  "RL_ID4"                        # 47
  "RL_ID5"                        # 48
  "RL_ID6"                        # 49
  "RL_ID7"                        # 50
  "RL_ID8"                        # 51
  "RL_ID9"                        # 52
  "RL_ID10"                       # 53
  "RL_ID11"                       # 54
  "RL_ID12"                       # 55
  "RL_ID13"                       # 56
  "RL_ID14"                       # 57
  "RL_ID15"                       # 58
  "RL_ID16"                       # 59
  "RL_ID"                         # 60
  "RL_ID"                         # 61
  "1st DCH_ID"                    # 62
  "2nd DCH_ID"                    # 63
  "3rd DCH_ID"                    # 64
  "4th DCH_ID"                    # 65
  "5th DCH_ID"                    # 66
  "6th DCH_ID"                    # 67
  "7th DCH_ID"                    # 68
  "8th DCH_ID"                    # 69
  "DCH_ID"                        # 70
  "1st BindingID"                 # 71
  "2nd BindingID"                 # 72
  "3rd BindingID"                 # 73
  "4th BindingID"                 # 74
  "5th BindingID"                 # 75
  "6th BindingID"                 # 76
  "7th BindingID"                 # 77
  "8th BindingID"                 # 78
  "BindingID"                     # 79
  "TransportLayerAddress_1"       # 80
  "TransportLayerAddress_2"       # 81
  "TransportLayerAddress_3"       # 82
  "TransportLayerAddress_4"       # 83
  "TransportLayerAddress_5"       # 84
  "TransportLayerAddress_6"       # 85
  "TransportLayerAddress_7"       # 86
  "TransportLayerAddress_8"       # 87
  "TransportLayerAddress_9"       # 88
  "TransportLayerAddress_10"      # 89
  "TransportLayerAddress"         # 90
  "DCH_ID"                        # 91
  "RNC_ID"                        # 92
  "SAC"                           # 93
  "RL_Set_ID1"                    # 94
  "RL_Set_ID2"                    # 95
  "RL_Set_ID3"                    # 96
  "RL_Set_ID4"                    # 97
  "RL_Set_ID5"                    # 98
  "RL_Set_ID6"                    # 99
  "RL_Set_ID7"                    # 100
  "RL_Set_ID8"                    # 101
  "RL_Set_ID9"                    # 102
  "RL_Set_ID10"                   # 103
  "RL_Set_ID11"                   # 104
  "RL_Set_ID12"                   # 105
  "RL_Set_ID13"                   # 106
  "RL_Set_ID14"                   # 107
  "RL_Set_ID15"                   # 108
  "RL_Set_ID16"                   # 109
  "RL_Set_ID"                     # 110
  "SuccSetupRL_ID1"               # 111
  "SuccSetupRL_ID2"               # 112
  "SuccSetupRL_ID3"               # 113
  "SuccSetupRL_ID4"               # 114
  "SuccSetupRL_ID5"               # 115
  "SuccSetupRL_ID6"               # 116
  "SuccSetupRL_ID7"               # 117
  "SuccSetupRL_ID8"               # 118
  "SuccSetupRL_ID9"               # 119
  "SuccSetupRL_ID10"              # 120
  "SuccSetupRL_ID11"              # 121
  "SuccSetupRL_ID12"              # 122
  "SuccSetupRL_ID13"              # 123
  "SuccSetupRL_ID14"              # 124
  "SuccSetupRL_ID15"              # 125
  "SuccSetupRL_ID16"              # 126
  "SuccSetupRL_ID"                # 127
  "SuccSetupRL_Set_ID1"           # 128
  "SuccSetupRL_Set_ID2"           # 129
  "SuccSetupRL_Set_ID3"           # 130
  "SuccSetupRL_Set_ID4"           # 131
  "SuccSetupRL_Set_ID5"           # 132
  "SuccSetupRL_Set_ID6"           # 133
  "SuccSetupRL_Set_ID7"           # 134
  "SuccSetupRL_Set_ID8"           # 135
  "SuccSetupRL_Set_ID9"           # 136
  "SuccSetupRL_Set_ID10"          # 137
  "SuccSetupRL_Set_ID11"          # 138
  "SuccSetupRL_Set_ID12"          # 139
  "SuccSetupRL_Set_ID13"          # 140
  "SuccSetupRL_Set_ID14"          # 141
  "SuccSetupRL_Set_ID15"          # 142
  "SuccSetupRL_Set_ID16"          # 143
  "SuccSetupRL_Set_ID"            # 144
  "UL_ScramblingCodeNumber"       # 145
  "UnSuccSetupRL_ID1"             # 146
  "UnSuccSetupRL_ID2"             # 147
  "UnSuccSetupRL_ID3"             # 148
  "UnSuccSetupRL_ID4"             # 149
  "UnSuccSetupRL_ID5"             # 150
  "UnSuccSetupRL_ID6"             # 151
  "UnSuccSetupRL_ID7"             # 152
  "UnSuccSetupRL_ID8"             # 153
  "UnSuccSetupRL_ID9"             # 154
  "UnSuccSetupRL_ID10"            # 155
  "UnSuccSetupRL_ID11"            # 156
  "UnSuccSetupRL_ID12"            # 157
  "UnSuccSetupRL_ID13"            # 158
  "UnSuccSetupRL_ID14"            # 159
  "UnSuccSetupRL_ID15"            # 160
  "UnSuccSetupRL_ID16"            # 161
  "UnSuccSetupRL_ID"              # 162
  ""                              # 163
}
