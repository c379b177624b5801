# The radio link and radio link set ids of the lists. The FDD items read them
# numbered: each place in a list has a field of its own, chosen by a position
# counter that the list's count loaded ($RlIdPosition for the RL ids,
# $RlSetIdPosition for the RL set ids), so the first item of a list of three
# reads the third field. Any other counter value reads the unnumbered field.
# Each read counts its counter down by 1. The TDD items read the plain fields.

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

rule rlCount {
  select $RlSetIdPosition (id label) {
    1: 3466 "  RL_Set_ID1"
    2: 3470 "  RL_Set_ID2"
    3: 3474 "  RL_Set_ID3"
    4: 3478 "  RL_Set_ID4"
    5: 3482 "  RL_Set_ID5"
    6: 3486 "  RL_Set_ID6"
    7: 3490 "  RL_Set_ID7"
    8: 3494 "  RL_Set_ID8"
    9: 3498 "  RL_Set_ID9"
    10: 3502 "  RL_Set_ID10"
    11: 3506 "  RL_Set_ID11"
    12: 3510 "  RL_Set_ID12"
    13: 3514 "  RL_Set_ID13"
    14: 3518 "  RL_Set_ID14"
    15: 3522 "  RL_Set_ID15"
    16: 3526 "  RL_Set_ID16"
    else: 3528 "  RL_Set_ID"
  } {
    field id 5 label key
  }
  set $RlSetIdPosition = $RlSetIdPosition - 1
}

# The setup failure names the radio links it set up and those it could not.
rule rLCount_SuccSetupRL_ID "rLCount" {
  select $RlIdPosition (id label) {
    1: 3532 "  SuccSetupRL_ID1"
    2: 3536 "  SuccSetupRL_ID2"
    3: 3540 "  SuccSetupRL_ID3"
    4: 3544 "  SuccSetupRL_ID4"
    5: 3548 "  SuccSetupRL_ID5"
    6: 3552 "  SuccSetupRL_ID6"
    7: 3556 "  SuccSetupRL_ID7"
    8: 3560 "  SuccSetupRL_ID8"
    9: 3564 "  SuccSetupRL_ID9"
    10: 3568 "  SuccSetupRL_ID10"
    11: 3572 "  SuccSetupRL_ID11"
    12: 3576 "  SuccSetupRL_ID12"
    13: 3580 "  SuccSetupRL_ID13"
    14: 3584 "  SuccSetupRL_ID14"
    15: 3588 "  SuccSetupRL_ID15"
    16: 3592 "  SuccSetupRL_ID16"
    else: 3594 "  SuccSetupRL_ID"
  } {
    field id 5 label key
  }
  set $RlIdPosition = $RlIdPosition - 1
}

rule rLCount_SuccSetupRL_Set_ID "rLCount" {
  select $RlSetIdPosition (id label) {
    1: 3664 "  SuccSetupRL_Set_ID1"
    2: 3668 "  SuccSetupRL_Set_ID2"
    3: 3672 "  SuccSetupRL_Set_ID3"
    4: 3676 "  SuccSetupRL_Set_ID4"
    5: 3680 "  SuccSetupRL_Set_ID5"
    6: 3684 "  SuccSetupRL_Set_ID6"
    7: 3688 "  SuccSetupRL_Set_ID7"
    8: 3692 "  SuccSetupRL_Set_ID8"
    9: 3696 "  SuccSetupRL_Set_ID9"
    10: 3700 "  SuccSetupRL_Set_ID10"
    11: 3704 "  SuccSetupRL_Set_ID11"
    12: 3708 "  SuccSetupRL_Set_ID12"
    13: 3712 "  SuccSetupRL_Set_ID13"
    14: 3716 "  SuccSetupRL_Set_ID14"
    15: 3720 "  SuccSetupRL_Set_ID15"
    16: 3724 "  SuccSetupRL_Set_ID16"
    else: 3726 "  SuccSetupRL_Set_ID"
  } {
    field id 5 label key
  }
  set $RlSetIdPosition = $RlSetIdPosition - 1
}

rule rLCount_UnSuccSetupRL_ID "rLCount" {
  select $RlIdPosition (id label) {
    1: 3598 "  UnSuccSetupRL_ID1"
    2: 3602 "  UnSuccSetupRL_ID2"
    3: 3606 "  UnSuccSetupRL_ID3"
    4: 3610 "  UnSuccSetupRL_ID4"
    5: 3614 "  UnSuccSetupRL_ID5"
    6: 3618 "  UnSuccSetupRL_ID6"
    7: 3622 "  UnSuccSetupRL_ID7"
    8: 3626 "  UnSuccSetupRL_ID8"
    9: 3630 "  UnSuccSetupRL_ID9"
    10: 3634 "  UnSuccSetupRL_ID10"
    11: 3638 "  UnSuccSetupRL_ID11"
    12: 3642 "  UnSuccSetupRL_ID12"
    13: 3646 "  UnSuccSetupRL_ID13"
    14: 3650 "  UnSuccSetupRL_ID14"
    15: 3654 "  UnSuccSetupRL_ID15"
    16: 3658 "  UnSuccSetupRL_ID16"
    else: 3660 "  UnSuccSetupRL_ID"
  } {
    field id 5 label key
  }
  set $RlIdPosition = $RlIdPosition - 1
}
