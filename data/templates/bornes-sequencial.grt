;; Terminal list with every strip numbered from 1 and blank rows filled to the end of the
;; column; strips follow each other on a page, two blank rows apart. One column.
(load (strcat *DIR_ZVCFG_TEMPL* "bornes.grt"))
(setq *COLUNA_SN* nil)
(setq *QUEBRA_PAGINA* T)
(setq *LINHAS_ESPACO* 2)
(setq *PREENCHE_ATE_FINAL* T)
(setq *INIC_SEQUENCIAL* T)
(setq *ZV_CHAVE_QUEBRA_PAGINA* nil)
(setq *VISUALIZAR_JUMPER_CFG* "0")
(setq *FILTRO_TEMPLATE* "")
