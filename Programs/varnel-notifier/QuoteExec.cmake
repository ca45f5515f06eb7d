# quoteExec(PATH): how files that start a program name the one with this path, in the caller's scope:
#   VARNEL_EXEC          in a service file of the session bus
#   VARNEL_DESKTOP_EXEC  in a desktop entry, where a per cent sign stands for something else
#   VARNEL_TRY_EXEC      in a desktop entry, where the path stands alone
# A word between double quotes has backslashes before some characters; the text of any key has two for
# one.
function(quoteExec path)
  string(REPLACE [[\]] [[\\]] text "${path}")
  set(VARNEL_TRY_EXEC "${text}" PARENT_SCOPE)
  string(REGEX REPLACE [[([\"$`])]] [[\\\1]] word "${path}")
  string(REPLACE [[\]] [[\\]] word "\"${word}\"")
  set(VARNEL_EXEC "${word}" PARENT_SCOPE)
  string(REPLACE % %% word "${word}")
  set(VARNEL_DESKTOP_EXEC "${word}" PARENT_SCOPE)
endfunction()
