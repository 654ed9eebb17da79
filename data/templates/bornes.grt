;; Terminal list, A3 landscape: two columns of 48 rows, a new page for each strip, jumper
;; marks in three columns at the left of each row. Loaded by ZVCarregaTemplate; may be loaded
;; more than once.
(setq FUNCAO_LSTGRT "LISTAS")
(setq LISTA_CABEC "DADOS\\1\\BLOCOS\\LST_BORNE_CAB")
(setq LISTA_DETALHE "DADOS\\1\\BLOCOS\\LST_BORNE_DET")
(setq LISTA_RODAPE "DADOS\\1\\BLOCOS\\LST_BORNE_ROD")
(setq LISTA_TOTAL "DADOS\\1\\BLOCOS\\LST_BORNE_TOT")
(setq TAM_DETALHE "5")

;; Page grid: rows per column, columns, first row and the step between columns.
(setq *LINHAS_POR_PAGINA* 48)
(setq *COLUNA_SN* T)
(setq *NUMERO_COLUNA* 2)
(setq *X_INIC_LISTA* 15.0)
(setq *Y_INIC_LISTA* 262.0)
(setq *ESPACO_HORIZONTAL* 180.0)

;; Breaks: a new page at a change of strip. No break key: a page group as key would break the
;; page at every blank row of a gap, which has no group.
(setq *QUEBRA_PAGINA* nil)
(setq *LINHAS_ESPACO* 2)
(setq *PREENCHE_ATE_FINAL* nil)
(setq *ZV_CHAVE_QUEBRA_PAGINA* nil)

;; Reading: sort by strip and number in the three tag languages, rising, gaps left as they are.
(setq *LISTA_DE_SORT* '("REGUA" "STRIP" "REGLETA" "NUMERO" "NUMBER"))
(setq *ORDEM_CRESCENTE* "C")
(setq *INIC_SEQUENCIAL* nil)
(setq *PREENCHE_FALTANTES* T)
(setq *SEL_REGUA_BORNE_CFG* nil)
(setq PBLCTOBORNE T)
(setq *CHAR_SEP_STD_CFG* ":")
(setq *ORDEM_CONCAT_STD* "1")

;; Jumper bars: three mark columns 3 mm apart.
(setq *VISUALIZAR_JUMPER_CFG* "1")
(setq *NUM_COLUNAS_CFG* 3)
(setq *DIST_COLUNAS_CFG* 3.0)
(setq *LISTA_JUMPER_INI* "DADOS\\1\\BLOCOS\\JMP_INI")
(setq *LISTA_JUMPER_MEIO* "DADOS\\1\\BLOCOS\\JMP_MEIO")
(setq *LISTA_JUMPER_CONT* "DADOS\\1\\BLOCOS\\JMP_CONT")
(setq *LISTA_JUMPER_FIM* "DADOS\\1\\BLOCOS\\JMP_FIM")

;; Leave out the terminals that no page draws (strip XV of the virtual objects).
(setq *FILTRO_TEMPLATE* "(/= (cdr (assoc \"REGUA\" reg)) \"XV\")")
