#!/bin/sh
grep -h -e m_Layer -e m_Name "$1" "$2" "$3" >"$4"
