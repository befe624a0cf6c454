#!/bin/sh
cp "$1" "$2"
