PRAGMA ignore_check_constraints=1; UPDATE volume SET directory_name=CAST(x'00ff1b' AS TEXT), profile=CAST(x'1b5d' AS TEXT);
