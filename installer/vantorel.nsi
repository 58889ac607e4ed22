; VTSetup.exe: installs Vantorel into "C:\Program Files\Vantorel" for every user of the machine.
;
; makensis -DEXE=vantorel.exe -DDEFINITIONS=sw2.def -DDEFVER=defver -DICON=padlock.ico -DOUTFILE=VTSetup.exe
;          -DVERSION_MAJOR=1 -DVERSION_MINOR=0    (the project version that also makes the program's version resource)
;
; Installing over an installed copy (the update path) first asks a running Vantorel to close and waits
; for it, keeps the settings, and keeps installed definitions that are newer than this setup's own.
; /S installs (and uninstall.exe /S uninstalls) without a window.
Unicode true
Target amd64-unicode
!include LogicLib.nsh
!include FileFunc.nsh
!include WinMessages.nsh

!define VERSION "${VERSION_MAJOR}.${VERSION_MINOR}"
!define UNINSTALL_KEY "Software\Microsoft\Windows\CurrentVersion\Uninstall\Vantorel"
!define RUN_KEY "Software\Microsoft\Windows\CurrentVersion\Run"

Name "Vantorel"
OutFile "${OUTFILE}"
InstallDir "$PROGRAMFILES64\Vantorel"
RequestExecutionLevel admin
ManifestDPIAware true
SetCompressor /SOLID lzma
Icon "${ICON}"
UninstallIcon "${ICON}"
BrandingText "Vantorel ${VERSION}"
ShowInstDetails show
ShowUninstDetails show

VIProductVersion "${VERSION_MAJOR}.${VERSION_MINOR}.0.0"
VIFileVersion "${VERSION_MAJOR}.${VERSION_MINOR}.0.0"
VIAddVersionKey /LANG=1033 "ProductName" "Vantorel"
VIAddVersionKey /LANG=1033 "CompanyName" "Vantorel"
VIAddVersionKey /LANG=1033 "FileDescription" "Vantorel setup"
VIAddVersionKey /LANG=1033 "FileVersion" "${VERSION}"
VIAddVersionKey /LANG=1033 "ProductVersion" "${VERSION}"
VIAddVersionKey /LANG=1033 "LegalCopyright" "Copyright (C) Vantorel"
VIAddVersionKey /LANG=1033 "OriginalFilename" "VTSetup.exe"

Page instfiles
UninstPage uninstConfirm
UninstPage instfiles

Var WasRunning

; Asks a running Vantorel to close (WM_CLOSE to its main window: it removes its tray icon, stops its
; timers and ends as when the user closes it) and waits until the process has gone, which the named
; mutex it holds for its whole life tells. Never kills it; after 30 s the user may retry or cancel.
; $WasRunning: a window of the program was asked to close.
!macro CLOSE_PROGRAM un
Function ${un}CloseProgram
    Push $0
    Push $1
    Push $2
    StrCpy $WasRunning 0
    StrCpy $1 0    ; rounds of 250 ms
    StrCpy $2 0    ; the window last asked to close
    ${Do}
        FindWindow $0 "VantorelFrmMain"
        ${If} $0 P<> 0
        ${AndIf} $0 P<> $2
            DetailPrint "Asking the running Vantorel to close"
            System::Call "user32::PostMessage(p r0, i ${WM_CLOSE}, p 0, p 0)"
            StrCpy $2 $0
            StrCpy $WasRunning 1
        ${EndIf}
        ${If} $0 P= 0
            System::Call "kernel32::OpenMutex(i 0x00100000, i 0, t 'Vantorel') p .r0"
            ${If} $0 P= 0
                ${Break}
            ${EndIf}
            System::Call "kernel32::CloseHandle(p r0)"
        ${EndIf}
        IntOp $1 $1 + 1
        ${If} $1 >= 120
            MessageBox MB_RETRYCANCEL|MB_ICONEXCLAMATION "Vantorel is still running. Close it, then click Retry." \
                /SD IDCANCEL IDRETRY +2
            Abort "Vantorel is still running."
            StrCpy $1 1
            StrCpy $2 0
        ${EndIf}
        Sleep 250
    ${Loop}
    ${If} $1 > 0
        Sleep 500    ; the ended process's files are released
    ${EndIf}
    Pop $2
    Pop $1
    Pop $0
FunctionEnd
!macroend
!insertmacro CLOSE_PROGRAM ""
!insertmacro CLOSE_PROGRAM "un."

; The version in a "defver" file as a 21-digit text that compares as the number: the leading decimal
; number of its first line (blanks before it skipped; none, or a negative one, counts as 0), the
; whole part in 12 digits and the fraction in 9. In: the file's path on the stack; out: the text.
Function DefverKey
    Exch $0
    Push $1
    Push $2
    Push $3
    Push $4
    Push $5
    ClearErrors
    FileOpen $1 $0 r
    StrCpy $0 ""
    ${IfNot} ${Errors}
        FileRead $1 $0
        FileClose $1
    ${EndIf}
    StrCpy $1 0    ; position
    StrCpy $3 ""   ; whole part
    StrCpy $4 ""   ; fraction
    ${Do}
        StrCpy $2 $0 1 $1
        ${If} $2 != " "
        ${AndIf} $2 != "$\t"
            ${ExitDo}
        ${EndIf}
        IntOp $1 $1 + 1
    ${Loop}
    ${If} $2 == "+"
        IntOp $1 $1 + 1
    ${EndIf}
    ${If} $2 != "-"
        ${Do}
            StrCpy $2 $0 1 $1
            ${IfThen} $2 == "" ${|} ${ExitDo} ${|}
            IntOp $5 $2 + 0    ; 1 to 9 for a digit other than 0
            ${If} $2 != "0"
            ${AndIf} $5 = 0
                ${ExitDo}
            ${EndIf}
            ${If} $3 != "0"
                StrCpy $3 "$3$2"
            ${Else}
                StrCpy $3 $2
            ${EndIf}
            IntOp $1 $1 + 1
        ${Loop}
        ${If} $2 == "."
            ${Do}
                IntOp $1 $1 + 1
                StrCpy $2 $0 1 $1
                ${IfThen} $2 == "" ${|} ${ExitDo} ${|}
                IntOp $5 $2 + 0
                ${If} $2 != "0"
                ${AndIf} $5 = 0
                    ${ExitDo}
                ${EndIf}
                StrLen $2 $4
                ${If} $2 < 9
                    StrCpy $2 $0 1 $1
                    StrCpy $4 "$4$2"
                ${EndIf}
            ${Loop}
        ${EndIf}
    ${EndIf}
    StrLen $2 $3
    ${If} $2 > 12
        StrCpy $3 "999999999999"
    ${EndIf}
    ${Do}
        StrLen $2 $3
        ${IfThen} $2 >= 12 ${|} ${ExitDo} ${|}
        StrCpy $3 "0$3"
    ${Loop}
    ${Do}
        StrLen $2 $4
        ${IfThen} $2 >= 9 ${|} ${ExitDo} ${|}
        StrCpy $4 "$40"
    ${Loop}
    StrCpy $0 "$3$4"
    Pop $5
    Pop $4
    Pop $3
    Pop $2
    Pop $1
    Exch $0
FunctionEnd

Function .onInit
    SetRegView 64
    SetShellVarContext all
FunctionEnd

Function un.onInit
    SetRegView 64
    SetShellVarContext all
FunctionEnd

Section "Vantorel"
    SetOutPath "$INSTDIR"
    Call CloseProgram

    ; Definitions: this setup's own unless the installed ones are newer (never a downgrade).
    InitPluginsDir
    File "/oname=$PLUGINSDIR\defver" "${DEFVER}"
    Push "$PLUGINSDIR\defver"
    Call DefverKey
    Pop $0
    Push "$INSTDIR\defver"
    Call DefverKey
    Pop $1
    ${If} $1 S> $0
    ${AndIf} ${FileExists} "$INSTDIR\sw2.def"
        DetailPrint "Keeping the installed definitions: they are newer than this setup's."
    ${Else}
        ClearErrors
        File "/oname=sw2.def" "${DEFINITIONS}"
        File "/oname=defver" "${DEFVER}"
        ${If} ${Errors}
            Abort "The definitions could not be written to $INSTDIR."
        ${EndIf}
    ${EndIf}

    ClearErrors
    File "/oname=vantorel.exe" "${EXE}"
    ${If} ${Errors}
        Abort "vantorel.exe could not be written to $INSTDIR."
    ${EndIf}
    WriteUninstaller "$INSTDIR\uninstall.exe"
    CreateShortcut "$SMPROGRAMS\Vantorel.lnk" "$INSTDIR\vantorel.exe" "" "$INSTDIR\vantorel.exe" 0 \
        SW_SHOWNORMAL "" "Vantorel connection guard"

    ; Apps & features.
    WriteRegStr HKLM "${UNINSTALL_KEY}" "DisplayName" "Vantorel"
    WriteRegStr HKLM "${UNINSTALL_KEY}" "DisplayVersion" "${VERSION}"
    WriteRegDWORD HKLM "${UNINSTALL_KEY}" "VersionMajor" ${VERSION_MAJOR}
    WriteRegDWORD HKLM "${UNINSTALL_KEY}" "VersionMinor" ${VERSION_MINOR}
    WriteRegStr HKLM "${UNINSTALL_KEY}" "Publisher" "Vantorel"
    WriteRegStr HKLM "${UNINSTALL_KEY}" "DisplayIcon" "$INSTDIR\vantorel.exe,0"
    WriteRegStr HKLM "${UNINSTALL_KEY}" "InstallLocation" "$INSTDIR"
    WriteRegStr HKLM "${UNINSTALL_KEY}" "UninstallString" '"$INSTDIR\uninstall.exe"'
    WriteRegStr HKLM "${UNINSTALL_KEY}" "QuietUninstallString" '"$INSTDIR\uninstall.exe" /S'
    WriteRegDWORD HKLM "${UNINSTALL_KEY}" "NoModify" 1
    WriteRegDWORD HKLM "${UNINSTALL_KEY}" "NoRepair" 1
    ${GetSize} "$INSTDIR" "/S=0K" $0 $1 $2
    WriteRegDWORD HKLM "${UNINSTALL_KEY}" "EstimatedSize" $0

    ; The guard was on duty before the update: it goes back on duty.
    ${If} $WasRunning = 1
        Exec '"$INSTDIR\vantorel.exe"'
    ${EndIf}
SectionEnd

Section "Uninstall"
    Call un.CloseProgram
    ; Start with Windows: the logon task and the Run values the options window writes.
    nsExec::Exec '"$SYSDIR\schtasks.exe" /delete /tn Vantorel /f'
    Pop $0
    DeleteRegValue HKLM "${RUN_KEY}" "Vantorel"
    DeleteRegValue HKCU "${RUN_KEY}" "Vantorel"

    Delete "$SMPROGRAMS\Vantorel.lnk"
    ; The files this setup installed and those the program's update check writes beside them.
    Delete "$INSTDIR\vantorel.exe"
    Delete "$INSTDIR\sw2.def"
    Delete "$INSTDIR\defver"
    Delete "$INSTDIR\VTSetup.exe"
    Delete "$INSTDIR\sw2.def.part"
    Delete "$INSTDIR\defver.part"
    Delete "$INSTDIR\VTSetup.exe.part"
    Delete "$INSTDIR\uninstall.exe"
    RMDir "$INSTDIR"    ; only when empty: files of others stay

    DeleteRegKey HKLM "${UNINSTALL_KEY}"
    ; The settings: the machine's and those of the user who uninstalls.
    DeleteRegKey HKLM "Software\Vantorel"
    DeleteRegKey HKCU "Software\Vantorel"
SectionEnd
