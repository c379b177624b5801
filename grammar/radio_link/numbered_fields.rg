# The RL_ID of the radio link lists. The FDD items read it numbered: each
# place in a list has a field of its own, chosen by the position counter that
# the list's count loaded, so the first item of a list of three reads RL_ID3.
# Any other counter value reads the unnumbered field. The TDD items read the
# plain field.

rule RL_ID_Numbered "RL_ID" {
  select $RlIdPosition (id label) {
    1: 3400 "  RL_ID1"
    2: 3404 "  RL_ID2"
    3: 3408 "  RL_ID3"
    4: 3412 "  RL_ID4"
    5: 3416 "  RL_ID5"
    6: 3420 "  RL_ID6"
    7: 3424 "  RL_ID7"
    8: 3428 "  RL_ID8"
    9: 3432 "  RL_ID9"
    10: 3436 "  RL_ID10"
    11: 3440 "  RL_ID11"
    12: 3444 "  RL_ID12"
    13: 3448 "  RL_ID13"
    14: 3452 "  RL_ID14"
    15: 3456 "  RL_ID15"
    16: 3460 "  RL_ID16"
    else: 3462 "  RL_ID"
  } {
    field id 5 label key
  }
  set $RlIdPosition = $RlIdPosition - 1
}

rule RL_ID {
  field 3054 5 "  RL_ID" key
}
